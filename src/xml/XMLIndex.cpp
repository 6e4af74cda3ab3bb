#include "xml/XMLIndex.h"

#include "xml/XMLCharacters.h"

#include <algorithm>
#include <cstdlib>

namespace qx {

namespace {

constexpr std::string_view cdataStart = "<![CDATA[";
constexpr std::string_view cdataEnd = "]]>";

// The reference at the start of the text, "&…;"; moves behind it.
void appendReference(std::string_view& text, std::string& result) {
    const std::size_t end = text.find(';');
    const std::string_view name = text.substr(1, end - 1);
    text.remove_prefix(end + 1);
    if (name == "lt")
        result += '<';
    else if (name == "gt")
        result += '>';
    else if (name == "amp")
        result += '&';
    else if (name == "quot")
        result += '"';
    else if (name == "apos")
        result += '\'';
    else if (name[1] == 'x')
        appendCharacter(
            static_cast<char32_t>(std::strtoul(std::string(name.substr(2)).c_str(), nullptr, 16)),
            result);
    else
        appendCharacter(
            static_cast<char32_t>(std::strtoul(std::string(name.substr(1)).c_str(), nullptr, 10)),
            result);
}

// A line end is one line feed, however it is written.
void appendLineEnd(std::string_view& text, char as, std::string& result) {
    const bool isPair = text.starts_with("\r\n");
    text.remove_prefix(isPair ? 2 : 1);
    result += as;
}

void appendNormalised(std::string_view text, std::string& result) {
    while (!text.empty()) {
        const std::size_t plain = std::min(text.find('\r'), text.size());
        result += text.substr(0, plain);
        text.remove_prefix(plain);
        if (!text.empty())
            appendLineEnd(text, '\n', result);
    }
}

void appendText(std::string_view text, std::string& result) {
    while (!text.empty()) {
        const std::size_t plain = std::min(text.find_first_of("&<\r"), text.size());
        result += text.substr(0, plain);
        text.remove_prefix(plain);
        if (text.empty())
            return;
        if (text.front() == '&') {
            appendReference(text, result);
        } else if (text.front() == '\r') {
            appendLineEnd(text, '\n', result);
        } else {
            const std::size_t end = text.find(cdataEnd);
            appendNormalised(text.substr(cdataStart.size(), end - cdataStart.size()), result);
            text.remove_prefix(end + cdataEnd.size());
        }
    }
}

// White space that is not written as a reference becomes blanks.
void appendAttributeValue(std::string_view text, std::string& result) {
    while (!text.empty()) {
        const std::size_t plain = std::min(text.find_first_of("&\t\n\r"), text.size());
        result += text.substr(0, plain);
        text.remove_prefix(plain);
        if (text.empty())
            return;
        if (text.front() == '&')
            appendReference(text, result);
        else
            appendLineEnd(text, ' ', result);
    }
}

} // namespace

std::string_view XMLIndex::span(const XMLIndexEntry& entry) const noexcept {
    const std::string_view source = entry.has(XMLIndexEntry::isAside) ? _aside : _text;
    const std::string_view whole = source.substr(entry.begin, entry.end - entry.begin);
    if (entry.has(XMLIndexEntry::isAside))
        return whole;
    if (entry.nodeKind() == XMLNodeKind::comment)
        return whole.substr(4, whole.size() - 7);
    if (entry.nodeKind() != XMLNodeKind::processingInstruction)
        return whole;
    const std::string_view data = whole.substr(2, whole.size() - 4);
    return withoutLeadingWhite(data.substr(name(entry).size()));
}

std::string_view XMLIndex::workedOut(const XMLIndexEntry& entry, std::string& room) const {
    const std::string_view raw = span(entry);
    if (!entry.has(XMLIndexEntry::needsWork))
        return raw;
    room.clear();
    switch (entry.nodeKind()) {
    case XMLNodeKind::attribute:
    case XMLNodeKind::namespaceDeclaration:
        appendAttributeValue(raw, room);
        break;
    case XMLNodeKind::text:
        appendText(raw, room);
        break;
    default:
        appendNormalised(raw, room);
    }
    return room;
}

} // namespace qx
