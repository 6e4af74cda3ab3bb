#include "xml/XMLScanner.h"

#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"

#include <algorithm>
#include <tuple>

namespace qx {

namespace {

constexpr std::string_view xmlNamespace = "http://www.w3.org/XML/1998/namespace";
constexpr std::string_view xmlnsNamespace = "http://www.w3.org/2000/xmlns/";

// The C parser has had limits of its own near these; it decides there.
constexpr std::size_t longestName = 10'000;
constexpr std::size_t largestPiece = 10'000'000;

constexpr std::ptrdiff_t emptyCData = 12;

} // namespace

bool XMLScanner::scan(XMLIndex& index, const XMLParseOptions& options, Kept* kept) {
    if (index.text().size() >= UINT32_MAX)
        return false;
    Kept own;
    Kept& used = kept != nullptr ? *kept : own;
    try {
        try {
            scan(index, options, used);
        } catch (const MixedLayout&) {
            used.hasMixedLayout = true;
            scan(index, options, used);
        }
        return true;
    } catch (const Refused&) {
        index = XMLIndex(index.text(), index.origin());
        return false;
    }
}

void XMLScanner::scan(XMLIndex& index, const XMLParseOptions& options, Kept& kept) {
    const std::size_t longest = std::min(longestName, options.maximumTextSize);
    XMLScanner scanner(index, options, ScannedNames::take(kept.names, longest),
                       kept.hasMixedLayout);
    scanner.scanDocument();
    index._names = scanner._names.finish(scanner._element, kept.names);
}

XMLScanner::XMLScanner(XMLIndex& index, const XMLParseOptions& options, ScannedNames names,
                       bool hasMixedLayout)
    : _text(index.text()), _end(_text.data() + _text.size()), _maximumDepth(options.maximumDepth),
      _maximumSize(std::min(options.maximumTextSize, largestPiece)),
      _keepsWhiteSpace(options.keepWhiteSpace), _hasMixedLayout(hasMixedLayout), _index(index),
      _names(std::move(names)), _element(_names.element()) {
    constexpr std::size_t usualDepth = 16;
    _open.reserve(usualDepth);
    // Most entries stand for more bytes than this.
    constexpr std::size_t bytesOfEntry = 16;
    makeRoom(_text.size() / bytesOfEntry + 16);
}

namespace {

const char* afterWhite(const char* at) noexcept {
    while (is(*at, whiteByte))
        ++at;
    return at;
}

} // namespace

inline XMLIndexEntry& XMLScanner::add(const XMLIndexEntry& entry) {
    if (_next == _last) [[unlikely]]
        makeMoreRoom(entry.begin);
    return *_next++ = entry;
}

// What has no entries inside.
inline XMLIndexEntry& XMLScanner::addLeaf(XMLNodeKind kind, Number name, const char* begin,
                                          const char* end) {
    const Number next = entryCount() + 1;
    XMLIndexEntry entry{offset(begin), offset(end), next, XMLIndexEntry::of(kind, name, 0).bits};
    entry.setIf(_needsWork, XMLIndexEntry::needsWork);
    require(entry.end - entry.begin <= _maximumSize);
    return add(entry);
}

void XMLScanner::makeRoom(std::size_t entries) {
    const Number count = entryCount();
    auto& all = _index._entries;
    all.resize(entries);
    _first = all.data();
    _next = _first + count;
    _last = _first + entries;
}

// For the rest of the text, taken to be like what has been read, and a bit more: doubling would
// double what a dense document takes.
void XMLScanner::makeMoreRoom(std::uint32_t place) {
    const std::size_t count = entryCount();
    const double read = static_cast<double>(place) + 1;
    const double expected = static_cast<double>(count) * (static_cast<double>(_text.size()) / read);
    makeRoom(std::clamp(static_cast<std::size_t>(expected * 1.05), count + count / 8,
                        _text.size() + 16));
}

void XMLScanner::scanDocument() {
    Place at = _text.data();
    if (startsWith(at, "<?xml") && is(at[5], whiteByte))
        at = scanDeclaration(at);
    at = scanMisc(at);
    require(*at == '<');
    at = scanMisc(scanRoot(at));
    require(at == _end);
    _index._entries.resize(entryCount());
}

// version="1.0", then encoding and standalone if they are there, in this order.
XMLScanner::Place XMLScanner::scanDeclaration(Place at) {
    at += 5;
    const auto value = [&](std::string_view name) -> std::string_view {
        const Place begin = afterWhite(at);
        if (begin == at || !startsWith(begin, name))
            return {};
        at = afterWhite(expect(afterWhite(begin + name.size()), '='));
        const char quote = *at;
        require(quote == '"' || quote == '\'');
        const Place first = ++at;
        while (is(*at, nameByte) && *at != ':')
            ++at;
        const std::string_view found(first, static_cast<std::size_t>(at - first));
        at = expect(at, quote);
        require(!found.empty());
        return found;
    };
    require(value("version") == "1.0");
    const std::string_view encoding = value("encoding");
    require(encoding.empty() ||
            ((encoding.front() | 0x20) >= 'a' && (encoding.front() | 0x20) <= 'z'));
    require(std::all_of(encoding.begin(), encoding.end(),
                        [](char c) { return static_cast<unsigned char>(c) < 0x80; }));
    const std::string_view standalone = value("standalone");
    require(standalone.empty() || standalone == "yes" || standalone == "no");
    at = expect(expect(afterWhite(at), '?'), '>');
    _index._version = "1.0";
    if (!standalone.empty())
        _index._standalone = standalone;
    return at;
}

// Comments, instructions and white space around the root.
XMLScanner::Place XMLScanner::scanMisc(Place at) {
    while (true) {
        at = afterWhite(at);
        if (startsWith(at, "<!--"))
            at = scanComment(at);
        else if (startsWith(at, "<?"))
            at = scanInstruction(at);
        else
            return at;
    }
}

XMLScanner::Place XMLScanner::scanRoot(Place at) {
    at = scanElementStart(at);
    while (!_open.empty()) {
        if (*at != '<')
            at = *at == '\n' ? scanIndent(at) : scanText(at);
        else if (at[1] == '/')
            at = scanEndTag(at);
        else if (at[1] == '!' || at[1] == '?')
            at = scanMarkup(at);
        else
            at = scanElementStart(at);
    }
    return at;
}

XMLScanner::Place XMLScanner::scanMarkup(Place at) {
    if (startsWith(at, "<!--"))
        return scanComment(at);
    if (startsWith(at, "<![CDATA["))
        return scanText(at);
    require(at[1] == '?');
    return scanInstruction(at);
}

inline XMLScanner::Place XMLScanner::scanElementStart(Place at) {
    require(_open.size() < _maximumDepth);
    const Place begin = at++;
    const Name& name = scanName(at);
    require(name.meaning == Meaning::plain || name.meaning == Meaning::space);
    const Number number = entryCount();
    add(XMLIndexEntry::of(XMLNodeKind::element, name.number, offset(begin)));
    const Open outer =
        _open.empty() ? Open{0, 0, _keepsWhiteSpace, false, _keepsWhiteSpace} : _open.back();
    _open.push_back({number, outer.namespaces, outer.preservesSpace, false, outer.preservesSpace});
    ++_element;
    if (*at != '>')
        at = scanAttributes(at);
    const bool isEmpty = *at == '/';
    at = expect(isEmpty ? at + 1 : at, '>');
    if (isEmpty)
        endElement(at);
    return at;
}

XMLScanner::Place XMLScanner::scanAttributes(Place at) {
    for (std::size_t count = 0;; ++count) {
        const Place begin = afterWhite(at);
        if (begin == at || !is(*begin, nameByte))
            return begin;
        require(count < xmlLimits::attributes);
        at = scanAttribute(begin);
    }
}

// A name="value". An attribute of the same name before it, or of the same local name with another
// prefix, is a fault or may be one.
inline XMLScanner::Place XMLScanner::scanAttribute(Place at) {
    Name& name = scanName(at);
    require(name.usedAt != _element);
    name.usedAt = _element;
    if (name.local != ScannedNames::none) {
        Name& local = _names[name.local];
        require(local.localUsedAt != _element);
        local.localUsedAt = _element;
    }
    at = afterWhite(expect(afterWhite(at), '='));
    const char quote = *at;
    require(quote == '"' || quote == '\'');
    const Place begin = ++at;
    _needsWork = false;
    while (true) {
        at = endOfRun<attributeByte>(at, _end);
        if (*at == quote)
            break;
        if (*at == '"' || *at == '\'')
            ++at;
        else if (*at == '&')
            at = scanReference(at);
        else if (is(*at, whiteByte))
            _needsWork = true, ++at;
        else
            at = scanBeyondASCII(at);
    }
    XMLIndexEntry& entry = addLeaf(XMLNodeKind::attribute, name.number, begin, at);
    if (name.meaning != Meaning::plain)
        takeMeaning(entry, name);
    return at + 1;
}

void XMLScanner::takeMeaning(XMLIndexEntry& entry, const Name& name) {
    if (name.meaning != Meaning::space)
        return takeDeclaration(entry, name);
    std::string room;
    Open& element = _open.back();
    element.preservesSpace = _keepsWhiteSpace || _index.value(entry, room) == "preserve";
    element.keepsLayout = element.preservesSpace;
}

// Declarations with rules of their own are left to the C parser.
void XMLScanner::takeDeclaration(XMLIndexEntry& entry, const Name& name) {
    const std::string_view URI = _text.substr(entry.begin, entry.end - entry.begin);
    require(!_needsWork && URI != xmlNamespace && URI != xmlnsNamespace);
    require(++_open.back().namespaces <= xmlLimits::namespaces);
    _names.countURI();
    const bool hasPrefix = name.meaning == Meaning::prefixNamespace;
    require(!hasPrefix || !URI.empty());
    const Number prefix = hasPrefix ? name.local : _names.numberOfNoPrefix();
    entry.bits = XMLIndexEntry::of(XMLNodeKind::namespaceDeclaration, prefix, 0).bits;
}

inline XMLScanner::Place XMLScanner::scanEndTag(Place at) {
    const Name& name = _names[_first[_open.back().number].name()];
    at += 2;
    require((name.size <= ShortName::longest && name.bytes.standsAt(at, _end, name.size)) ||
            startsWith(at, _names.text(name)));
    at = expect(afterWhite(at + name.size), '>');
    endElement(at);
    return at;
}

inline void XMLScanner::endElement(Place end) {
    XMLIndexEntry& element = _first[_open.back().number];
    element.end = offset(end);
    element.next = entryCount();
    element.setIf(_open.back().keepsLayout, XMLIndexEntry::keepsLayout);
    _open.pop_back();
}

// Up to where there are no more blanks, and whether there was a line end among them.
inline std::pair<XMLScanner::Place, bool> XMLScanner::scanBlanks(Place at) {
    bool hasLineEnd = false;
    while (true) {
        const Place begin = at;
        at = endOfRun<blankByte>(at, _end);
        hasLineEnd = hasLineEnd || *begin == '\n' || std::find(begin, at, '\n') != at;
        if (*at != '\r')
            return {at, hasLineEnd};
        hasLineEnd = _needsWork = true;
        ++at;
    }
}

// What mostly stands between elements: a line end and blanks.
inline XMLScanner::Place XMLScanner::scanIndent(Place at) {
    const Place end = endOfRun<blankByte>(at, _end);
    if (*end != '<' || end[1] == '!')
        return scanText(at);
    _needsWork = false;
    addLayout(at, end);
    return end;
}

inline void XMLScanner::addLayout(Place begin, Place end) {
    Open& element = _open.back();
    if (element.keepsLayout || _hasMixedLayout)
        addLeaf(XMLNodeKind::text, 0, begin, end).setIf(true, XMLIndexEntry::isBlank);
    else
        element.leavesOutLayout = true;
    require(static_cast<std::size_t>(end - begin) <= _maximumSize);
}

// One text, up to the next markup that is no CDATA.
inline XMLScanner::Place XMLScanner::scanText(Place at) {
    const Place begin = at;
    _needsWork = false;
    bool isBlank = false;
    if (is(*at, whiteByte)) {
        std::tie(at, isBlank) = scanBlanks(at);
        isBlank = isBlank && *at == '<';
    }
    while (true) {
        if (*at != '<')
            at = endOfRun<textByte>(at, _end);
        if (*at == '<') {
            if (at[1] != '!' || !startsWith(at, "<![CDATA["))
                break;
            const Place inside = std::exchange(at, scanCData(at));
            if (inside == begin && at - inside == emptyCData)
                return at; // what follows is a text of its own
            isBlank = false;
        } else if (*at == '&') {
            at = scanReference(at);
        } else if (*at == ']') {
            require(!startsWith(at, "]]>"));
            ++at;
        } else if (*at == '\r') {
            _needsWork = true;
            ++at;
        } else {
            at = scanBeyondASCII(at);
        }
    }
    if (isBlank) {
        addLayout(begin, at);
        return at;
    }
    addLeaf(XMLNodeKind::text, 0, begin, at);
    Open& element = _open.back();
    if (element.leavesOutLayout)
        throw MixedLayout();
    element.keepsLayout = true;
    return at;
}

// Behind the closing mark.
XMLScanner::Place XMLScanner::scanBehind(std::string_view closing, Place at) {
    while (true) {
        at = endOfRun<markupByte>(at, _end);
        if (*at == closing.front() && startsWith(at, closing))
            return at + closing.size();
        if (*at == '\r')
            _needsWork = true;
        if (is(*at, textByte | attributeByte) || *at == '\r')
            ++at;
        else
            at = scanBeyondASCII(at);
    }
}

XMLScanner::Place XMLScanner::scanCData(Place at) {
    _needsWork = true;
    return scanBehind("]]>", at + 9);
}

XMLScanner::Place XMLScanner::scanComment(Place at) {
    const Place begin = at;
    _needsWork = false;
    at = expect(scanBehind("--", at + 4), '>');
    addLeaf(XMLNodeKind::comment, 0, begin, at);
    return at;
}

XMLScanner::Place XMLScanner::scanInstruction(Place at) {
    const Place begin = at;
    _needsWork = false;
    at += 2;
    const Name& target = findNameByBytes(at);
    const Number name = target.number;
    const std::string_view text(at, target.size);
    at += target.size;
    require(text.find(':') == std::string_view::npos);
    require(text.size() != 3 || (text[0] | 0x20) != 'x' || (text[1] | 0x20) != 'm' ||
            (text[2] | 0x20) != 'l');
    require(startsWith(at, "?>") || is(*at, whiteByte));
    at = scanBehind("?>", at);
    addLeaf(XMLNodeKind::processingInstruction, name, begin, at);
    return at;
}

XMLScanner::Place XMLScanner::scanReference(Place at) {
    _needsWork = true;
    ++at;
    if (*at == '#')
        return scanCharacterReference(at);
    for (const std::string_view name : {"lt;", "gt;", "amp;", "quot;", "apos;"})
        if (startsWith(at, name))
            return at + name.size();
    throw Refused();
}

XMLScanner::Place XMLScanner::scanCharacterReference(Place at) {
    ++at;
    const bool isHexadecimal = *at == 'x';
    if (isHexadecimal)
        ++at;
    const char32_t base = isHexadecimal ? 16 : 10;
    char32_t c = 0;
    const Place digits = at;
    for (; *at != ';'; ++at) {
        char32_t digit = base;
        if (*at >= '0' && *at <= '9')
            digit = static_cast<char32_t>(*at - '0');
        else if ((*at | 0x20) >= 'a' && (*at | 0x20) <= 'f')
            digit = static_cast<char32_t>((*at | 0x20) - 'a' + 10);
        require(digit < base && c <= 0x10FFFF);
        c = c * base + digit;
    }
    require(at != digits && isXMLCharacter(c));
    return at + 1;
}

// Characters beyond ASCII, one at least; anything else that no loop takes is a fault.
XMLScanner::Place XMLScanner::scanBeyondASCII(Place at) {
    require(static_cast<unsigned char>(*at) >= 0x80);
    do {
        std::size_t position = 0;
        const char32_t c = decodeCharacter(
            {at, std::min<std::size_t>(4, static_cast<std::size_t>(_end - at))}, position);
        require(isXMLCharacter(c));
        at += position;
    } while (static_cast<unsigned char>(*at) >= 0x80);
    return at;
}

inline XMLScanner::Name& XMLScanner::scanName(Place& at) {
    Name* name =
        _latestName != ScannedNames::none ? _names.follower(_latestName, at, _end) : nullptr;
    if (name == nullptr) [[unlikely]]
        name = &findName(at);
    _latestName = name->number;
    at += name->size;
    return *name;
}

XMLScanner::Name& XMLScanner::findName(Place at) {
    ShortName bytes;
    const std::size_t size = ShortName::read(at, _end, bytes);
    Name& name = size != 0 ? _names.find(at, size, bytes) : findNameByBytes(at);
    if (_latestName != ScannedNames::none)
        _names.setFollower(_latestName, name);
    return name;
}

XMLScanner::Name& XMLScanner::findNameByBytes(Place at) {
    const Place begin = at;
    while (is(*at, nameByte))
        ++at;
    require(at != begin);
    return _names.find(begin, static_cast<std::size_t>(at - begin));
}

} // namespace qx
