#pragma once

// A document's bytes made ready for the parser: as UTF-8 without a byte-order mark, with nothing in
// them that the parser would take unlimited time for. UTF-8 is read where it
// stands, without a copy, if its owner stays.

#include <QXXMLMarshalling/base/String.h>

#include <string>
#include <string_view>

namespace qx {

class XMLInput {
public:
    XMLInput() = default;
    XMLInput(const XMLInput&) = delete;
    XMLInput& operator=(const XMLInput&) = delete;

    // Bytes that are not copied stay where they are as long as this, and a zero byte follows them.
    // Throws ParseFailure; text() is then what could be read up to its place.
    void read(std::string_view bytes, bool copies);
    // Likewise, of text that is UTF-8 already.
    void take(std::string text);

    // A zero byte follows it.
    std::string_view text() const noexcept { return _text; }
    // As the XML declaration names it; null where it names none.
    const String& declaredEncoding() const noexcept { return _declaredEncoding; }

private:
    // Whether the text was converted, and is our own.
    bool decodeBytes(std::string_view bytes);
    void convert(std::string_view bytes, const String& encoding);
    void checkStart() const;
    void checkTags() const;

    std::string_view _text;
    std::string _own;
    String _declaredEncoding;
};

} // namespace qx
