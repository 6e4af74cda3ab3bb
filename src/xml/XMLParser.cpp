#include "xml/XMLParser.h"

#include "xml/SAXSession.h"
#include "xml/XMLInput.h"

namespace qx {

Ref<XMLDocument> XMLParser::parse(XMLBytes bytes, const XMLParseOptions& options,
                                  Ref<Error>* error) {
    XMLInput input;
    try {
        input.read(bytes);
        auto document = Ref<XMLDocument>::adopt(new XMLDocument);
        SAXSession(input.text(), *document, options).run();
        document->setCharacterEncoding(input.declaredEncoding());
        return document;
    } catch (const ParseFailure& failure) {
        if (error == nullptr)
            return nullptr;
        TextPosition place(input.text());
        place.moveTo(failure.offset);
        *error = make<Error>(Error::parserDomain, failure.code, failure.message, failure.reason,
                             place.line(), place.column());
        return nullptr;
    }
}

} // namespace qx
