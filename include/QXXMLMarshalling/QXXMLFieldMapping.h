#pragma once

// A "field" element of a class mapping: one property, and where in the XML its value lives.
//
//     <field name="lines" type="Line" collection="array">
//         <bind-xml name="line" node="element" location="lines"/>
//     </field>

#include <QXXMLMarshalling/QXXMLBindToMapping.h>
#include <QXXMLMarshalling/model/WeakRef.h>

class QXXMLClassMapping;

class QX_API QXXMLFieldMapping final : public QXXMLMapping {
public:
    // Null with the error of a "bind-xml" or "alt-xml" child, or with
    //   -200  "Too many descriptions in element: %@"
    //   -202  "Required attribute: %@ not found in element: %@"   ("name")
    //   -203  "Boolean attribute: %@ has an illegal value: %@"
    //   -204  "Too many bind-xml elements in element: %@"
    //   -219  "alt-xml defined with no bind-xml elements in element: %@"
    static qx::Ref<QXXMLFieldMapping> initWithXML(qx::XMLElement* element,
                                                  qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLFieldMapping() override;

    // The key of the property; never null.
    const qx::String& name() const noexcept { return _name; }
    // Attribute values as written; null when absent.
    const qx::String& type() const noexcept { return _type; }
    const qx::String& handler() const noexcept { return _handler; }
    const qx::String& getMethod() const noexcept { return _getMethod; }       // "get-method"
    const qx::String& setMethod() const noexcept { return _setMethod; }       // "set-method"
    const qx::String& createMethod() const noexcept { return _createMethod; } // "create-method"
    const qx::String& collection() const noexcept { return _collection; }

    // Booleans; all are false by default but "container".
    bool isRequired() const noexcept { return hasFlag(Flag::required); }
    bool isDirect() const noexcept { return hasFlag(Flag::direct); }
    bool isLazy() const noexcept { return hasFlag(Flag::lazy); }
    bool isTransient() const noexcept { return hasFlag(Flag::transient); }
    bool isContainer() const noexcept { return hasFlag(Flag::container); }

    // The "bind-xml"; null without one.
    QXXMLBindToMapping* bindToMapping() const noexcept { return _bindToMapping.get(); }
    // The "bind-xml" and then each "alt-xml"; empty without a "bind-xml".
    const std::vector<qx::Ref<QXXMLBindToMapping>>& bindToMappings() const noexcept {
        return _bindToMappings;
    }

    // Those of the "bind-xml"; without one null strings, and QXXMLNodeTypeAttribute.
    qx::String bindTo() const;
    qx::String node() const;
    QXXMLNodeType nodeType() const;
    qx::String location() const;

    // The class mapping that holds this field; null once it is gone.
    qx::Ref<QXXMLClassMapping> classMapping() const;
    void setClassMapping(QXXMLClassMapping* mapping);

    qx::String descriptionWithLocale(const qx::Object* locale, std::size_t indent) const override;

    // Appends a binding for each "alt-xml"; false at the first that fails. Part of initWithXML.
    bool processAlternateBindTos(const std::vector<qx::XMLElement*>& elements,
                                 qx::Ref<qx::Error>* error = nullptr);

protected:
    bool initXML(qx::XMLElement& element, qx::Ref<qx::Error>* error) override;
    qx::Ref<QXXMLMapping> newInstance() const override;
    const qx::Class& describedClass() const override;

private:
    friend class QXXMLMapping;
    friend qx::Ref<QXXMLFieldMapping> qx::make<QXXMLFieldMapping>();

    enum class Flag : std::uint32_t {
        required = 1U << 0,
        direct = 1U << 1,
        lazy = 1U << 2,
        transient = 1U << 3,
        container = 1U << 4
    };

    QXXMLFieldMapping() = default;
    bool hasFlag(Flag flag) const noexcept {
        return (_flags & static_cast<std::uint32_t>(flag)) != 0;
    }
    bool readFlag(qx::Key name, Flag flag, bool defaultValue, qx::Ref<qx::Error>* error);
    bool readBindings(qx::Ref<qx::Error>* error);

    qx::String _name;
    qx::String _type;
    qx::String _handler;
    qx::String _getMethod;
    qx::String _setMethod;
    qx::String _createMethod;
    qx::String _collection;
    std::uint32_t _flags = 0;
    qx::Ref<QXXMLBindToMapping> _bindToMapping;
    std::vector<qx::Ref<QXXMLBindToMapping>> _bindToMappings;
    qx::WeakRef<QXXMLClassMapping> _classMapping;
};
