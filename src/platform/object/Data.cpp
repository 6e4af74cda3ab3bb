#include <QXXMLMarshalling/platform/Data.h>

#include "platform/object/LibraryClass.h"

namespace qx {

Data::Data(std::string bytes) noexcept
    : _own(std::move(bytes)), _bytes(_own.data()), _size(_own.size()) {}

Data::Data(const char* bytes, std::size_t size, void (*giveBack)(const char*, std::size_t)) noexcept
    : _bytes(bytes), _size(size), _giveBack(giveBack) {}

Data::~Data() {
    if (_giveBack != nullptr)
        _giveBack(_bytes, _size);
}

String Data::description() const {
    return String::concat({"<Data: ", std::to_string(_size), " bytes>"});
}

bool Data::isEqual(const Object& other) const {
    const auto* data = dynamic_cast<const Data*>(&other);
    return data != nullptr && data->view() == view();
}

const Class& Data::describedClass() const { return libraryClass<Data>("qx::Data"); }

} // namespace qx
