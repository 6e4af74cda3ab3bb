#pragma once

// One call of the unmarshaller: elements become objects, driven by the mapping's plan. The steps
// stand in files of their own:
//
//     unmarshal.cpp         element -> object, the chain of ancestors, the dispatch by node kind
//     bindValues.cpp        fields from attributes and text
//     bindElements.cpp      fields from child elements, flattened objects
//     bindCollections.cpp   fields from many child elements
//     validate.cpp          what no field consumed
//
// Error slots are handed along as they come: a step reports only to a caller who passed one, and
// collections behave differently without.
//
// Between any two steps stands the code of host classes, which may change the document and the
// marshaller, or let go of them. So the call holds both, whoever binds an element holds it (or sees
// to it in hostActs), and the options are read where they count.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ElementSource.h"
#include "marshaller/NameCounts.h"
#include "marshaller/ObjectDoor.h"
#include "plan/MappingPlan.h"

class Unmarshalling {
public:
    using ErrorSlot = qx::Ref<qx::Error>*;

    // What the fields of one element consumed.
    struct Bound {
        NameCounts& fields;
        NameCounts& attributes;
    };
    // The object that is being bound, and where from.
    struct Target {
        qx::Object& object;
        ElementSource& source;
        Bound bound;
        bool isFlattened;
    };

    // Of a whole document's unmarshalling the counts of consumed names are its own affair; in
    // single steps they are the caller's, and left as they are by the validation.
    enum class Use : std::uint8_t { document, steps };
    // `root` is the element that all is read from; null for none.
    Unmarshalling(QXXMLMarshaller& marshaller, qx::XMLElement* root, Use use = Use::document);

    qx::Ref<qx::Object> unmarshallNode(qx::XMLNode* node, CopyScope* scope, ErrorSlot error);
    // `source` may be shared with the object that this one is flattened into.
    qx::Ref<qx::Object> build(const ClassPlan& plan, ElementSource& source, bool isFlattened,
                              ErrorSlot error);
    qx::Ref<qx::Object> build(const ClassPlan& plan, qx::XMLElement& element, CopyScope* scope,
                              ErrorSlot error);
    qx::Ref<qx::Object> allocate(const ClassPlan& plan);
    bool bindFields(const ClassPlan& plan, const Target& target, ErrorSlot error);
    bool bindField(const FieldPlan& field, const Target& target, ErrorSlot error);

    bool bindAsAttribute(const FieldPlan& field, const Target& target, ErrorSlot error);
    bool bindAsText(const FieldPlan& field, const Target& target, ErrorSlot error);
    static bool takeValue(qx::Object& object, const FieldPlan& field, qx::Key key, qx::Value value,
                          ErrorSlot error);

    bool bindAsElement(const FieldPlan& field, const Target& target, ErrorSlot error);
    bool bindCollection(const FieldPlan& field, const Target& target, ErrorSlot error);
    bool bindArrayByType(const FieldPlan& field, const Target& target, ErrorSlot error);

    // `plan` is the class whose fields were bound, null where they were bound one by one.
    bool validate(const ClassPlan* plan, const Target& target, ErrorSlot error);

private:
    // An object that is being bound, and those whose binding led to it.
    struct Frame {
        const ClassPlan* plan;
        const qx::XMLElement* element;
        const Frame* parent;
        std::size_t depth;
    };
    class Items;

    // To be called before any code of the host's may run.
    void hostActs();
    bool isBeingBound(const ClassPlan& plan, const qx::XMLElement& element) const;
    bool mayBuild(const ClassPlan& plan, const ElementSource& source, ErrorSlot error);
    bool keepNamespaces(const Target& target, ErrorSlot error);
    bool findElement(const FieldPlan& field, const Target& target, qx::XMLElement*& child,
                     const BindingPlan*& binding, ErrorSlot error);
    qx::Value elementValue(const FieldPlan& field, const Target& target, qx::XMLElement& child,
                           const ClassPlan* classOfElement, ErrorSlot error);
    qx::Value flattenedValue(const FieldPlan& field, const Target& target, ErrorSlot error);
    bool findItems(const FieldPlan& field, const Target& target, Items& items, ErrorSlot error);
    bool findItemsByType(const FieldPlan& field, const Target& target, Items& items,
                         ErrorSlot error);
    template <class Make>
    bool bindItems(const FieldPlan& field, const Target& target, Items& items, ErrorSlot error,
                   Make make);
    bool endsAfter(ErrorSlot error) const {
        return (error != nullptr && *error) || _budget.isSpent();
    }
    bool adopt(qx::Object& item, qx::Object& parent, ErrorSlot error);
    static bool hasBoundAllChildren(const ClassPlan& plan, const Target& target);
    bool validateChildren(const Target& target, ErrorSlot error);
    bool keepChildren(const Target& target, const qx::CountedSet& names, ErrorSlot error);
    bool validateAttributes(const Target& target, ErrorSlot error);
    bool keepAttributes(const Target& target, const qx::CountedSet& names, ErrorSlot error);

    const qx::Ref<QXXMLMarshaller> _marshaller;
    const qx::Ref<qx::XMLElement> _root;
    const MappingPlan& _plan;
    const Use _use;
    ReadingBudget _budget;
    ObjectDoor _door;
    std::vector<const qx::Class*> _classes; // by plan index, looked up once
    std::vector<bool> _classKnown;
    const Frame* _frame = nullptr;
    Items* _items = nullptr; // of the innermost collection that is being bound
    bool _hostActs;          // whether any code of the host's may have run
    // Counts of consumed names; the first few are lent to the objects that are being bound.
    std::vector<std::unique_ptr<NameCounts>> _counts;
    std::size_t _countsLent = 0;
    class SpareCounts;
};
