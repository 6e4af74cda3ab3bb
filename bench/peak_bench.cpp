// The peak memory of reading orders: whole documents, and one order after another.

#include "Orders.h"
#include "Peak.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <istream>

namespace {

using namespace bench;

qx::Ref<QXXMLMarshaller> marshaller() {
    const auto mapping = qx::XMLDocument::initWithData(orderMapping);
    return QXXMLMarshaller::initWithMappingXML(mapping.get());
}

bool readRecords(std::size_t bytes) {
    const OrdersFile file(bytes);
    return marshaller()->readFile(file.path()).get() != nullptr;
}

bool readStructs(std::size_t bytes) {
    const OrdersFile file(bytes);
    const Described described;
    return marshaller()->readFile<Orders>(file.path()).hasValue();
}

template <class T>
bool readEach(std::size_t bytes) {
    GeneratedOrders orders(bytes);
    std::istream stream(&orders);
    return marshaller()->unmarshallEach<T>(stream, "order", [](const auto&) {});
}
bool readEachStruct(std::size_t bytes) {
    const Described described;
    return readEach<Order>(bytes);
}

const PeakWork records("records", readRecords, {60});
const PeakWork structs("structs", readStructs, {60});
const PeakWork eachRecord("eachRecord", readEach<qx::Object>, {60, 600});
const PeakWork eachStruct("eachStruct", readEachStruct, {60, 600});

} // namespace
