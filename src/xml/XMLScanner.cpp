#include "xml/XMLScanner.h"

#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"

#include <algorithm>
#include <array>
#include <cstring>

namespace qx {

namespace {

// What a byte may be part of. Bytes beyond ASCII count as parts of names: a name is looked at in
// full when it is new.
enum : std::uint8_t {
    whiteByte = 1,
    nameByte = 2,
    textByte = 4,      // plain in text
    attributeByte = 8, // plain in an attribute's value
    markupByte = 16,   // plain in comments, instructions and CDATA
};

constexpr std::array<std::uint8_t, 256> byteClasses() {
    std::array<std::uint8_t, 256> classes{};
    for (unsigned c = 0x20; c < 0x80; ++c)
        classes[c] = textByte | attributeByte | markupByte;
    for (const unsigned char c : {' ', '\t', '\n', '\r'})
        classes[c] |= whiteByte;
    classes['\t'] |= textByte | markupByte;
    classes['\n'] |= textByte | markupByte;
    for (const unsigned char c : {'<', '&', ']'})
        classes[c] &= static_cast<std::uint8_t>(~textByte);
    for (const unsigned char c : {'<', '&', '"', '\''})
        classes[c] &= static_cast<std::uint8_t>(~attributeByte);
    for (const unsigned char c : {'-', '?', ']'})
        classes[c] &= static_cast<std::uint8_t>(~markupByte);
    for (unsigned c = 'a'; c <= 'z'; ++c)
        classes[c] |= nameByte;
    for (unsigned c = 'A'; c <= 'Z'; ++c)
        classes[c] |= nameByte;
    for (unsigned c = '0'; c <= '9'; ++c)
        classes[c] |= nameByte;
    for (const unsigned char c : {'-', '.', '_', ':'})
        classes[c] |= nameByte;
    for (unsigned c = 0x80; c < 0x100; ++c)
        classes[c] = nameByte;
    return classes;
}
constexpr auto classes = byteClasses();

bool is(char c, std::uint8_t kind) noexcept {
    return (classes[static_cast<unsigned char>(c)] & kind) != 0;
}

void skip(const char*& at, std::uint8_t kind) noexcept {
    while (is(*at, kind))
        ++at;
}

constexpr std::string_view xmlNamespace = "http://www.w3.org/XML/1998/namespace";
constexpr std::string_view xmlnsNamespace = "http://www.w3.org/2000/xmlns/";

// The C parser has had limits of its own near these; it decides there.
constexpr std::size_t longestName = 10'000;
constexpr std::size_t largestPiece = 10'000'000;

} // namespace

bool XMLScanner::scan(XMLIndex& index, const XMLParseOptions& options) {
    if (index.text().size() >= UINT32_MAX)
        return false;
    try {
        XMLScanner(index, options).scanDocument();
        return true;
    } catch (const Refused&) {
        index = XMLIndex(index.text(), index.origin());
        return false;
    }
}

XMLScanner::XMLScanner(XMLIndex& index, const XMLParseOptions& options)
    : _text(index.text()), _at(_text.data()), _end(_text.data() + _text.size()),
      _maximumDepth(options.maximumDepth),
      _maximumSize(std::min(options.maximumTextSize, largestPiece)),
      _keepsWhiteSpace(options.keepWhiteSpace), _index(index), _entries(index._entries),
      _names(_text, std::min(longestName, _maximumSize), index._names) {
    // Most entries stand for more bytes than this.
    constexpr std::size_t bytesOfEntry = 16;
    _entries.reserve(_text.size() / bytesOfEntry + 16);
}

bool XMLScanner::skipWhite() noexcept {
    const char* const start = _at;
    skip(_at, whiteByte);
    return _at != start;
}

inline XMLIndexEntry& XMLScanner::add(XMLNodeKind kind, const char* begin, Number name) {
    if (_entries.size() == _entries.capacity()) [[unlikely]]
        makeRoom();
    return _entries.emplace_back(XMLIndexEntry::of(kind, name, offset(begin)));
}

// For the rest of the text, taken to be like what has been read, and a bit more: doubling would
// double what a dense document takes.
void XMLScanner::makeRoom() {
    const double read = static_cast<double>(offset(_at)) + 1;
    const double expected =
        static_cast<double>(_entries.size()) * (static_cast<double>(_text.size()) / read);
    const std::size_t least = _entries.size() + _entries.size() / 8;
    _entries.reserve(
        std::clamp(static_cast<std::size_t>(expected * 1.05), least, _text.size() + 16));
}

inline void XMLScanner::finish(XMLIndexEntry& entry, const char* end) {
    entry.end = offset(end);
    entry.next = static_cast<std::uint32_t>(_entries.size());
    entry.setIf(_needsWork, XMLIndexEntry::needsWork);
    require(entry.end - entry.begin <= _maximumSize);
}

void XMLScanner::scanDocument() {
    if (startsWith("<?xml") && is(_at[5], whiteByte))
        scanDeclaration();
    scanMisc();
    require(*_at == '<');
    scanRoot();
    scanMisc();
    require(_at == _end);
}

// version="1.0", then encoding and standalone if they are there, in this order.
void XMLScanner::scanDeclaration() {
    _at += 5;
    const auto value = [&](std::string_view name) -> std::string_view {
        const char* const before = _at;
        if (!skipWhite() || !startsWith(name)) {
            _at = before;
            return {};
        }
        _at += name.size();
        skipWhite();
        expect('=');
        skipWhite();
        const char quote = *_at;
        require(quote == '"' || quote == '\'');
        const char* const begin = ++_at;
        while (is(*_at, nameByte) && *_at != ':')
            ++_at;
        expect(quote);
        require(_at - begin > 1);
        return {begin, static_cast<std::size_t>(_at - begin - 1)};
    };
    require(value("version") == "1.0");
    const std::string_view encoding = value("encoding");
    require(encoding.empty() ||
            ((encoding.front() | 0x20) >= 'a' && (encoding.front() | 0x20) <= 'z'));
    require(std::all_of(encoding.begin(), encoding.end(),
                        [](char c) { return static_cast<unsigned char>(c) < 0x80; }));
    const std::string_view standalone = value("standalone");
    require(standalone.empty() || standalone == "yes" || standalone == "no");
    skipWhite();
    expect('?');
    expect('>');
    _index._version = "1.0";
    if (!standalone.empty())
        _index._standalone = standalone;
}

// Comments, instructions and white space around the root.
void XMLScanner::scanMisc() {
    while (true) {
        skipWhite();
        if (startsWith("<!--"))
            scanComment();
        else if (startsWith("<?"))
            scanInstruction();
        else
            return;
    }
}

void XMLScanner::scanRoot() {
    scanElementStart();
    while (!_open.empty()) {
        if (*_at != '<')
            scanText();
        else if (_at[1] == '/')
            scanEndTag();
        else if (_at[1] == '!' || _at[1] == '?')
            scanMarkup();
        else
            scanElementStart();
    }
}

void XMLScanner::scanMarkup() {
    if (startsWith("<!--"))
        scanComment();
    else if (startsWith("<![CDATA["))
        scanText();
    else if (_at[1] == '?')
        scanInstruction();
    else
        throw Refused();
}

void XMLScanner::scanElementStart() {
    require(_open.size() < _maximumDepth);
    const char* const begin = _at++;
    const auto number = static_cast<Number>(_entries.size());
    const Number name = scanName();
    require(_names[name].meaning == Meaning::plain || _names[name].meaning == Meaning::space);
    add(XMLNodeKind::element, begin, name);
    const Open outer =
        _open.empty() ? Open{0, 0, _keepsWhiteSpace, _keepsWhiteSpace} : _open.back();
    _open.push_back({number, outer.namespaces, outer.preservesSpace, outer.preservesSpace});
    ++_element;
    if (*_at != '>')
        scanAttributes();
    if (*_at == '/') {
        ++_at;
        expect('>');
        endElement();
    } else {
        expect('>');
    }
}

void XMLScanner::scanAttributes() {
    for (std::size_t count = 0; skipWhite() && is(*_at, nameByte); ++count) {
        require(count < xmlLimits::attributes);
        scanAttribute();
    }
}

// A name="value". An attribute of the same name before it, or of the same local name with another
// prefix, is a fault or may be one.
void XMLScanner::scanAttribute() {
    const Number number = scanName();
    Name& name = _names[number];
    require(name.usedAt != _element);
    name.usedAt = _element;
    if (name.local != ScannedNames::none) {
        Name& local = _names[name.local];
        require(local.localUsedAt != _element);
        local.localUsedAt = _element;
    }
    skipWhite();
    expect('=');
    skipWhite();
    const char quote = *_at;
    require(quote == '"' || quote == '\'');
    XMLIndexEntry& entry = add(XMLNodeKind::attribute, ++_at, number);
    _needsWork = false;
    while (true) {
        skip(_at, attributeByte);
        if (*_at == quote)
            break;
        if (*_at == '"' || *_at == '\'')
            ++_at;
        else if (*_at == '&')
            scanReference();
        else if (is(*_at, whiteByte))
            _needsWork = true, ++_at;
        else
            scanBeyondASCII();
    }
    finish(entry, _at++);
    if (name.meaning != Meaning::plain)
        takeMeaning(entry, name);
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

void XMLScanner::scanEndTag() {
    const Name& name = _names[_entries[_open.back().number].name()];
    _at += 2;
    require(static_cast<std::size_t>(_end - _at) > name.size &&
            std::memcmp(_at, _text.data() + name.begin, name.size) == 0);
    _at += name.size;
    if (*_at != '>')
        skipWhite();
    expect('>');
    endElement();
}

inline void XMLScanner::endElement() {
    XMLIndexEntry& element = _entries[_open.back().number];
    element.end = offset(_at);
    element.next = static_cast<std::uint32_t>(_entries.size());
    element.setIf(_open.back().keepsLayout, XMLIndexEntry::keepsLayout);
    _open.pop_back();
}

inline void XMLScanner::scanBlanks(bool& hasLineEnd) {
    for (; is(*_at, whiteByte); ++_at) {
        if (*_at == '\n')
            hasLineEnd = true;
        else if (*_at == '\r')
            hasLineEnd = _needsWork = true;
    }
}

// One text, up to the next markup that is no CDATA.
void XMLScanner::scanText() {
    const char* const begin = _at;
    _needsWork = false;
    bool hasLineEnd = false;
    scanBlanks(hasLineEnd);
    bool isBlank = hasLineEnd && *_at == '<';
    while (true) {
        skip(_at, textByte);
        if (*_at == '<') {
            if (!startsWith("<![CDATA["))
                break;
            const bool isAlone = begin == _at;
            const bool isEmpty = scanCData();
            if (isAlone && isEmpty)
                return; // what follows is a text of its own
            isBlank = false;
        } else if (*_at == '&') {
            scanReference();
        } else if (*_at == ']') {
            require(!startsWith("]]>"));
            ++_at;
        } else if (*_at == '\r') {
            _needsWork = true;
            ++_at;
        } else {
            scanBeyondASCII();
        }
    }
    XMLIndexEntry& entry = add(XMLNodeKind::text, begin, 0);
    entry.setIf(isBlank, XMLIndexEntry::isBlank);
    _open.back().keepsLayout |= !isBlank;
    finish(entry, _at);
}

// The characters up to the closing mark, and behind it.
void XMLScanner::scanUpTo(std::string_view closing) {
    while (true) {
        skip(_at, markupByte);
        if (*_at == closing.front() && startsWith(closing))
            break;
        if (*_at == '\r')
            _needsWork = true;
        if (is(*_at, textByte | attributeByte) || *_at == '\r')
            ++_at;
        else
            scanBeyondASCII();
    }
    _at += closing.size();
}

// Whether it is empty.
bool XMLScanner::scanCData() {
    _needsWork = true;
    _at += 9;
    const char* const begin = _at;
    scanUpTo("]]>");
    return _at - begin == 3;
}

void XMLScanner::scanComment() {
    const char* const begin = _at;
    _needsWork = false;
    _at += 4;
    scanUpTo("--");
    expect('>');
    finish(add(XMLNodeKind::comment, begin, 0), _at);
}

void XMLScanner::scanInstruction() {
    const char* const begin = _at;
    _needsWork = false;
    _at += 2;
    const char* const target = _at;
    const Number name = scanName();
    const std::string_view text(target, static_cast<std::size_t>(_at - target));
    require(text.find(':') == std::string_view::npos);
    require(text.size() != 3 || (text[0] | 0x20) != 'x' || (text[1] | 0x20) != 'm' ||
            (text[2] | 0x20) != 'l');
    require(startsWith("?>") || is(*_at, whiteByte));
    scanUpTo("?>");
    finish(add(XMLNodeKind::processingInstruction, begin, name), _at);
}

void XMLScanner::scanReference() {
    _needsWork = true;
    ++_at;
    if (*_at == '#')
        return scanCharacterReference();
    for (const std::string_view name : {"lt;", "gt;", "amp;", "quot;", "apos;"}) {
        if (startsWith(name)) {
            _at += name.size();
            return;
        }
    }
    throw Refused();
}

void XMLScanner::scanCharacterReference() {
    ++_at;
    const bool isHexadecimal = *_at == 'x';
    if (isHexadecimal)
        ++_at;
    const char32_t base = isHexadecimal ? 16 : 10;
    char32_t c = 0;
    const char* const digits = _at;
    for (; *_at != ';'; ++_at) {
        char32_t digit = base;
        if (*_at >= '0' && *_at <= '9')
            digit = static_cast<char32_t>(*_at - '0');
        else if ((*_at | 0x20) >= 'a' && (*_at | 0x20) <= 'f')
            digit = static_cast<char32_t>((*_at | 0x20) - 'a' + 10);
        require(digit < base && c <= 0x10FFFF);
        c = c * base + digit;
    }
    require(_at != digits && isXMLCharacter(c));
    ++_at;
}

// One character beyond ASCII; anything else that no loop takes is a fault.
void XMLScanner::scanBeyondASCII() {
    require(static_cast<unsigned char>(*_at) >= 0x80);
    std::size_t position = 0;
    const char32_t c = decodeCharacter(
        {_at, std::min<std::size_t>(4, static_cast<std::size_t>(_end - _at))}, position);
    require(isXMLCharacter(c));
    _at += position;
}

XMLScanner::Number XMLScanner::scanName() {
    const char* const begin = _at;
    skip(_at, nameByte);
    require(_at != begin);
    return _names.numberOf(begin, static_cast<std::size_t>(_at - begin));
}

} // namespace qx
