#pragma once

// Faults of the caller, as opposed to failures that an operation reports in its error slot: an
// unknown key, null for a scalar, an operation that nobody answers, a collection changed while it
// is walked, a node added twice. The reason names class, key and value.

#include <QXXMLMarshalling/base/Key.h>

#include <exception>

namespace qx {

class QX_API Exception : public std::exception {
public:
    Exception(const char* name, std::string_view reason);
    ~Exception() override;

    // One of the names below.
    const char* name() const noexcept { return _name; }
    std::string_view reason() const noexcept { return _reason; }
    // The name, a colon and the reason.
    const char* what() const noexcept override { return _what.c_str(); }

    static constexpr const char* undefinedKey = "NSUndefinedKeyException";
    static constexpr const char* invalidArgument = "NSInvalidArgumentException";
    static constexpr const char* internalInconsistency = "NSInternalInconsistencyException";
    static constexpr const char* generic = "NSGenericException";
    static constexpr const char* range = "NSRangeException";

private:
    const char* _name;
    String _reason;
    String _what;
};

// A key that an object's class does not have.
class QX_API UndefinedKeyException : public Exception {
public:
    // `receiver` is only compared, never followed.
    UndefinedKeyException(const void* receiver, Key key, std::string_view reason);
    ~UndefinedKeyException() override;
    bool concerns(const void* receiver, Key key) const noexcept {
        return receiver == _receiver && key == _key;
    }

private:
    const void* _receiver;
    Key _key;
};

} // namespace qx
