#include "qxxml/Commands.h"
#include "qxxml/Json.h"
#include "qxxml/Session.h"

namespace qxxml {

std::string read(const Options& options) {
    const Session session(options);
    const auto marshaller = session.makeMarshaller();
    return textOf(jsonOf(session.readObject(*marshaller))) + "\n";
}

} // namespace qxxml
