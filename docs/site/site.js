// The search: every word must be found, in the title or in the text; titles count for more,
// those of pages and classes for most.
"use strict";
const field = document.getElementById("search");
const results = document.getElementById("results");

function score(entry, words) {
    const title = entry.title.toLowerCase();
    const text = entry.text.toLowerCase();
    let sum = 0;
    for (const word of words) {
        const found = (title.includes(word) ? entry.weight : 0) + (text.includes(word) ? 1 : 0);
        if (found === 0)
            return 0;
        sum += found;
    }
    return sum - title.length / 1000;
}

function excerpt(entry, word) {
    const at = Math.max(0, entry.text.toLowerCase().indexOf(word) - 60);
    return (at > 0 ? "…" : "") + entry.text.slice(at, at + 160);
}

function search() {
    const words = field.value.toLowerCase().split(/\s+/).filter(word => word);
    const found = words.length === 0 ? [] : searchIndex
        .map(entry => ({ entry, rank: score(entry, words) }))
        .filter(hit => hit.rank > 0)
        .sort((a, b) => b.rank - a.rank)
        .slice(0, 30);
    results.replaceChildren(...found.map(({ entry }) => {
        const line = document.createElement("p");
        const link = document.createElement("a");
        link.href = entry.address;
        link.textContent = entry.title;
        const more = document.createElement("small");
        more.textContent = excerpt(entry, words[0]);
        line.append(link, more);
        return line;
    }));
    if (words.length > 0 && found.length === 0)
        results.textContent = "Nothing found.";
    results.hidden = words.length === 0;
}

field.addEventListener("input", search);
field.value = new URLSearchParams(location.search).get("q") ?? "";
search();
