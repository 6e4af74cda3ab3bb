#pragma once

// The root element of a mapping document, whatever its name: its classes, and the names of the
// documents that it includes.
//
//     <mapping>
//         <include href="common.xml"/>
//         <class name="Order"> … </class>
//     </mapping>

#include <QXXMLMarshalling/QXXMLClassMapping.h>

class QX_API QXXMLDocumentMapping final : public QXXMLMapping {
public:
    // Null with the error of the first class that fails, or with
    //   -200  "Too many descriptions in element: %@"
    static qx::Ref<QXXMLDocumentMapping> initWithXML(qx::XMLElement* root,
                                                     qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLDocumentMapping() override;

    // The "href" of each "include" that has one, in document order, as written.
    const std::vector<qx::String>& includes() const noexcept { return _includes; }
    // Where the "include" of that number in includes() stands.
    QXXMLMappingPlace includePlace(std::size_t index) const;
    // In document order, then those that were merged.
    const std::vector<qx::Ref<QXXMLClassMapping>>& classMappings() const noexcept {
        return _classMappings;
    }

    // Appends the other's class mappings, shared, without looking for duplicates. Its includes and
    // description stay behind.
    void mergeDocumentMapping(const QXXMLDocumentMapping* other);

    qx::String descriptionWithLocale(const qx::Object* locale, std::size_t indent) const override;

    // Appends a class mapping for each element; false at the first that fails. Part of initWithXML.
    bool processClasses(const std::vector<qx::XMLElement*>& elements,
                        qx::Ref<qx::Error>* error = nullptr);

protected:
    bool initXML(qx::XMLElement& element, qx::Ref<qx::Error>* error) override;
    qx::Ref<QXXMLMapping> newInstance() const override;
    const qx::Class& describedClass() const override;

private:
    friend class QXXMLMapping;
    friend class qx::detail::MappingSource;
    friend qx::Ref<QXXMLDocumentMapping> qx::make<QXXMLDocumentMapping>();

    QXXMLDocumentMapping() = default;

    std::vector<qx::Ref<QXXMLClassMapping>> _classMappings;
    std::vector<qx::String> _includes;
    std::vector<qx::Ref<qx::XMLElement>> _includeElements;
};
