#include "xml/DocumentPlaces.h"

#include "base/WhiteSpace.h"
#include "xml/XMLPlace.h"

#include <unordered_map>
#include <utility>

namespace qx {

DocumentPlaces::DocumentPlaces(std::shared_ptr<const ParsedDocument> parsed, String documentName)
    : _parsed(std::move(parsed)), _documentName(std::move(documentName)) {}

DocumentPlaces::DocumentPlaces(std::shared_ptr<const XMLTreeIndexer> tree, String documentName)
    : _tree(std::move(tree)), _documentName(std::move(documentName)) {}

const XMLIndex* DocumentPlaces::index() const noexcept {
    return _parsed ? &_parsed->index() : _tree ? &_tree->index() : nullptr;
}

// A tree that is read as needed may have grown since.
void DocumentPlaces::findSteps() const {
    const auto entries = index()->entries();
    if (_steps.size() == entries.size())
        return;
    _steps.assign(entries.size(), {none, 0, 0});
    std::vector<Number> open;
    const auto count = static_cast<Number>(entries.size());
    for (Number at = 0; at < count && open.empty(); at = index()->siblingOf(at))
        if (entries[at].nodeKind() == XMLNodeKind::element)
            open.push_back(at);
    for (Number order = 1; !open.empty(); ++order) {
        const Number element = open.back();
        open.pop_back();
        _steps[element].order = order;
        addStepsIn(element, open);
    }
    numberItems();
}

// The items of a piece follow those of the pieces before it. The elements of the tags that are
// repeated stand one in the other, before everything else.
void DocumentPlaces::numberItems() const {
    const TextOrigin& origin = index()->origin();
    const auto entries = index()->entries();
    std::vector<Number> around;
    for (Number at = 0; at < entries.size() && around.size() < origin.tagItems.size(); ++at)
        if (entries[at].nodeKind() == XMLNodeKind::element)
            around.push_back(at);
    for (std::size_t i = 0; i < around.size() && !origin.itemName.empty(); ++i) {
        if (origin.tagItems[i] == 0)
            continue;
        const Number end = index()->contentEnd(around[i]);
        for (Number at = index()->firstChild(around[i]); at < end; at = index()->siblingOf(at)) {
            if (nameOf(at).view() != origin.itemName)
                continue;
            std::uint32_t& position = _steps[at].position;
            position = std::max(position, 1U) + static_cast<std::uint32_t>(origin.tagItems[i]);
        }
    }
}

// The children are left in `open`, the first one on top.
void DocumentPlaces::addStepsIn(Number element, std::vector<Number>& open) const {
    struct Seen {
        Number first;
        std::uint32_t count;
    };
    std::unordered_map<std::uint32_t, Seen> seen;
    const XMLIndex& all = *index();
    const Number end = all.contentEnd(element);
    Number at = all.content(element);
    for (const Number first = all.firstChild(element); at < first; ++at)
        _steps[at] = {element, 0, _steps[element].order};
    const std::size_t opened = open.size();
    for (; at < end; at = all.siblingOf(at)) {
        _steps[at] = {element, 0, _steps[element].order};
        if (all[at].nodeKind() != XMLNodeKind::element)
            continue;
        open.push_back(at);
        Seen& alike = seen.try_emplace(all[at].name(), Seen{at, 0}).first->second;
        if (++alike.count == 1)
            continue;
        _steps[alike.first].position = 1;
        _steps[at].position = alike.count;
    }
    std::reverse(open.begin() + static_cast<std::ptrdiff_t>(opened), open.end());
}

std::string DocumentPlaces::stepTo(Number number) const {
    const XMLIndexEntry& entry = (*index())[number];
    const Step& step = _steps[number];
    if (_tree && step.parent == none)
        return qx::pathOf(_tree->element(number));
    const std::string name = nameOf(number).str();
    switch (entry.nodeKind()) {
    case XMLNodeKind::element:
        return "/" + name + (step.position != 0 ? "[" + std::to_string(step.position) + "]" : "");
    case XMLNodeKind::attribute:
        return "/@" + name;
    case XMLNodeKind::processingInstruction:
        return "/?" + name;
    case XMLNodeKind::text:
        return "/text()";
    default:
        return {};
    }
}

String DocumentPlaces::pathOf(Number number) const {
    // As many levels as those of a tree are named, see XMLPlace.cpp.
    constexpr std::size_t namedLevels = 32;
    std::string path;
    std::size_t named = 0;
    for (; number != none && named < namedLevels; number = _steps[number].parent, ++named)
        path.insert(0, stepTo(number));
    return number != none ? "..." + path : path;
}

std::size_t DocumentPlaces::beginOf(Number number) const {
    const XMLIndexEntry& entry = (*index())[number];
    const bool isText = entry.nodeKind() == XMLNodeKind::text;
    if (isText && !entry.has(XMLIndexEntry::isAside))
        return std::min(index()->text().find_first_not_of(whiteSpace, entry.begin),
                        index()->text().size());
    if (entry.nodeKind() == XMLNodeKind::element)
        return entry.begin;
    if (entry.nodeKind() != XMLNodeKind::attribute || entry.has(XMLIndexEntry::isAside))
        return beginOf(_steps[number].parent);
    // Behind the name of an attribute come blanks, the equals sign, more blanks and the quote.
    const std::string_view text = index()->text();
    std::size_t at = entry.begin - 1;
    while (at > 0 && (isWhite(text[at - 1]) || text[at - 1] == '='))
        --at;
    while (at > 0 && !isWhite(text[at - 1]))
        --at;
    return at;
}

void DocumentPlaces::setPosition(detail::SourcePlace& source, Number number) const {
    if (_tree) {
        while ((*index())[number].nodeKind() != XMLNodeKind::element)
            number = _steps[number].parent;
        source.place.line = _tree->element(number).line();
        source.place.column = _tree->element(number).column();
        return;
    }
    const TextOrigin& origin = index()->origin();
    const std::size_t begin = beginOf(number);
    if (begin < origin.added) // in a tag that is repeated before a piece
        return;
    if (!_position)
        _position.emplace(index()->text(), origin);
    _position->moveTo(begin);
    source.place.line = _position->line();
    source.place.column = _position->column();
    detail::setExcerpt(source, index()->text(), begin, origin.added);
}

detail::SourcePlace DocumentPlaces::placeOf(Number number) const {
    detail::SourcePlace source;
    source.place.documentName = _documentName;
    if (index() == nullptr || number >= index()->entries().size())
        return source;
    const std::lock_guard lock(_mutex);
    findSteps();
    setPosition(source, number);
    source.path = pathOf(number);
    return source;
}

DocumentPlaces::Number DocumentPlaces::orderOf(Number number) const {
    if (!_tree || number >= index()->entries().size())
        return number;
    const std::lock_guard lock(_mutex);
    findSteps();
    return _steps[number].order;
}

String DocumentPlaces::nameOf(Number number) const {
    if (index() == nullptr || number >= index()->entries().size())
        return nullptr;
    const XMLIndexEntry& entry = (*index())[number];
    const bool hasName =
        entry.nodeKind() != XMLNodeKind::text && entry.nodeKind() != XMLNodeKind::comment;
    return hasName ? index()->name(entry) : String();
}

String DocumentPlaces::textOf(Number number) const {
    if (index() == nullptr || number >= index()->entries().size())
        return nullptr;
    if ((*index())[number].nodeKind() == XMLNodeKind::element) {
        const Number first = index()->firstChild(number);
        if (first == index()->contentEnd(number))
            return "";
        number = first;
    }
    std::string room;
    return String(index()->value((*index())[number], room));
}

std::vector<String> DocumentPlaces::attributesOf(Number element) const {
    std::vector<String> names;
    if (nameOf(element).isNull())
        return names;
    const Number end = index()->firstChild(element);
    for (Number at = index()->content(element); at < end; ++at)
        if ((*index())[at].nodeKind() == XMLNodeKind::attribute)
            names.push_back(nameOf(at));
    return names;
}

std::vector<String> DocumentPlaces::childrenOf(Number element) const {
    // Suggestions need no more.
    constexpr std::size_t most = 1'000;
    std::vector<String> names;
    if (nameOf(element).isNull())
        return names;
    const Number end = index()->contentEnd(element);
    Number at = index()->firstChild(element);
    for (; at < end && names.size() < most; at = index()->siblingOf(at))
        if ((*index())[at].nodeKind() == XMLNodeKind::element)
            names.push_back(nameOf(at));
    return names;
}

} // namespace qx
