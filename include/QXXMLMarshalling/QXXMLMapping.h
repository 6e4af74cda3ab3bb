#pragma once

// The base of the nodes that a mapping document is read into: document, class, field and bind-xml
// mappings. A node keeps the element it was made from, and the text of the one "description" child
// that any of them may have, and knows where it stands. Nodes are immutable once made (but for the
// back-references that are set while their parent is made) and may be read by several threads.

#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/xml/XMLElement.h>

#include <vector>

namespace qx::detail {
class MappingSource;
} // namespace qx::detail

// A place in a mapping document: that of an element's "<", 0:0 in a tree that was made by hand.
using QXXMLMappingPlace = qx::DocumentPlace;

class QX_API QXXMLMapping : public qx::Object {
public:
    // Null, with the first error below, when the element has two "description" children.
    //   -200  "Too many descriptions in element: %@"
    // Every kind of node can fail, besides, in a tree built by hand that nests mapping nodes more
    // than 1,024 deep (a parsed document is limited already):
    //   -223  "Objects nest deeper than the limit of %@: %@"   (the limit, the element's name)
    // A null element counts as one without attributes and children.
    static qx::Ref<QXXMLMapping> initWithXML(qx::XMLElement* element,
                                             qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLMapping() override;

    // A new node of the same class, made from the same element; null if that fails (the element
    // may have changed since).
    virtual qx::Ref<QXXMLMapping> copyWithZone() const;

    // The text of the "description" child, which may be empty; null without one.
    const qx::String& mappingDescription() const noexcept { return _mappingDescription; }

    // Where the node's element stands in its mapping document. The document's name is the path of
    // the file that it was read from, or its XMLDocument::documentName(); for an included document
    // that has neither, the name by which it was included.
    QXXMLMappingPlace place() const;
    // The "include" elements that led to the node's document, the nearest first. Empty for what
    // stands in the document that the mapping was made from.
    std::vector<QXXMLMappingPlace> includedFrom() const;

    // Class name and address, then each item that is present as " key: value"; nested lists follow
    // in the list format of qx::Array. The locale is not used.
    qx::String descriptionWithLocale(const qx::Object* locale, std::size_t indent) const override;
    qx::String description() const override;

    // Readers of one attribute. They fail for a required attribute that is absent:
    //   -202  "Required attribute: %@ not found in element: %@"
    // The string's result is null where the attribute is absent, and may be empty. A boolean is
    // "true" or "false" in any case and nothing else; its result holds the default on every
    // failure:
    //   -203  "Boolean attribute: %@ has an illegal value: %@"
    static bool extractStringAttribute(qx::Key name, const qx::XMLElement& element, bool required,
                                       qx::String& result, qx::Ref<qx::Error>* error = nullptr);
    static bool extractBooleanAttribute(qx::Key name, const qx::XMLElement& element, bool required,
                                        bool& result, qx::Ref<qx::Error>* error = nullptr);
    static bool extractBooleanAttribute(qx::Key name, const qx::XMLElement& element, bool required,
                                        bool& result, bool defaultValue,
                                        qx::Ref<qx::Error>* error = nullptr);

protected:
    QXXMLMapping();
    friend qx::Ref<QXXMLMapping> qx::make<QXXMLMapping>();
    friend class qx::detail::MappingSource;

    // Reads the element; false with the error set. Subclasses call their base's first.
    virtual bool initXML(qx::XMLElement& element, qx::Ref<qx::Error>* error);
    // An empty node of the receiver's own class, for copyWithZone. A subclass overrides it.
    virtual qx::Ref<QXXMLMapping> newInstance() const;
    const qx::Class& describedClass() const override;

    qx::XMLElement& element() const noexcept { return *_element; }

    // Whether reading goes on: the step succeeded, or all faults are collected and its error was
    // put to them.
    bool goesOn(bool succeeded, qx::Ref<qx::Error>* error) const;

    // Makes a T and reads the element into it: what the init… operations of subclasses are made of.
    template <class T, class... Arguments>
    static qx::Ref<T> initialized(qx::XMLElement* element, qx::Ref<qx::Error>* error,
                                  Arguments... arguments) {
        auto node = qx::make<T>(std::move(arguments)...);
        return node->readElement(element, error) ? node : nullptr;
    }

    // Adds " key: value" when the value is not empty.
    static void append(std::string& text, std::string_view key, const qx::String& value);
    // Adds " key:" and the list on lines of its own when it has an entry.
    static void append(std::string& text, std::string_view key, const qx::Object* locale,
                       std::size_t indent, std::vector<qx::Value> list);

private:
    bool readElement(qx::XMLElement* element, qx::Ref<qx::Error>* error);
    bool readElement(qx::XMLElement* element, qx::Ref<qx::Error>* error,
                     const qx::Ref<qx::detail::MappingSource>& source);

    qx::Ref<qx::XMLElement> _element;
    qx::Ref<qx::detail::MappingSource> _source; // shared by the nodes of a document
    qx::String _mappingDescription;
};
