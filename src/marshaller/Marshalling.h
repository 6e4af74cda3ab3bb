#pragma once

// One call of the marshaller: objects become elements, driven by the mapping's plan. It holds the
// marshaller, which a getter of the host's may let go of.
//
//     marshal.cpp       object -> element, the chain of ancestors, kept unknown XML and namespaces
//     mapFields.cpp     a field's value by node kind, arrays

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/LastChildren.h"
#include "marshaller/ObjectDoor.h"

class Marshalling {
public:
    using ErrorSlot = qx::Ref<qx::Error>*;

    explicit Marshalling(QXXMLMarshaller& marshaller);

    qx::Ref<qx::XMLElement> marshallObject(const qx::Value& object, ErrorSlot error);
    // `name` is the element's; an empty one gives the class's name as written.
    qx::Ref<qx::XMLElement> element(const ClassPlan& plan, const qx::String& name,
                                    const qx::Value& object, ErrorSlot error);
    bool bindFields(const ClassPlan& plan, qx::XMLElement& element, qx::Object& object,
                    ErrorSlot error);
    bool mapField(const FieldPlan& field, qx::XMLElement& element, qx::Object& object,
                  ErrorSlot error);
    bool mapArray(const FieldPlan& field, qx::XMLElement& element, const qx::Array& array,
                  ErrorSlot error);

    static qx::String text(const qx::Value& value, ValueType type);

private:
    // The class that the mapping has for the value; null for strings and numbers.
    const ClassPlan* classOf(const qx::Value& value) const;
    bool bindOwnFields(const ClassPlan& plan, qx::XMLElement& element, qx::Object& object,
                       ErrorSlot error);
    void restoreUnknownXML(qx::XMLElement& element, const qx::Object& object);
    void restoreNamespaces(qx::XMLElement& element, const qx::Object& object) const;

    bool mapAsAttribute(const FieldPlan& field, qx::XMLElement& element, const qx::Value& value);
    bool mapAsElement(const FieldPlan& field, qx::XMLElement& element, const qx::Value& value,
                      ErrorSlot error);
    bool mapAutomatically(const FieldPlan& field, qx::XMLElement& element, const qx::Value& value,
                          ErrorSlot error);
    qx::XMLElement* lastChildNamed(const qx::XMLElement& element, const qx::String& name);
    static qx::XMLElement& arrayTarget(const FieldPlan& field, qx::XMLElement& element);
    bool isToBeWritten(const qx::Value& item);

    const qx::Ref<const QXXMLMarshaller> _marshaller;
    const MappingPlan& _plan;
    const bool _saveUnknownXML;
    const bool _usingNamespaceURIs;
    ObjectDoor _door;
    std::size_t _depth = 0;
    // Of the elements in which names were looked up among many children.
    std::unordered_map<const qx::XMLElement*, LastChildren> _lastChildren;
};
