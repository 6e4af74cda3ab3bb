// Reads two documents under a mapping, of which it knows one.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Version.h>

#include <iostream>

static_assert(QXXMLMARSHALLING_VERSION == QXXMLMARSHALLING_VERSION_MAJOR * 10000 +
                                              QXXMLMARSHALLING_VERSION_MINOR * 100 +
                                              QXXMLMARSHALLING_VERSION_PATCH);

int main() {
    if (qx::libraryVersion() != QXXMLMARSHALLING_VERSION)
        std::cout << "the library is of another version\n";
    std::cout << qx::libraryVersionText() << '\n';
    const auto marshaller = QXXMLMarshaller::initWithMappingFile("mapping.xml");
    for (const char* document : {"order.xml", "invoice.xml"}) {
        const auto order = marshaller->readFile<QXGenericRecord>(document);
        if (order)
            std::cout << (*order)->valueForKey("number").description().view() << '\n';
        else
            std::cout << order.error()->localizedDescription().view() << '\n';
    }
}
