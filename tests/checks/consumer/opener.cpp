// Uses so little of the library that a linker leaves most of a static one out.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <iostream>

int main() {
    qx::Ref<qx::Error> error;
    if (!qx::XMLDocument::initWithContentsOfFile("missing.xml", {}, &error))
        std::cout << error->localizedDescription().view() << '\n';
}
