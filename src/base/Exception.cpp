#include <QXXMLMarshalling/base/Exception.h>

namespace qx {

Exception::Exception(const char* name, std::string_view reason)
    : _name(name), _reason(reason), _what(String::concat({name, ": ", reason})) {}

Exception::~Exception() = default;

UndefinedKeyException::UndefinedKeyException(const void* receiver, Key key, std::string_view reason)
    : Exception(undefinedKey, reason), _receiver(receiver), _key(key) {}

UndefinedKeyException::~UndefinedKeyException() = default;

} // namespace qx
