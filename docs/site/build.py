"""Makes the site in build/docs: the pages of docs/ and the README as HTML, beside the reference that Doxygen has
made there, with a search over both. Then looks at it: every link leads somewhere, and a browser without a window
finds no page wider than a telephone, and what it searches for.

Called by scripts/docs, in the root of the sources.
"""

import html
import html.parser
import json
import pathlib
import re
import subprocess
import sys
import urllib.parse
import xml.etree.ElementTree as tree

SITE = pathlib.Path("build/docs")
# The order of the pages in the margin; those that are not named come last.
GROUPS = [
    ("Start", ["README", "tutorial", "cookbook"]),
    ("Guides", ["mapping-format", "host-classes", "records", "saving", "formats", "round-trip",
                "repositories", "large-documents", "performance", "qxxml"]),
    ("Coming from", ["from-generated-binders", "from-annotations", "from-dom-code"]),
    ("Inside", ["architecture"]),
]


def slug(heading):
    """The anchor that a heading has in Markdown."""
    return re.sub(r"[^\w\- ]", "", heading.lower()).replace(" ", "-")


def text_of(markup):
    return html.unescape(re.sub(r"<[^>]*>", "", markup))


def address_of(target, is_readme):
    """Where a link of a page leads in the site; None for what is not in it."""
    if re.match(r"[a-z]+:", target):
        return target
    path, _, anchor = target.partition("#")
    anchor = "#" + anchor if anchor else ""
    if not path:
        return anchor
    path = path.removeprefix("docs/") if is_readme else path
    if path == "../README.md":
        return "index.html" + anchor
    if path.endswith(".md") and (pathlib.Path("docs") / path).exists():
        return path[:-3] + ".html" + anchor
    return path if path.endswith(".svg") else None


class Page:
    def __init__(self, source):
        self.name = source.stem
        self.file = "index.html" if self.name == "README" else self.name + ".html"
        body = subprocess.run(["cmark-gfm", "--extension", "table", "--github-pre-lang", str(source)],
                              check=True, capture_output=True, text=True).stdout
        body = re.sub(r"<h([1-6])>(.*?)</h\1>", self._heading, body)
        body = re.sub(r'<a href="([^"]*)">(.*?)</a>', self._link, body, flags=re.S)
        body = re.sub(r'(<img src=")docs/', r"\1", body)
        body = body.replace("<table>", '<div class="wide"><table>').replace("</table>", "</table></div>")
        self.body = body
        self.title = text_of(re.search(r"<h1[^>]*>(.*?)</h1>", body).group(1))

    @staticmethod
    def _heading(match):
        level, inside = match.groups()
        return f'<h{level} id="{slug(text_of(inside))}">{inside}</h{level}>'

    def _link(self, match):
        target = address_of(html.unescape(match.group(1)), self.name == "README")
        return match.group(2) if target is None else f'<a href="{html.escape(target)}">{match.group(2)}</a>'

    def entries(self):
        """What the search finds: each section with its text."""
        parts = re.split(r'<h[1-6] id="([^"]*)">(.*?)</h[1-6]>', self.body)
        for anchor, heading, content in zip(parts[1::3], parts[2::3], parts[3::3]):
            where = self.title if text_of(heading) == self.title else f"{self.title}: {text_of(heading)}"
            yield {"title": where, "address": f"{self.file}#{anchor}", "weight": 10,
                   "text": re.sub(r"\s+", " ", text_of(content))}


def reference_entries():
    """The classes and functions that Doxygen has listed."""
    for compound in tree.parse(SITE / "reference.tag").getroot().findall("compound"):
        if compound.get("kind") not in ("class", "struct", "namespace"):
            continue
        name, file = compound.findtext("name"), compound.findtext("filename")
        yield {"title": name, "address": "reference/" + file, "text": "", "weight": 10}
        seen = set()
        for member in compound.findall("member"):
            if member.get("kind") == "function" and member.findtext("name") not in seen:
                seen.add(member.findtext("name"))
                yield {"title": name + "::" + member.findtext("name"), "text": "", "weight": 4,
                       "address": "reference/" + member.findtext("anchorfile") + "#" + member.findtext("anchor")}


def margin(pages, current):
    known = {page.name: page for page in pages}
    named = [name for _, names in GROUPS for name in names]
    groups = GROUPS[:-1] + [("Inside", GROUPS[-1][1] + [n for n in known if n not in named])]
    lines = []
    for heading, names in groups:
        items = [known[name] for name in names if name in known]
        if items:
            lines.append(f"<h2>{heading}</h2><ul>")
            for page in items:
                mark = ' class="here"' if page is current else ""
                lines.append(f'<li{mark}><a href="{page.file}">{html.escape(page.title)}</a></li>')
            lines.append("</ul>")
    return "\n".join(lines) + '\n<h2>Reference</h2><ul><li><a href="reference/annotated.html">Classes</a></li></ul>'


def build():
    sources = [pathlib.Path("README.md"), *sorted(pathlib.Path("docs").glob("*.md"))]
    pages = [Page(source) for source in sources]
    template = pathlib.Path("docs/site/page.html").read_text()
    for page in pages:
        filled = template
        for key, value in (("TITLE", html.escape(page.title)), ("MARGIN", margin(pages, page)), ("BODY", page.body)):
            filled = filled.replace("{{" + key + "}}", value)
        (SITE / page.file).write_text(filled)
    for file in [*pathlib.Path("docs").glob("*.svg"), *pathlib.Path("docs/site").glob("site.*")]:
        (SITE / file.name).write_bytes(file.read_bytes())
    entries = [entry for page in pages for entry in page.entries()] + list(reference_entries())
    (SITE / "search-index.js").write_text("const searchIndex = " + json.dumps(entries) + ";\n")
    return pages


class Links(html.parser.HTMLParser):
    def __init__(self, file):
        super().__init__()
        self.targets, self.anchors = [], set()
        self.feed(file.read_text(errors="replace"))

    def handle_starttag(self, tag, attributes):
        for name, value in attributes:
            if name in ("id", "name") and value:
                self.anchors.add(value)
            if name in ("href", "src") and value:
                self.targets.append(value)


def broken_links():
    files = {file.resolve(): Links(file) for file in SITE.rglob("*.html")}
    for file, links in files.items():
        for target in links.targets:
            # Of private classes Doxygen has the heading's link, and leaves out the heading.
            if re.match(r"[a-z]+:", target) or target == "#nested-classes":
                continue
            path, _, anchor = urllib.parse.unquote(target).partition("#")
            there = (file.parent / path).resolve() if path else file
            if not there.exists():
                yield f"{file.name}: {target}: no such file"
            elif anchor and there in files and anchor not in files[there].anchors:
                yield f"{file.name}: {target}: no such place"


def seen_in_a_browser(pages):
    """What is wrong with the pages on a screen 360 points wide, and with the search."""
    probe = SITE / "probe.html"
    frames = "".join(f'<iframe src="{page.file}" style="width:360px;height:640px;border:0"></iframe>' for page in pages)
    probe.write_text("<!doctype html><title>probe</title>" + frames +
                     '<iframe src="index.html?q=undo+manager" style="width:360px;height:640px;border:0"></iframe><pre></pre>'
                     "<script>addEventListener('load', () => setTimeout(() => {"
                     "const lines = [];"
                     "const frames = [...document.querySelectorAll('iframe')];"
                     "for (const frame of frames) {"
                     "  const page = frame.contentDocument.documentElement;"
                     "  if (page.scrollWidth > 360) lines.push(frame.src + ' is ' + page.scrollWidth + ' wide');"
                     "}"
                     "const found = frames.at(-1).contentDocument.querySelectorAll('#results a');"
                     "if (![...found].some(a => a.textContent.includes('UndoManager')))"
                     "  lines.push('the search finds no undo manager among ' + found.length);"
                     "document.querySelector('pre').textContent = 'looked\\n' + lines.join('\\n') + '\\nend';"
                     "}, 500));</script>")
    dom = subprocess.run(
        ["chromium", "--headless", "--no-sandbox", "--disable-gpu", "--allow-file-access-from-files",
         "--virtual-time-budget=20000", "--dump-dom", probe.resolve().as_uri()],
        capture_output=True, text=True, timeout=240).stdout
    probe.unlink()
    report = re.search(r"<pre>looked\n(.*)end</pre>", dom, re.S)
    if not report:
        return ["the browser did not look at the pages"]
    return report.group(1).split("\n")[:-1] if report.group(1).strip() else []


def main():
    pages = build()
    problems = [*broken_links(), *seen_in_a_browser(pages)]
    for problem in problems:
        print("docs:", problem, file=sys.stderr)
    if not problems:
        print(f"docs: {len(pages)} pages and the reference: {SITE}/index.html")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
