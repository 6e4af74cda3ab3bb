#include "xml/XMLParser.h"

#include "xml/SAXSession.h"
#include "xml/TextPosition.h"
#include "xml/XMLScanner.h"

namespace qx {

XMLParser::Parsed XMLParser::parse(Ref<const Data> data, const XMLParseOptions& options,
                                   Ref<Error>* error) {
    const std::string_view bytes = data->view();
    return run(bytes, std::move(data), options, error, Way::fastest);
}

XMLParser::Parsed XMLParser::parseCopy(XMLBytes bytes, const XMLParseOptions& options,
                                       Ref<Error>* error, Way way) {
    return run(bytes.view(), nullptr, options, error, way);
}

XMLParser::Parsed XMLParser::run(std::string_view bytes, Ref<const Data> owner,
                                 const XMLParseOptions& options, Ref<Error>* error, Way way) {
    const auto parsed = std::make_shared<ParsedDocument>();
    parsed->_owner = std::move(owner);
    XMLInput& input = parsed->_input;
    XMLIndex& index = parsed->_index;
    try {
        input.read(bytes, !parsed->_owner);
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
