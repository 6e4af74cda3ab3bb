#pragma once

// A "class" element of a mapping document: a class of the host's model, the element it maps to, and
// its fields.
//
//     <class name="Order" extends="Document">
//         <map-to xml="order" ns-uri="urn:example:orders" ns-prefix="o"/>
//         <field name="number"> … </field>
//     </class>

#include <QXXMLMarshalling/QXXMLFieldMapping.h>

class QX_API QXXMLClassMapping final : public QXXMLMapping {
public:
    // Null with the error of the first field that fails, or with
    //   -200  "Too many descriptions in element: %@"
    //   -201  "Too many map-to elements in element: %@"
    //   -202  "Required attribute: %@ not found in element: %@"   ("name")
    //   -203  "Boolean attribute: %@ has an illegal value: %@"
    static qx::Ref<QXXMLClassMapping> initWithXML(qx::XMLElement* element,
                                                  qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLClassMapping() override;

    // A new class mapping with the receiver's names and type, in a list of its own the receiver's
    // very fields (whose classMapping() stays the receiver), and the booleans and the description
    // of a new reading of the element. Null if that reading fails.
    qx::Ref<QXXMLMapping> copyWithZone() const override;

    // "name"; never null.
    const qx::String& className() const noexcept { return _className; }
    // The class name of the class that this one extends; null without one.
    const qx::String& extends() const noexcept { return _extends; }
    // "type": the class to create in place of className(); null without one.
    const qx::String& type() const noexcept { return _type; }
    // Of the "map-to" child; null where absent.
    const qx::String& mapTo() const noexcept { return _mapTo; } // "xml": the element's name
    const qx::String& nsURI() const noexcept { return _nsURI; }
    const qx::String& nsPrefix() const noexcept { return _nsPrefix; }
    bool isAutocomplete() const noexcept { return _autocomplete; } // "auto-complete"
    bool isSelfFirst() const noexcept { return _selfFirst; }       // "self-first"
    // In document order.
    const std::vector<qx::Ref<QXXMLFieldMapping>>& fields() const noexcept { return _fields; }
    // type() when it is not null, even if it is empty; else className().
    const qx::String& classNameToInstantiate() const noexcept {
        return _type.isNull() ? _className : _type;
    }
    // Changes the element name; meant for copies.
    void setMapTo(const qx::String& mapTo) { _mapTo = mapTo; }

    qx::String descriptionWithLocale(const qx::Object* locale, std::size_t indent) const override;

    // Appends a field for each element; false at the first that fails. Part of initWithXML.
    bool processFields(const std::vector<qx::XMLElement*>& elements,
                       qx::Ref<qx::Error>* error = nullptr);

protected:
    bool initXML(qx::XMLElement& element, qx::Ref<qx::Error>* error) override;
    qx::Ref<QXXMLMapping> newInstance() const override;
    const qx::Class& describedClass() const override;

private:
    friend class QXXMLMapping;
    friend qx::Ref<QXXMLClassMapping> qx::make<QXXMLClassMapping>();

    QXXMLClassMapping() = default;
    bool readFlag(qx::Key name, bool& flag, qx::Ref<qx::Error>* error);
    bool readMapTo(qx::Ref<qx::Error>* error);

    qx::String _className;
    qx::String _extends;
    qx::String _type;
    qx::String _mapTo;
    qx::String _nsURI;
    qx::String _nsPrefix;
    std::vector<qx::Ref<QXXMLFieldMapping>> _fields;
    bool _autocomplete = false;
    bool _selfFirst = false;
};
