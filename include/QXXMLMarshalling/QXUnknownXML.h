#pragma once

// What a struct or an object of a host's class keeps of its element beside its fields: child
// elements and attributes that no field took, and the namespaces that the element declares. It is a
// member like any other:
//
//     struct Order { std::string number; QXUnknownXML unknown; };
//     qx::Class::define<Order>("Order").members<&Order::number, &Order::unknown>();
//
// and stands for the keys "unboundChildren", "unboundAttributes" and "__namespaces". Unknown XML is
// written back where its owner is. Copies have nodes of their own.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>

class QX_API QXUnknownXML {
public:
    QXUnknownXML() noexcept = default;
    QXUnknownXML(const QXUnknownXML& other);
    QXUnknownXML(QXUnknownXML&&) noexcept = default;
    QXUnknownXML& operator=(QXUnknownXML other) noexcept;
    ~QXUnknownXML();

    bool isEmpty() const noexcept;
    // By name, arrays of the elements; null where there are none.
    const qx::Ref<qx::Dictionary>& children() const noexcept { return _children; }
    // Arrays of qx::XMLNode; null where there are none.
    const qx::Ref<qx::Array>& attributes() const noexcept { return _attributes; }
    const qx::Ref<qx::Array>& namespaces() const noexcept { return _namespaces; }

    // What the three may hold is a matter of whoever sets them.
    void setChildren(qx::Ref<qx::Dictionary> children) noexcept { _children = std::move(children); }
    void setAttributes(qx::Ref<qx::Array> attributes) noexcept {
        _attributes = std::move(attributes);
    }
    void setNamespaces(qx::Ref<qx::Array> namespaces) noexcept {
        _namespaces = std::move(namespaces);
    }

private:
    qx::Ref<qx::Dictionary> _children;
    qx::Ref<qx::Array> _attributes, _namespaces;
};

template <>
struct qx::detail::MemberKeys<QXUnknownXML> {
    static constexpr std::size_t count = 3;
    static constexpr const char* keys[count] = {"unboundChildren", "unboundAttributes",
                                                "__namespaces"};
    template <std::size_t I>
    static Value get(const QXUnknownXML& kept) {
        if constexpr (I == 0)
            return kept.children();
        else
            return I == 1 ? kept.attributes() : kept.namespaces();
    }
    template <std::size_t I>
    static bool set(QXUnknownXML& kept, const Value& value) {
        if constexpr (I == 0)
            return setAs<Dictionary, &QXUnknownXML::setChildren>(kept, value);
        else if constexpr (I == 1)
            return setAs<Array, &QXUnknownXML::setAttributes>(kept, value);
        else
            return setAs<Array, &QXUnknownXML::setNamespaces>(kept, value);
    }

private:
    template <class T, void (QXUnknownXML::*Setter)(Ref<T>)>
    static bool setAs(QXUnknownXML& kept, const Value& value) {
        auto object = value.as<T>();
        if (!object && !value.isNull())
            return false;
        (kept.*Setter)(std::move(object));
        return true;
    }
};
