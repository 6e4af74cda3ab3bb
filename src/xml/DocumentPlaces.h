#pragma once

// Where the entries of an index stand, for those who ask after the reading is over: it keeps the
// text with its index, or the tree's index with the elements. The first answer takes one pass over
// the document, later ones are found from what that left. Any thread may ask.

#include "model/ErrorDetails.h"
#include "xml/ParsedDocument.h"
#include "xml/XMLTreeIndexer.h"

#include <mutex>

namespace qx {

class DocumentPlaces {
public:
    using Number = XMLIndex::Number;

    // Of nothing.
    DocumentPlaces() = default;
    DocumentPlaces(std::shared_ptr<const ParsedDocument> parsed, String documentName);
    // The tree is not to grow while another thread asks.
    DocumentPlaces(std::shared_ptr<const XMLTreeIndexer> tree, String documentName);
    DocumentPlaces(const DocumentPlaces&) = delete;
    DocumentPlaces& operator=(const DocumentPlaces&) = delete;

    const String& documentName() const noexcept { return _documentName; }
    // Of an element, an attribute, or a text at its first character that is no white space; of
    // other entries that of the element around them.
    detail::SourcePlace placeOf(Number number) const;
    // Grows in the order of the document.
    Number orderOf(Number number) const;
    // The names, as written, of an entry, and of the attributes and the child elements in it.
    String nameOf(Number number) const;
    // Of an attribute, or of the first text in an element.
    String textOf(Number number) const;
    std::vector<String> attributesOf(Number element) const;
    std::vector<String> childrenOf(Number element) const;

private:
    // How an entry is found: by one pass, which asks after each name once.
    struct Step {
        Number parent;
        std::uint32_t position; // among those of its name around it, from 1; 0 for the only one
        Number order;
    };
    static constexpr Number none = UINT32_MAX;

    const XMLIndex* index() const noexcept;
    void findSteps() const;
    void addStepsIn(Number element, std::vector<Number>& open) const;
    void numberItems() const;
    std::string stepTo(Number number) const;
    String pathOf(Number number) const;
    // Where the entry begins in the text: an attribute at its name.
    std::size_t beginOf(Number number) const;
    void setPosition(detail::SourcePlace& source, Number number) const;

    const std::shared_ptr<const ParsedDocument> _parsed;
    const std::shared_ptr<const XMLTreeIndexer> _tree;
    const String _documentName{};
    mutable std::mutex _mutex; // guards the rest
    mutable std::vector<Step> _steps;
    mutable std::optional<TextPosition> _position;
};

} // namespace qx
