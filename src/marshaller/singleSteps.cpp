// The single steps of marshalling and unmarshalling as operations of their own: each finds the plan
// of the class or field it is given and hands over. A mapping that stands outside the marshaller's
// own, a copy for instance, gets a plan for the time of the call.

#include "marshaller/FieldBinding.h"
#include "model/Errors.h"

using qx::CountedSet;
using qx::Error;
using qx::IndexedXML;
using qx::Object;
using qx::Ref;
using qx::XMLElement;
using namespace qx::detail;

namespace {

template <class Plan>
class PlanOf {
public:
    template <class Mapping>
    PlanOf(const QXXMLMarshaller& marshaller, const Mapping& mapping) {
        const MappingPlan& all = MappingPlan::of(marshaller.mapping());
        _plan = all.planOf(mapping);
        if (_plan != nullptr)
            return;
        _own = all.newPlan(mapping);
        _plan = _own.get();
    }
    const Plan& operator*() const noexcept { return *_plan; }

private:
    std::unique_ptr<Plan> _own;
    const Plan* _plan;
};
using PlanOfClass = PlanOf<ClassPlan>;
using PlanOfField = PlanOf<FieldPlan>;

// What a step of its own binds from, and what it counts as consumed on top of the caller's sets.
class Step {
public:
    Step(QXXMLMarshaller& marshaller, XMLElement& element, std::size_t lookups, CountedSet& fields,
         CountedSet& attributes)
        : _document(&element, IndexedXML::Content::asNeeded),
          _unmarshalling(marshaller, _document, Unmarshalling::Use::steps),
          _source(_document, _document.root(), IndexedXML::Nodes::own, lookups), _fieldSet(fields),
          _attributeSet(attributes), _fields(fields), _attributes(attributes) {}

    // Calls bind(Unmarshalling&, const Unmarshalling::Target&).
    template <class Bind>
    bool run(Object& object, bool isFlattened, Ref<Error>* error, Bind bind) {
        const Ref<Object> held(&object);
        _unmarshalling.startWith(error);
        const Unmarshalling::Target target{object, _source, {_fields, _attributes}, isFlattened};
        bool bound = false;
        try {
            bound = bind(_unmarshalling, target);
        } catch (...) { // what a host's setter throws
            count();
            throw;
        }
        count();
        return bound;
    }

private:
    // In both sets, or in none where memory fails.
    void count() {
        _fields.addTo(_fieldSet);
        try {
            _attributes.addTo(_attributeSet);
        } catch (...) {
            _fields.takeFrom(_fieldSet);
            throw;
        }
    }

    IndexedXML _document;
    Unmarshalling _unmarshalling;
    ChildLookup _source;
    CountedSet& _fieldSet;
    CountedSet& _attributeSet;
    ConsumedNames _fields;
    ConsumedNames _attributes;
};

} // namespace

Ref<XMLElement> QXXMLMarshaller::marshallObject(const qx::Value& object, Ref<Error>* error) {
    const qx::Value held = object; // whatever the getters do to the caller's
    return Marshalling(*this).marshallObject(held, error).node;
}

Ref<XMLElement> QXXMLMarshaller::elementWithMapping(const QXXMLClassMapping& mapping,
                                                    Object& object, Ref<Error>* error) {
    const Ref<Object> held(&object);
    const PlanOfClass plan(*this, mapping);
    return Marshalling(*this).element(*plan, (*plan).elementName, &object, error).node;
}

bool QXXMLMarshaller::bindFieldMappings(const QXXMLClassMapping& mapping, XMLElement& element,
                                        Object& object, Ref<Error>* error) {
    const Ref<Object> held(&object);
    const WrittenElement target{Ref<XMLElement>(&element)};
    const PlanOfClass plan(*this, mapping);
    Marshalling writing(*this, element);
    const Marshalling::Opened opened(writing, writing.keptDeclarations(object));
    return writing.writeObject(*plan, target, object, error);
}

bool QXXMLMarshaller::mapField(const QXXMLFieldMapping& field, XMLElement& element, Object& object,
                               Ref<Error>* error) {
    const Ref<Object> held(&object);
    const WrittenElement target{Ref<XMLElement>(&element)};
    const PlanOfField plan(*this, field);
    return Marshalling(*this, element).writeField(*plan, target, object, error);
}

bool QXXMLMarshaller::mapArray(const qx::Array& array, XMLElement& element,
                               const QXXMLFieldMapping& field, Ref<Error>* error) {
    const Ref<const qx::Array> held(&array);
    const WrittenElement target{Ref<XMLElement>(&element)};
    const PlanOfField plan(*this, field);
    Marshalling writing(*this, element);
    return writeCollection(writing, *plan, target, array, error);
}

Ref<Object> QXXMLMarshaller::unmarshallElement(qx::XMLNode* element, Ref<Error>* error) {
    if (element != nullptr && !element->isElement() && !isLenient())
        return qx::fail(error, qx::errors::noDefinitionForElement, element);
    IndexedXML document(element != nullptr ? element->asElement() : nullptr,
                        IndexedXML::Content::atOnce);
    Unmarshalling reading(*this, document);
    reading.startWith(error);
    auto object = reading.unmarshallNode(document.root(), IndexedXML::Nodes::own, error);
    reading.locate(error, document.root());
    return object;
}

Ref<Object> QXXMLMarshaller::buildClassWithMapping(const QXXMLClassMapping& mapping,
                                                   XMLElement* element, bool isFlattened,
                                                   Ref<Error>* error) {
    if (element == nullptr)
        return nullptr;
    const PlanOfClass plan(*this, mapping);
    IndexedXML document(element, IndexedXML::Content::asNeeded);
    Unmarshalling reading(*this, document, Unmarshalling::Use::steps);
    reading.startWith(error);
    ChildLookup source(document, document.root(), IndexedXML::Nodes::own, (*plan).bindingCount);
    return reading.build(*plan, source, isFlattened, error);
}

Ref<Object> QXXMLMarshaller::allocateClassWithMapping(const QXXMLClassMapping& mapping,
                                                      Ref<Error>*) {
    const PlanOfClass plan(*this, mapping);
    IndexedXML nothing(nullptr, IndexedXML::Content::asNeeded);
    return Unmarshalling(*this, nothing, Unmarshalling::Use::steps).allocate(*plan);
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
    const PlanOfClass plan(*this, mapping);
    return Step(*this, element, (*plan).bindingCount, boundFields, boundAttributes)
        .run(object, isFlattened, error, [&](Unmarshalling& step, const auto& target) {
            return step.readFields(*plan, target, error);
        });
}

namespace {

// What the steps of a field are given.
struct FieldStep {
    QXXMLMarshaller& marshaller;
    const QXXMLFieldMapping& field;
    Object& object;
    XMLElement& element;
    CountedSet& boundFields;
    CountedSet& boundAttributes;
    bool isFlattened;
    Ref<Error>* error;

    // Calls read(Unmarshalling&, const FieldPlan&, const Unmarshalling::Target&, Ref<Error>*).
    template <class Read>
    bool run(Read read) const {
        const PlanOfField plan(marshaller, field);
        return Step(marshaller, element, (*plan).bindings.size(), boundFields, boundAttributes)
            .run(object, isFlattened, error, [&](Unmarshalling& reading, const auto& target) {
                return read(reading, *plan, target, error);
            });
    }
};

} // namespace

bool QXXMLMarshaller::bindField(const QXXMLFieldMapping& field, Object& object, std::size_t,
                                XMLElement& element, CountedSet& boundFields,
                                CountedSet& boundAttributes, bool isFlattened, Ref<Error>* error) {
    return FieldStep{*this,       field,           object,      element,
                     boundFields, boundAttributes, isFlattened, error}
        .run([](Unmarshalling& reading, const FieldPlan& plan, const auto& target,
                Ref<Error>* slot) { return reading.readField(plan, target, slot); });
}

bool QXXMLMarshaller::bindFieldAsAttribute(const QXXMLFieldMapping& field, Object& object,
                                           std::size_t, XMLElement& element,
                                           CountedSet& boundFields, CountedSet& boundAttributes,
                                           Ref<Error>* error) {
    return FieldStep{*this, field, object, element, boundFields, boundAttributes, false, error}.run(
        attributeBinding.read);
}

bool QXXMLMarshaller::bindFieldAsText(const QXXMLFieldMapping& field, Object& object, std::size_t,
                                      XMLElement& element, CountedSet& boundFields,
                                      CountedSet& boundAttributes, Ref<Error>* error) {
    return FieldStep{*this, field, object, element, boundFields, boundAttributes, false, error}.run(
        textBinding.read);
}

bool QXXMLMarshaller::bindFieldAsElement(const QXXMLFieldMapping& field, Object& object,
                                         std::size_t, XMLElement& element, CountedSet& boundFields,
                                         CountedSet& boundAttributes, bool isFlattened,
                                         Ref<Error>* error) {
    return FieldStep{*this,       field,           object,      element,
                     boundFields, boundAttributes, isFlattened, error}
        .run([](Unmarshalling& reading, const FieldPlan& plan, const auto& target,
                Ref<Error>* slot) {
            return bindingAsElement(plan).read(reading, plan, target, slot);
        });
}

bool QXXMLMarshaller::bindCollectionField(const QXXMLFieldMapping& field, Object& object,
                                          XMLElement& element, CountedSet& boundFields,
                                          CountedSet& boundAttributes, Ref<Error>* error) {
    return FieldStep{*this, field, object, element, boundFields, boundAttributes, false, error}.run(
        readCollection);
}

bool QXXMLMarshaller::bindArrayFieldByType(const QXXMLFieldMapping& field, Object& object,
                                           XMLElement& element, CountedSet& boundFields,
                                           CountedSet& boundAttributes, Ref<Error>* error) {
    return FieldStep{*this, field, object, element, boundFields, boundAttributes, false, error}.run(
        readCollectionByType);
}

bool QXXMLMarshaller::validateBoundFields(const CountedSet& boundFields,
                                          const CountedSet& boundAttributes, XMLElement& element,
                                          Object& object, Ref<Error>* error) {
    ConsumedNames fields(boundFields);
    ConsumedNames attributes(boundAttributes);
    IndexedXML document(&element, IndexedXML::Content::asNeeded);
    Unmarshalling reading(*this, document, Unmarshalling::Use::steps);
    reading.startWith(error);
    ChildLookup source(document, document.root(), IndexedXML::Nodes::own, 0);
    const Ref<Object> held(&object);
    return reading.validate(nullptr, {object, source, {fields, attributes}, false}, error);
}

bool TakeValueForKey(Object& object, qx::Key key, const qx::Value& value,
                     const QXXMLFieldMapping& field, Ref<Error>* error) {
    return takeValue(object, FieldPlan::withoutClasses(field), key, qx::Value(value), error);
}

qx::String StringValueOfObjectWithMapping(const qx::Value& value, const QXXMLFieldMapping& field) {
    return FieldText(value, FieldPlan::withoutClasses(field).valueType).string();
}
