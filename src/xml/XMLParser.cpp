#include "xml/XMLParser.h"

#include "model/ErrorDetails.h"
#include "xml/SAXSession.h"

namespace qx {

XMLParser::Parsed XMLParser::parse(Ref<const Data> data, const XMLParseOptions& options,
                                   Ref<Error>* error, Kept* kept) {
    const std::string_view bytes = data->view();
    return run(bytes, std::move(data), options, error, kept, Way::fastest);
}

XMLParser::Parsed XMLParser::parseCopy(XMLBytes bytes, const XMLParseOptions& options,
                                       Ref<Error>* error, Kept* kept, Way way) {
    return run(bytes.view(), nullptr, options, error, kept, way);
}

XMLParser::Parsed XMLParser::run(std::string_view bytes, Ref<const Data> owner,
                                 const XMLParseOptions& options, Ref<Error>* error, Kept* kept,
                                 Way way) {
    const auto parsed = std::make_shared<ParsedDocument>();
    parsed->_owner = std::move(owner);
    XMLInput& input = parsed->_input;
    try {
        input.read(bytes, !parsed->_owner);
        parsed->_index = XMLIndex(input.text());
        fill(parsed->_index, options, kept, way);
        return parsed;
    } catch (const ParseFailure& failure) {
        if (error != nullptr)
            *error = errorOf(failure, input.text());
        return nullptr;
    }
}

XMLParser::Parsed XMLParser::parsePiece(std::string text, const TextOrigin& origin,
                                        const XMLParseOptions& options, Kept* kept) {
    const auto parsed = std::make_shared<ParsedDocument>();
    parsed->_input.take(std::move(text));
    parsed->_index = XMLIndex(parsed->_input.text(), origin);
    fill(parsed->_index, options, kept, Way::fastest);
    return parsed;
}

void XMLParser::fill(XMLIndex& index, const XMLParseOptions& options, Kept* kept, Way way) {
    if (way == Way::cParserOnly || !XMLScanner::scan(index, options, kept))
        SAXSession(index, options).run();
}

Ref<Error> XMLParser::errorOf(const ParseFailure& failure, std::string_view text,
                              const TextOrigin& origin) {
    TextPosition place(text, origin);
    place.moveTo(failure.offset);
    detail::SourcePlace source;
    source.place.line = place.line();
    source.place.column = place.column();
    if (!failure.isOfEncoding()) // what was decoded is not what was meant
        detail::setExcerpt(source, text, failure.offset, origin.added);
    auto error = make<Error>(*failure.text, failure.arguments, failure.code, Error::parserDomain);
    detail::ErrorDetails::setContext(
        *error, std::make_unique<detail::KnownContext>(std::move(source), detail::MappingNote(),
                                                       failure.suggestion()));
    return error;
}

} // namespace qx
