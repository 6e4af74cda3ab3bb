// The single steps of marshalling and unmarshalling as operations of their own: each finds the plan
// of the class or field it is given and hands over. A mapping that stands outside the marshaller's
// own, a copy for instance, gets a plan for the time of the call.

#include "marshaller/Marshalling.h"
#include "marshaller/Unmarshalling.h"

using qx::CountedSet;
using qx::Error;
using qx::Object;
using qx::Ref;
using qx::XMLElement;

namespace {

class PlanOfClass {
public:
    PlanOfClass(const MappingPlan& plan, const QXXMLClassMapping& mapping)
        : _own(plan.classOf(mapping) == nullptr ? plan.planFor(mapping) : nullptr),
          _plan(_own ? *_own : *plan.classOf(mapping)) {}
    const ClassPlan& operator*() const noexcept { return _plan; }

private:
    std::unique_ptr<ClassPlan> _own;
    const ClassPlan& _plan;
};

class PlanOfField {
public:
    PlanOfField(const MappingPlan& plan, const QXXMLFieldMapping& mapping)
        : _own(plan.fieldOf(mapping) == nullptr ? plan.planFor(mapping) : FieldPlan()),
          _plan(plan.fieldOf(mapping) == nullptr ? _own : *plan.fieldOf(mapping)) {}
    const FieldPlan& operator*() const noexcept { return _plan; }

private:
    FieldPlan _own;
    const FieldPlan& _plan;
};

// The element that a step of its own binds from.
struct Source {
    Source(XMLElement& element, const FieldPlan& field)
        : source(element, nullptr, field.bindings.size()) {}
    Unmarshalling::Target target(Object& object, CountedSet& fields, CountedSet& attributes,
                                 bool isFlattened) {
        return {object, source, {fields, attributes}, isFlattened};
    }
    ElementSource source;
};

} // namespace

Ref<XMLElement> QXXMLMarshaller::marshallObject(const qx::Value& object, Ref<Error>* error) {
    return Marshalling(*this).marshallObject(object, error);
}

Ref<XMLElement> QXXMLMarshaller::elementWithMapping(const QXXMLClassMapping& mapping,
                                                    Object& object, Ref<Error>* error) {
    const PlanOfClass plan(this->plan(), mapping);
    return Marshalling(*this).element(*plan, (*plan).elementName, &object, error);
}

bool QXXMLMarshaller::bindFieldMappings(const QXXMLClassMapping& mapping, XMLElement& element,
                                        Object& object, Ref<Error>* error) {
    const PlanOfClass plan(this->plan(), mapping);
    return Marshalling(*this).bindFields(*plan, element, object, error);
}

bool QXXMLMarshaller::mapField(const QXXMLFieldMapping& field, XMLElement& element, Object& object,
                               Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    return Marshalling(*this).mapField(*plan, element, object, error);
}

bool QXXMLMarshaller::mapArray(const qx::Array& array, XMLElement& element,
                               const QXXMLFieldMapping& field, Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    return Marshalling(*this).mapArray(*plan, element, array, error);
}

Ref<Object> QXXMLMarshaller::unmarshallElement(qx::XMLNode* element, Ref<Error>* error) {
    return Unmarshalling(*this).unmarshallNode(element, nullptr, error);
}

Ref<Object> QXXMLMarshaller::buildClassWithMapping(const QXXMLClassMapping& mapping,
                                                   XMLElement* element, bool isFlattened,
                                                   Ref<Error>* error) {
    if (element == nullptr)
        return nullptr;
    const PlanOfClass plan(this->plan(), mapping);
    ElementSource source(*element, nullptr, (*plan).bindingCount);
    return Unmarshalling(*this, Unmarshalling::Use::steps).build(*plan, source, isFlattened, error);
}

Ref<Object> QXXMLMarshaller::allocateClassWithMapping(const QXXMLClassMapping& mapping,
                                                      Ref<Error>*) {
    const PlanOfClass plan(this->plan(), mapping);
    return Unmarshalling(*this, Unmarshalling::Use::steps).allocate(*plan);
}

bool QXXMLMarshaller::bindFieldsWithMapping(const QXXMLClassMapping& mapping, Object& object,
                                            XMLElement& element, bool isFlattened,
                                            Ref<Error>* error) {
    const auto boundFields = qx::make<CountedSet>();
    const auto boundAttributes = qx::make<CountedSet>();
    return bindFieldsWithMapping(mapping, object, element, *boundFields, *boundAttributes,
                                 isFlattened, error);
}

bool QXXMLMarshaller::bindFieldsWithMapping(const QXXMLClassMapping& mapping, Object& object,
                                            XMLElement& element, CountedSet& boundFields,
                                            CountedSet& boundAttributes, bool isFlattened,
                                            Ref<Error>* error) {
    const PlanOfClass plan(this->plan(), mapping);
    ElementSource source(element, nullptr, (*plan).bindingCount);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindFields(*plan, {object, source, {boundFields, boundAttributes}, isFlattened}, error);
}

bool QXXMLMarshaller::bindField(const QXXMLFieldMapping& field, Object& object, std::size_t,
                                XMLElement& element, CountedSet& boundFields,
                                CountedSet& boundAttributes, bool isFlattened, Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    Source source(element, *plan);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindField(*plan, source.target(object, boundFields, boundAttributes, isFlattened), error);
}

bool QXXMLMarshaller::bindFieldAsAttribute(const QXXMLFieldMapping& field, Object& object,
                                           std::size_t, XMLElement& element,
                                           CountedSet& boundFields, CountedSet& boundAttributes,
                                           Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    Source source(element, *plan);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindAsAttribute(*plan, source.target(object, boundFields, boundAttributes, false), error);
}

bool QXXMLMarshaller::bindFieldAsText(const QXXMLFieldMapping& field, Object& object, std::size_t,
                                      XMLElement& element, CountedSet& boundFields,
                                      CountedSet& boundAttributes, Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    Source source(element, *plan);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindAsText(*plan, source.target(object, boundFields, boundAttributes, false), error);
}

bool QXXMLMarshaller::bindFieldAsElement(const QXXMLFieldMapping& field, Object& object,
                                         std::size_t, XMLElement& element, CountedSet& boundFields,
                                         CountedSet& boundAttributes, bool isFlattened,
                                         Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    Source source(element, *plan);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindAsElement(*plan, source.target(object, boundFields, boundAttributes, isFlattened),
                       error);
}

bool QXXMLMarshaller::bindCollectionField(const QXXMLFieldMapping& field, Object& object,
                                          XMLElement& element, CountedSet& boundFields,
                                          CountedSet& boundAttributes, Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    Source source(element, *plan);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindCollection(*plan, source.target(object, boundFields, boundAttributes, false), error);
}

bool QXXMLMarshaller::bindArrayFieldByType(const QXXMLFieldMapping& field, Object& object,
                                           XMLElement& element, CountedSet& boundFields,
                                           CountedSet& boundAttributes, Ref<Error>* error) {
    const PlanOfField plan(this->plan(), field);
    Source source(element, *plan);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .bindArrayByType(*plan, source.target(object, boundFields, boundAttributes, false), error);
}

bool QXXMLMarshaller::validateBoundFields(const CountedSet& boundFields,
                                          const CountedSet& boundAttributes, XMLElement& element,
                                          Object& object, Ref<Error>* error) {
    const auto fields = boundFields.mutableCopy();
    const auto attributes = boundAttributes.mutableCopy();
    ElementSource source(element, nullptr, 0);
    return Unmarshalling(*this, Unmarshalling::Use::steps)
        .validate({object, source, {*fields, *attributes}, false}, error);
}

bool TakeValueForKey(Object& object, qx::Key key, const qx::Value& value,
                     const QXXMLFieldMapping& field, Ref<Error>* error) {
    return Unmarshalling::takeValue(object, MappingPlan::simplePlanFor(field), key, value, error);
}

qx::String StringValueOfObjectWithMapping(const qx::Value& value, const QXXMLFieldMapping& field) {
    return Marshalling::text(value, MappingPlan::simplePlanFor(field).valueType);
}
