#include "qxxml/Commands.h"
#include "qxxml/Json.h"
#include "qxxml/Output.h"
#include "qxxml/Session.h"

namespace qxxml {

std::string read(const Options& options) {
    const Session session(options);
    const auto marshaller = session.makeMarshaller();
    return textOf(jsonOf(session.readObject(*marshaller))) + "\n";
}

std::string readEach(const Options& options) {
    const Session session(options);
    const auto marshaller = session.makeMarshaller();
    session.readEach(*marshaller, options.each, [](const qx::Ref<qx::Object>& object) {
        print(lineOf(jsonOf(object)) + "\n");
    });
    return {};
}

} // namespace qxxml
