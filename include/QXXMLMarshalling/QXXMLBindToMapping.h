#pragma once

// A "bind-xml" or "alt-xml" element of a field: where in the XML the field's value lives.
//
//     <bind-xml name="quantity" node="attribute" location="line"/>
//     <alt-xml name="qty"/>

#include <QXXMLMarshalling/QXXMLMapping.h>

class QXXMLClassMapping;

// The kind of node that a field binds to, as the "node" attribute says in any case.
enum QXXMLNodeType : std::uint32_t {
    QXXMLNodeTypeAttribute = 0, // "attribute"
    QXXMLNodeTypeElement = 1,   // "element"
    QXXMLNodeTypeText = 2,      // "text"
    QXXMLNodeTypeUnknown = 3    // any other word, and no word at all
};

class QX_API QXXMLBindToMapping final : public QXXMLMapping {
public:
    // Reads all attributes and the nested "class" of a "bind-xml". Null with the error of that
    // class mapping, or with
    //   -200  "Too many descriptions in element: %@"
    //   -213  "Too many class elements in element: %@"
    static qx::Ref<QXXMLBindToMapping> initWithXML(qx::XMLElement* element,
                                                   qx::Ref<qx::Error>* error = nullptr);
    // Reads "name" and "location" only, for an "alt-xml" (-200).
    static qx::Ref<QXXMLBindToMapping> initWithMinimalXML(qx::XMLElement* element,
                                                          qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLBindToMapping() override;

    // Attribute values as written; null when absent.
    const qx::String& bindTo() const noexcept { return _bindTo; } // "name"
    const qx::String& type() const noexcept { return _type; }
    const qx::String& node() const noexcept { return _node; }
    const qx::String& location() const noexcept { return _location; }
    const qx::String& references() const noexcept { return _references; }
    const qx::String& matches() const noexcept { return _matches; }
    const qx::String& qNamePrefix() const noexcept { return _qNamePrefix; } // "QName-prefix"
    const qx::String& autoNaming() const noexcept { return _autoNaming; }   // "auto-naming"
    // Always false: no attribute sets it.
    bool isReference() const noexcept { return _reference; }
    QXXMLNodeType nodeType() const;

    // The class mapping of the nested "class" element; null without one.
    qx::Ref<QXXMLClassMapping> childClassMapping() const;
    void setChildClassMapping(qx::Ref<QXXMLClassMapping> mapping);

    qx::String descriptionWithLocale(const qx::Object* locale, std::size_t indent) const override;

protected:
    bool initXML(qx::XMLElement& element, qx::Ref<qx::Error>* error) override;
    qx::Ref<QXXMLMapping> newInstance() const override;
    const qx::Class& describedClass() const override;

private:
    friend class QXXMLMapping;
    friend qx::Ref<QXXMLBindToMapping> qx::make<QXXMLBindToMapping>();
    friend qx::Ref<QXXMLBindToMapping> qx::make<QXXMLBindToMapping>(bool&&);

    explicit QXXMLBindToMapping(bool minimal = false) noexcept;

    qx::String _bindTo;
    qx::String _type;
    qx::String _node;
    qx::String _location;
    qx::String _references;
    qx::String _matches;
    qx::String _qNamePrefix;
    qx::String _autoNaming;
    qx::Ref<QXXMLClassMapping> _childClassMapping;
    bool _reference = false;
    bool _minimal; // made for an "alt-xml"
};
