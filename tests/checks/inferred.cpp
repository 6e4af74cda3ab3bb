// Reads a document into the structs that `qxxml infer --classes` printed for it, and writes them.
//
// usage: inferred MAPPING DOCUMENT OUTPUT

#include INFERRED

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <iostream>

namespace {

int fail(const qx::Ref<qx::Error>& error) {
    std::cerr << error->localizedDescription().view() << '\n';
    return 1;
}

} // namespace

int main(int, char** arguments) {
    describeClasses();
    qx::Ref<qx::Error> error;
    const auto marshaller = QXXMLMarshaller::initWithMappingFile(arguments[1], &error);
    if (!marshaller)
        return fail(error);
    const auto root = marshaller->readFile<ROOT>(arguments[2]);
    if (!root)
        return fail(root.error());
    return marshaller->writeFile(*root, arguments[3], &error) ? 0 : fail(error);
}
