#pragma once

// The texts of the entities that a document declares, looked at before the C parser reads them.
//
// A carriage return that a reference put into such a text belongs to it, but the C parser takes it
// for a line end when it reads the text. So another character stands for it meanwhile: one that
// the document holds nowhere. In tags, comments and processing instructions it stays what it is:
// there it is white space, or could not be written again.

#include <array>
#include <libxml/parser.h>
#include <string>
#include <string_view>
#include <unordered_map>

namespace qx {

class EntityTexts {
public:
    // The document must outlive this.
    explicit EntityTexts(std::string_view document) noexcept : _document(document) {}

    // The text of a general entity as the C parser is to read it. Throws ParseFailure where a start
    // tag in it has too many attributes.
    std::string prepared(std::string_view text);

    // Whether the piece holds characters that stand for carriage returns.
    bool isMarked(std::string_view piece) const noexcept {
        return _mark != nullptr && piece.find(_mark->data()) != std::string_view::npos;
    }
    // The piece with `replacement` in their place.
    std::string unmarked(std::string_view piece, char replacement) const;

    // Throws ParseFailure for an entity that refers to itself, or through very many others: the
    // C parser needs stack for each.
    void requireFlat(xmlDoc* document, const xmlEntity& entity) { heightOf(document, entity, 0); }

private:
    using Mark = std::array<char, 4>; // as UTF-8, a zero byte behind

    std::size_t heightOf(xmlDoc* document, const xmlEntity& entity, std::size_t depth);
    const Mark* freeMark() const noexcept;

    std::string_view _document;
    const Mark* _mark = nullptr;
    // How many entities stand inside of each, one in another.
    std::unordered_map<const xmlEntity*, std::size_t> _heights;
};

} // namespace qx
