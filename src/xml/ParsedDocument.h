#pragma once

// A document as it was parsed: its text with the index over it, before there are nodes. Shared by
// the document and by those who read it, on whatever threads: it never changes.

#include "xml/XMLIndex.h"
#include "xml/XMLInput.h"

#include <memory>

namespace qx {

class ParsedDocument : public std::enable_shared_from_this<ParsedDocument> {
public:
    ParsedDocument() : _index({}) {}
    ParsedDocument(const ParsedDocument&) = delete;
    ParsedDocument& operator=(const ParsedDocument&) = delete;

    const XMLIndex& index() const noexcept { return _index; }
    // As the XML declaration names it; null where it names none.
    const String& encoding() const noexcept { return _input.declaredEncoding(); }

private:
    friend class XMLParser;

    Ref<const Object> _owner; // of the text, where it lies in an object
    XMLInput _input;
    XMLIndex _index;
};

} // namespace qx
