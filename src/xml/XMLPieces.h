#pragma once

// Reads a document that need not fit into memory: it comes as a row of smaller documents, each with
// some of its items whole (XMLSplitter.h), and the elements around them, whose tags are repeated.
//
//     <a x="1"><i/><i>...     as     <a x="1"><i/></a>     <a x="1"><i>...</i></a>
//
// Each is parsed like any other document, so that its faults are those of the whole, at the same
// lines and columns. Items that end before a fault come before it.

#include "xml/XMLParser.h"
#include "xml/XMLSplitter.h"
#include "xml/XMLTextSource.h"

namespace qx {

class XMLPieces {
public:
    // The bytes must outlive the pieces.
    XMLPieces(ByteSource& bytes, const String& itemName, XMLSplitter::Match match,
              const XMLParseOptions& options)
        : _source(bytes), _splitter(itemName, match), _options(options) {}

    // The next piece; null at the end, with an error of the bytes or of parsing where that came too
    // early.
    XMLParser::Parsed next(Ref<Error>* error);
    // How many bytes were read for the pieces so far.
    std::uint64_t bytesRead() const noexcept { return _source.bytesRead(); }

private:
    enum class Found { cut, end, nothing };

    std::string_view text() const noexcept { return std::string_view(_text).substr(_start); }
    Found findCut();
    bool isWorthACut() const;
    bool isBeyondLimit() const noexcept;
    void readMore();
    XMLParser::Parsed parse(const XMLSplitter& before, Found found);
    XMLParser::Parsed parseUpToCut();
    bool cutBefore(std::size_t place, const XMLSplitter& before);
    void removeUpToCut();

    XMLTextSource _source;
    XMLSplitter _splitter;
    const XMLParseOptions _options;
    XMLParser::Kept _kept;
    std::string _text;
    std::size_t _start = 0;                 // of what has not been handed out
    std::string _opening;                   // goes before that
    TextOrigin _origin;                     // of that
    std::optional<ParseFailure> _undecoded; // at that place of _text, which ends there
    Ref<Error> _failure;                    // of the bytes
    bool _hasEnded = false;
};

} // namespace qx
