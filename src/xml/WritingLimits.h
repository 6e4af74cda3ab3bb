#pragma once

// The limits of reading, kept while a document is written: what is written can be read again. What
// is beyond one raises NSInvalidArgumentException that names the place.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "xml/XMLLimits.h"
#include "xml/XMLPlace.h"

#include <unordered_set>
#include <vector>

namespace qx {

class WritingLimits {
public:
    // The options that the text will be read with; null for no limits, then nothing is counted.
    explicit WritingLimits(const XMLParseOptions* reading) noexcept : _reading(reading) {}

    // Around what an element holds.
    void enter(const XMLPlace& element, std::size_t attributes, std::size_t declarations) {
        if (_reading == nullptr)
            return;
        _textSize = 0;
        if (++_depth > _reading->maximumDepth || attributes > xmlLimits::attributes ||
            declarations != 0) [[unlikely]]
            enterLimited(element, attributes, declarations);
    }
    void leave() noexcept {
        if (_reading == nullptr)
            return;
        _textSize = 0;
        if (!_declarations.empty() && _declarations.back().depth == _depth) {
            _namespaces -= _declarations.back().count;
            _declarations.pop_back();
        }
        --_depth;
    }

    // Text nodes that stand side by side are read as one, until something else comes.
    void addText(std::size_t size, const XMLPlace& place) {
        _textSize += size;
        requireSize(_textSize, "a text is larger than", place);
    }
    void endText() noexcept { _textSize = 0; }

    void requireSize(std::size_t size, std::string_view what, const XMLPlace& place) const {
        if (_reading != nullptr && size > _reading->maximumTextSize)
            refuseBeyond(what, _reading->maximumTextSize, place);
    }
    void requireDocument(std::size_t size, const XMLPlace& document) const;
    void countName(const String& name, const XMLPlace& place);
    void countURI(const String& URI, const XMLPlace& place);

private:
    // The namespace declarations of an open element that has some.
    struct Declarations {
        std::size_t depth;
        std::size_t count;
    };
    void enterLimited(const XMLPlace& element, std::size_t attributes, std::size_t declarations);
    void requireFewNames(const XMLPlace& place) const;

    const XMLParseOptions* _reading;
    std::size_t _depth = 0;
    std::size_t _textSize = 0;
    std::size_t _namespaces = 0; // in force
    std::vector<Declarations> _declarations;
    std::unordered_set<String> _names;
    std::unordered_set<String> _URIs;
};

} // namespace qx
