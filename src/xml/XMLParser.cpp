#include "xml/XMLParser.h"

#include "xml/SAXSession.h"
#include "xml/TextPosition.h"
#include "xml/XMLScanner.h"

namespace qx {

XMLParser::Parsed XMLParser::parseLent(XMLBytes bytes, const XMLParseOptions& options,
                                       Ref<Error>* error) {
    return run(bytes, Text::lent, options, error, Way::fastest);
}

XMLParser::Parsed XMLParser::parse(Ref<const Data> data, const XMLParseOptions& options,
                                   Ref<Error>* error) {
    const auto parsed = run(*data, Text::lent, options, error, Way::fastest);
    if (parsed)
        parsed->_owner = std::move(data);
    return parsed;
}

XMLParser::Parsed XMLParser::parseCopy(XMLBytes bytes, const XMLParseOptions& options,
                                       Ref<Error>* error, Way way) {
    return run(bytes, Text::copied, options, error, way);
}

std::shared_ptr<ParsedDocument> XMLParser::run(XMLBytes bytes, Text text,
                                               const XMLParseOptions& options, Ref<Error>* error,
                                               Way way) {
    auto parsed = std::make_shared<ParsedDocument>();
    XMLInput& input = parsed->_input;
    XMLIndex& index = parsed->_index;
    try {
        input.read(bytes, text == Text::copied);
        index = XMLIndex(input.text());
        if (way == Way::cParserOnly || !XMLScanner::scan(index, options))
            SAXSession(index, options).run();
        return parsed;
    } catch (const ParseFailure& failure) {
        if (error == nullptr)
            return nullptr;
        TextPosition place(input.text());
        place.moveTo(failure.offset);
        *error = make<Error>(Error::parserDomain, *failure.text, failure.code, failure.arguments,
                             place.line(), place.column());
        return nullptr;
    }
}

} // namespace qx
