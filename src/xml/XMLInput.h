#pragma once

// A document's bytes made ready for the parser: as UTF-8 without a byte-order mark, with nothing in
// them that the parser would take unlimited time for. Lent UTF-8 that a zero byte follows stays
// where it is and is not copied.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <string>
#include <string_view>

namespace qx {

class XMLInput {
public:
    XMLInput() = default;
    XMLInput(const XMLInput&) = delete;
    XMLInput& operator=(const XMLInput&) = delete;

    // With a copy where the bytes go with the call. Throws ParseFailure; text() is then what could
    // be read up to its place.
    void read(XMLBytes bytes, bool copies);

    // A zero byte follows it.
    std::string_view text() const noexcept { return _text; }
    // As the XML declaration names it; null where it names none.
    const String& declaredEncoding() const noexcept { return _declaredEncoding; }

private:
    // Whether the text was converted, and is our own.
    bool decodeBytes(std::string_view bytes);
    void convert(std::string_view bytes, const String& encoding);
    void checkStart() const;

    std::string_view _text;
    std::string _own;
    String _declaredEncoding;
};

} // namespace qx
