#pragma once

// What a document was parsed into, before anybody has asked for its nodes. A document makes them
// all at once, when one is first asked for, and then lets go of its text and index.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "xml/ParsedDocument.h"

#include <memory>

namespace qx {

struct XMLDocumentContent {
    // A document without nodes yet; null for null.
    static Ref<XMLDocument> document(std::shared_ptr<const ParsedDocument> parsed);

    // Reads a document without making its nodes. Whoever needs one of them after all asks for it;
    // that makes those of the whole document.
    class Reader {
    public:
        explicit Reader(const XMLDocument& document);
        ~Reader();
        Reader(const Reader&) = delete;
        Reader& operator=(const Reader&) = delete;

        // Null where the document has its nodes already.
        const ParsedDocument* parsed() const noexcept { return _parsed.get(); }
        // The element that was made of the entry, wherever the host has put it since.
        Ref<XMLNode> element(XMLIndex::Number number) const;

    private:
        const Ref<const XMLDocument> _document;
        std::shared_ptr<const ParsedDocument> _parsed;
    };
};

} // namespace qx
