#pragma once

// Interned names: property keys, class names and operation names. Two are equal exactly when they
// are the same pointer, they live for ever and their copies touch no count, so threads that share a
// mapping share no counter. The table behind them grows with the names that mappings and code use,
// never with what a data document holds.

#include <QXXMLMarshalling/base/String.h>

#include <functional>

namespace qx {

class Key;

namespace detail {
void markAsProperty(Key key) noexcept; // base/PropertyNames.h
} // namespace detail

// The name of a property. Made implicitly from text; keep one where a name is used often.
class QX_API Key {
public:
    Key() noexcept = default; // the null key
    Key(std::string_view name);
    Key(const char* name) : Key(std::string_view(name)) {}
    Key(const std::string& name) : Key(std::string_view(name)) {}
    // Null for the null string.
    Key(const String& name);

    // The key of this name if any code or mapping has used it, else the null key. Adds nothing.
    static Key existing(std::string_view name) noexcept;

    bool isNull() const noexcept { return _rep == nullptr; }
    std::string_view view() const noexcept { return string().view(); }
    String string() const noexcept { return String(_rep); }
    operator String() const noexcept { return string(); }
    const void* identity() const noexcept { return _rep; }

    // Whether any class has been described with a property of that name: most keys of records have
    // not, and need no look-up.
    bool namesProperty() const noexcept {
        return _rep != nullptr && (_rep->count.load(std::memory_order_relaxed) & propertyBit) != 0;
    }

    friend bool operator==(Key a, Key b) noexcept { return a._rep == b._rep; }
    // Same text, which does not become a key by that.
    template <std::same_as<String> Text>
    friend bool operator==(Key a, const Text& b) noexcept {
        return a.string() == b;
    }

private:
    friend void detail::markAsProperty(Key key) noexcept;

    static constexpr std::uint32_t propertyBit = String::propertyBit;

    String::Rep* _rep = nullptr;
};

// The name of an operation, such as "setParent:": one colon for each argument.
class QX_API Selector {
public:
    Selector() noexcept = default; // the null selector
    Selector(std::string_view name) : _name(name) {}
    Selector(const char* name) : _name(name) {}

    bool isNull() const noexcept { return _name.isNull(); }
    std::string_view name() const noexcept { return _name.view(); }
    String string() const noexcept { return _name.string(); }
    // How many colons the name holds.
    std::size_t argumentCount() const noexcept;
    const void* identity() const noexcept { return _name.identity(); }

    friend bool operator==(Selector a, Selector b) noexcept { return a._name == b._name; }

private:
    Key _name;
};

} // namespace qx

template <>
struct std::hash<qx::Key> {
    std::size_t operator()(qx::Key key) const noexcept {
        return std::hash<const void*>()(key.identity());
    }
};
template <>
struct std::hash<qx::Selector> {
    std::size_t operator()(qx::Selector selector) const noexcept {
        return std::hash<const void*>()(selector.identity());
    }
};
