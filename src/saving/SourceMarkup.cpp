#include "saving/SourceMarkup.h"

#include "xml/XMLCharacters.h"

#include <algorithm>
#include <array>
#include <span>
#include <unordered_map>

namespace qx::detail {

namespace {

constexpr std::string_view blanks = " \t\r\n";
constexpr std::size_t npos = std::string_view::npos;
constexpr auto endsName = [] {
    std::array<bool, 256> ends{};
    for (const char c : std::string_view(" \t\r\n=/>?"))
        ends[static_cast<unsigned char>(c)] = true;
    return ends;
}();

std::size_t behind(std::string_view text, std::string_view part, std::size_t from) {
    const std::size_t at = text.find(part, from);
    return at != npos ? at + part.size() : text.size();
}

// A DOCTYPE's end: its declarations may hold brackets in quotes and in comments.
std::size_t behindDoctype(std::string_view text, std::size_t at) {
    bool isInside = false;
    while (at < text.size()) {
        const char c = text[at];
        if (text.substr(at).starts_with("<!--"))
            at = behind(text, "-->", at + 4);
        else if (text.substr(at).starts_with("<?"))
            at = behind(text, "?>", at + 2);
        else if (c == '"' || c == '\'')
            at = behind(text, text.substr(at, 1), at + 1);
        else if (c == '>' && !isInside)
            return at + 1;
        else {
            isInside = c == '[' || (isInside && c != ']');
            ++at;
        }
    }
    return at;
}

SourceMarkup::Number rootOf(const XMLIndex& index) {
    SourceMarkup::Number at = 0;
    while (at < index.entries().size() && index[at].nodeKind() != XMLNodeKind::element)
        at = index.siblingOf(at);
    return at;
}

} // namespace

SourceMarkup::SourceMarkup(const XMLIndex& index) : _index(index) {
    const std::size_t size = index.entries().size();
    const Number root = rootOf(index);
    // The C parser tells where an element begins, and no more.
    _isScanned = root < size && index[root].begin < index[root].end;
    if (_isScanned)
        return;
    _spots.resize(size);
    tokenise();
    place();
    _tokens = {};
    _attributes = {};
}

SourceMarkup::Spot SourceMarkup::scannedSpot(Number entry) const noexcept {
    const XMLIndexEntry& found = _index[entry];
    if (found.nodeKind() == XMLNodeKind::element)
        return scannedElement(entry);
    if (!found.isAttributeOrNamespace())
        return {found.begin, found.end, found.begin, found.end};
    // From the opening quote back over "=" to the name.
    const std::size_t equals = text().rfind('=', found.begin - 2);
    const std::size_t last = text().find_last_not_of(blanks, equals - 1);
    const std::size_t name = text().find_last_of(blanks, last) + 1;
    return {static_cast<Offset>(name), found.end + 1, found.begin, found.end};
}

SourceMarkup::Spot SourceMarkup::scannedElement(Number element) const noexcept {
    const XMLIndexEntry& found = _index[element];
    const Number child = _index.firstChild(element);
    const std::size_t named = child != _index.content(element)
                                  ? _index[child - 1].end + 1
                                  : found.begin + 1 + _index.name(found).size();
    const std::size_t tagEnd = text().find_first_not_of(blanks, named);
    if (text()[tagEnd] == '/')
        return {found.begin, found.end, found.end, found.end};
    return {found.begin, found.end, static_cast<Offset>(tagEnd + 1),
            static_cast<Offset>(text().rfind('<', found.end - 1))};
}

void SourceMarkup::findParents() const {
    _parents.resize(_index.entries().size(), none);
    std::vector<Number> open;
    for (Number at = 0; at < _parents.size(); ++at) {
        while (!open.empty() && _index[open.back()].next <= at)
            open.pop_back();
        _parents[at] = open.empty() ? none : open.back();
        if (_index[at].nodeKind() == XMLNodeKind::element)
            open.push_back(at);
    }
}

// Where the root element begins.
std::size_t SourceMarkup::skipProlog() const {
    std::size_t at = text().find('<');
    while (at < text().size()) {
        const std::string_view rest = text().substr(at);
        if (rest.starts_with("<?"))
            at = behind(text(), "?>", at);
        else if (rest.starts_with("<!--"))
            at = behind(text(), "-->", at + 4);
        else if (rest.starts_with("<!"))
            at = behindDoctype(text(), at + 2);
        else
            return at;
        at = text().find('<', at);
    }
    return text().size();
}

std::string_view SourceMarkup::nameAt(std::size_t begin) const {
    std::size_t end = begin;
    while (end < text().size() && !endsName[static_cast<unsigned char>(text()[end])])
        ++end;
    return text().substr(begin, end - begin);
}

void SourceMarkup::add(XMLNodeKind kind, std::size_t begin, std::size_t end) {
    Token token{kind, {}};
    token.spot = {static_cast<Offset>(begin), static_cast<Offset>(end), static_cast<Offset>(begin),
                  static_cast<Offset>(end)};
    token.next = static_cast<std::uint32_t>(_tokens.size()) + 1;
    _tokens.push_back(token);
}

std::size_t SourceMarkup::startTag(std::size_t at) {
    add(XMLNodeKind::element, at, at);
    Token& token = _tokens.back();
    token.attributes = static_cast<std::uint32_t>(_attributes.size());
    std::size_t next = at + 1 + nameAt(at + 1).size();
    while (next < text().size()) {
        next = text().find_first_not_of(blanks, next);
        if (text()[next] == '>' || text()[next] == '/')
            break;
        const std::string_view name = nameAt(next);
        const std::size_t quote = text().find_first_of("\"'", next + name.size());
        const std::size_t close = text().find(text()[quote], quote + 1);
        _attributes.push_back({{static_cast<Offset>(next), static_cast<Offset>(close + 1),
                                static_cast<Offset>(quote + 1), static_cast<Offset>(close)},
                               name});
        next = close + 1;
    }
    token.attributesEnd = static_cast<std::uint32_t>(_attributes.size());
    const bool isEmpty = text()[next] == '/';
    next += isEmpty ? 2 : 1;
    token.spot.insideBegin = token.spot.insideEnd = token.spot.end = static_cast<Offset>(next);
    if (!isEmpty)
        _open.push_back(static_cast<std::uint32_t>(_tokens.size() - 1));
    return next;
}

void SourceMarkup::tokenise() {
    _tokens.reserve(_spots.size());
    std::size_t at = startTag(skipProlog());
    while (!_open.empty() && at < text().size()) {
        const std::string_view rest = text().substr(at);
        if (rest.starts_with("</")) {
            Token& token = _tokens[_open.back()];
            token.spot.insideEnd = static_cast<Offset>(at);
            at = behind(text(), ">", at);
            token.spot.end = static_cast<Offset>(at);
            token.next = static_cast<std::uint32_t>(_tokens.size());
            _open.pop_back();
        } else if (rest.starts_with("<!--")) {
            const std::size_t begin = std::exchange(at, behind(text(), "-->", at + 4));
            add(XMLNodeKind::comment, begin, at);
        } else if (rest.starts_with("<?")) {
            const std::size_t begin = std::exchange(at, behind(text(), "?>", at));
            add(XMLNodeKind::processingInstruction, begin, at);
        } else if (rest.front() == '<' && !rest.starts_with("<![")) {
            at = startTag(at);
        } else {
            const std::size_t begin = at;
            while (at < text().size() &&
                   (text()[at] != '<' || text().substr(at).starts_with("<![")))
                at = text()[at] == '<' ? behind(text(), "]]>", at)
                                       : std::min(text().find('<', at), text().size());
            add(XMLNodeKind::text, begin, at);
        }
    }
}

void SourceMarkup::place() {
    const Number root = rootOf(_index);
    if (root >= _spots.size())
        return;
    _pairs.emplace_back(root, 0);
    while (!_pairs.empty()) {
        const auto [element, token] = _pairs.back();
        _pairs.pop_back();
        _spots[element] = _tokens[token].spot;
        placeAttributes(element, _tokens[token]);
        placeChildren(element, token);
    }
}

// The index mostly lists them as the text does, declarations first.
void SourceMarkup::placeAttributes(Number element, const Token& token) {
    const std::size_t count = token.attributesEnd - token.attributes;
    if (count == 0)
        return;
    const std::span all(_attributes.data() + token.attributes, count);
    std::unordered_map<std::string_view, std::size_t> byName;
    const auto find = [&](auto isNamed, std::string_view name, std::size_t expected) {
        constexpr std::size_t fewAttributes = 8;
        if (isNamed(all[expected]))
            return expected;
        if (count <= fewAttributes)
            return static_cast<std::size_t>(std::ranges::find_if(all, isNamed) - all.begin());
        if (byName.empty())
            for (std::size_t i = 0; i < count; ++i)
                byName.emplace(all[i].name, i);
        const auto found = byName.find(name);
        return found != byName.end() ? found->second : count;
    };
    std::size_t next = 0;
    const auto place = [&](Number at, std::string_view name) {
        const std::size_t found =
            find([&](const Attribute& one) { return one.name == name; }, name, next);
        if (found == count)
            return;
        _spots[at] = all[found].spot;
        next = (found + 1) % count;
    };
    for (Number at = _index.content(element); at < _index.firstChild(element); ++at) {
        const String& name = _index.name(_index[at]);
        if (_index[at].nodeKind() != XMLNodeKind::namespaceDeclaration)
            place(at, name.view());
        else
            place(at, name.isEmpty() ? std::string("xmlns") : "xmlns:" + name.str());
    }
}

// Places none of them where they are not all the text's own.
void SourceMarkup::placeChildren(Number element, std::uint32_t token) {
    std::uint32_t child = token + 1;
    const std::uint32_t end = _tokens[token].next;
    const std::size_t before = _pairs.size();
    Number at = _index.firstChild(element);
    const Number atEnd = _index.contentEnd(element);
    _leaves.clear();
    while (at < atEnd || child < end) {
        const bool isText = child < end && _tokens[child].kind == XMLNodeKind::text;
        const bool hasText = at < atEnd && _index[at].nodeKind() == XMLNodeKind::text;
        if (isText || hasText) {
            if (isText && hasText)
                _leaves.emplace_back(at, child);
            at = hasText ? _index.siblingOf(at) : at;
            child = isText ? _tokens[child].next : child;
            continue;
        }
        const bool fits = at < atEnd && child < end &&
                          _index[at].nodeKind() == _tokens[child].kind &&
                          (_tokens[child].kind != XMLNodeKind::element ||
                           nameAt(_tokens[child].spot.begin + 1) == _index.name(_index[at]).view());
        if (!fits) {
            _pairs.resize(before);
            return;
        }
        if (_tokens[child].kind == XMLNodeKind::element)
            _pairs.emplace_back(at, child);
        else
            _leaves.emplace_back(at, child);
        at = _index.siblingOf(at);
        child = _tokens[child].next;
    }
    for (const auto& [entry, leaf] : _leaves)
        _spots[entry] = _tokens[leaf].spot;
}

} // namespace qx::detail
