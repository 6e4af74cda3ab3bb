#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Session.h"

namespace qxxml {

std::string roundtrip(const Options& options) {
    const Session session(options);
    const auto marshaller = session.makeMarshaller();
    const auto object = session.readObject(*marshaller);
    qx::Ref<qx::Error> error;
    const auto document = marshaller->marshall(object, &error);
    if (!document)
        throw Failure(error, options.document);
    std::string text = document->XMLData(options.pretty ? qx::XMLPrettyPrint : qx::XMLNoOptions);
    if (!text.ends_with('\n'))
        text += '\n';
    return text;
}

} // namespace qxxml
