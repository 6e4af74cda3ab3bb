#include <QXXMLMarshalling/model/Data.h>

#include "model/LibraryClass.h"

namespace qx {

Data::Data(std::string bytes) noexcept : _bytes(std::move(bytes)) {}

Data::~Data() = default;

String Data::description() const {
    return String::concat({"<Data: ", std::to_string(size()), " bytes>"});
}

bool Data::isEqual(const Object& other) const {
    const auto* data = dynamic_cast<const Data*>(&other);
    return data != nullptr && data->view() == view();
}

const Class& Data::describedClass() const { return libraryClass<Data>("qx::Data"); }

} // namespace qx
