#include "repository/NameLookUp.h"

#include <utility>

namespace qx::detail {

namespace {

thread_local NameLookUp* current = nullptr;

} // namespace

NameLookUp::NameLookUp() noexcept : _outer(std::exchange(current, this)) {}

NameLookUp::~NameLookUp() { current = _outer; }

void NameLookUp::leave(const QXXMLDataRepository& repository, const String& name,
                       const String& path) {
    if (current == nullptr)
        return;
    current->_repository = &repository;
    current->_name = name;
    current->_path = path;
}

String NameLookUp::take(const QXXMLDataRepository& repository, const String& name) {
    const bool isThere =
        current != nullptr && current->_repository == &repository && current->_name == name;
    return isThere ? std::exchange(current->_path, nullptr) : String();
}

} // namespace qx::detail
