#pragma once

// Fills an index from what the C parser reports, in document order. It joins the pieces that the
// parser cuts a text into and counts depth and sizes: beyond a limit it throws ParseFailure.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "xml/XMLIndex.h"
#include "xml/XMLNames.h"

#include <string>
#include <vector>

namespace qx {

class XMLIndexBuilder {
public:
    using Number = XMLIndex::Number;

    // The index is empty.
    XMLIndexBuilder(XMLIndex& index, const XMLParseOptions& options)
        : _index(index), _options(options), _names(index._names) {}

    void setDeclaration(const String& version, const String& standalone);
    XMLNames& names() noexcept { return _names; }

    // At that offset of the text.
    void startElement(Number name, std::size_t offset);
    // Of the element that was started last, before anything inside it.
    void addNamespace(Number prefix, std::string_view URI);
    void addAttribute(Number name, std::string_view value);
    void setPreservesSpace(bool preserves);
    void endElement();
    // Whether there is a root, and every element has ended.
    bool isComplete() const noexcept { return _hasRoot && _open.empty(); }

    // A piece of text. `mayBeLayout`: white space would be the document's own, not a reference's.
    void addText(std::string_view piece, bool mayBeLayout);
    void addComment(std::string_view text);
    void addProcessingInstruction(Number target, std::string_view data);

    // Whether the piece is a part of the document's text as it stands.
    bool isOwn(std::string_view piece) const noexcept;

private:
    struct OpenElement {
        Number number;
        std::size_t namespaces; // how many declarations are in force
        bool keepsLayout;
        bool preservesSpace;
    };

    void add(XMLNodeKind kind, Number name, std::string_view value);
    void finishText();
    bool isLayout(std::string_view text) const noexcept;
    void requireSize(std::size_t size, const ErrorText& text) const {
        if (size > _options.maximumTextSize)
            refuseSize(text);
    }
    [[noreturn]] void refuseSize(const ErrorText& text) const;

    XMLIndex& _index;
    const XMLParseOptions _options;
    XMLNames _names;
    std::vector<OpenElement> _open;
    bool _hasRoot = false;
    // The current text: one piece of the document, or several joined.
    std::string_view _piece;
    std::string _joined;
    bool _mayBeLayout = false;
};

} // namespace qx
