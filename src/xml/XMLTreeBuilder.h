#pragma once

// Puts a document together from what the parser reports, in document order. It joins the pieces
// that the parser cuts a text into, drops layout, and counts depth and sizes: beyond a limit it
// throws ParseFailure. The document under construction owns every node from the moment it is made.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/MemoryBlocks.h"

#include <deque>
#include <string>
#include <vector>

namespace qx {

class XMLTreeBuilder {
public:
    // Used on the thread that makes it.
    XMLTreeBuilder(XMLDocument& document, const XMLParseOptions& options)
        : _document(document), _options(options), _blocks(MemoryBlocks::ofNodes()) {}

    void startElement(const String& name, std::size_t attributes, std::size_t line,
                      std::size_t column);
    // Of the element that was started last, before anything inside it.
    void addNamespace(const String& prefix, const String& URI);
    void addAttribute(const String& name, std::string_view value);
    void setPreservesSpace(bool preserves) { _open.back().preservesSpace = preserves; }
    void endElement();
    // Whether there is a root, and every element has ended.
    bool isComplete() const noexcept { return _open.empty() && _document.rootElement() != nullptr; }

    // A piece of text. `mayBeLayout`: white space would be the document's own, not a reference's;
    // `isLasting`: the piece stays where it is until the document is finished.
    void addText(std::string_view piece, bool mayBeLayout, bool isLasting) {
        const bool isWhole = isLasting && !hasPendingText() && !_open.empty();
        if (!isWhole || piece.size() > _options.maximumTextSize)
            return joinText(piece, mayBeLayout);
        _lasting = piece;
        _mayBeLayout = mayBeLayout;
    }
    void addComment(std::string_view text);
    void addProcessingInstruction(const String& target, std::string_view data);

private:
    struct OpenElement {
        XMLElement* element;
        std::size_t firstLayout; // of its own, in _layouts
        std::size_t namespaces;  // how many declarations are in force
        bool hasText;
        bool preservesSpace;
    };
    // A text of white space put aside until another text shows that it matters.
    struct Layout {
        XMLNode* after; // the node that it follows; null for the first
        std::string_view text;
    };

    XMLNode* newNode(XMLNodeKind kind, String name, String value);
    bool hasPendingText() const noexcept { return !_lasting.empty() || !_joined.empty(); }
    void joinText(std::string_view piece, bool mayBeLayout);
    void finishText() {
        if (hasPendingText())
            placeText();
    }
    bool isLayout(std::string_view text) const noexcept;
    // Of an element that has nothing else the text is held by the element itself.
    void placeText(bool endsElement = false);
    void appendText(std::string_view text, bool isLayout, XMLNode* before);
    void appendChild(XMLElement& parent, XMLNode* child, XMLNode* before = nullptr) noexcept;
    void appendToCurrent(Ref<XMLNode> node);
    void restoreLayout(OpenElement& open);
    void dropLayout(const OpenElement& open) noexcept;
    void requireSize(std::size_t size, const ErrorText& text) const {
        if (size > _options.maximumTextSize)
            refuseSize(text);
    }
    [[noreturn]] void refuseSize(const ErrorText& text) const;

    XMLDocument& _document;
    const XMLParseOptions _options;
    MemoryBlocks& _blocks;
    std::vector<OpenElement> _open;
    // The current text: one lasting piece, or several joined.
    std::string_view _lasting;
    std::string _joined;
    bool _mayBeLayout = false;
    std::vector<Layout> _layouts;
    std::deque<std::string> _joinedLayouts; // texts of these that came in several pieces
};

} // namespace qx
