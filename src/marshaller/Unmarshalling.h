#pragma once

// One call of the unmarshaller: elements become objects, driven by the mapping's plan. How a field
// is read is told by its kind of binding (FieldBinding.h); what no field consumed is looked at in
// validate.cpp.
//
// Error slots are handed along as they come: a step reports only to a caller who passed one, and
// collections behave differently without.
//
// Between any two steps stands the code of host classes, which may change the document and the
// marshaller, or let go of them. So the call holds both, whoever binds an element holds it (or sees
// to it in OpenCollections), and the options are read where they count.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ChildLookup.h"
#include "marshaller/CollectionItems.h"
#include "marshaller/ConsumedNames.h"
#include "marshaller/ObjectAccess.h"
#include "plan/MappingPlan.h"

namespace qx::detail {

class Unmarshalling {
public:
    using ErrorSlot = Ref<Error>*;

    // What the fields of one element consumed.
    struct Bound {
        ConsumedNames& fields;
        ConsumedNames& attributes;
    };
    // The object that is being bound, and where from.
    struct Target {
        Object& object;
        ChildLookup& source;
        Bound bound;
        bool isFlattened;
    };

    // Of a whole document's unmarshalling the counts of consumed names are its own affair; in
    // single steps they are the caller's, and left as they are by the validation.
    enum class Use : std::uint8_t { document, steps };
    // `root` is the element that all is read from; null for none.
    Unmarshalling(QXXMLMarshaller& marshaller, XMLElement* root, Use use = Use::document);

    // `copies` are those of the lookup in which the node was found.
    Ref<Object> unmarshallNode(XMLNode* node, KeptCopies* copies, ErrorSlot error);
    // `source` may be shared with the object that this one is flattened into.
    Ref<Object> build(const ClassPlan& plan, ChildLookup& source, bool isFlattened,
                      ErrorSlot error);
    Ref<Object> build(const ClassPlan& plan, XMLElement& element, KeptCopies* copies,
                      ErrorSlot error);
    Ref<Object> allocate(const ClassPlan& plan);
    // The fields of the class and its ancestors, and what no field consumed.
    bool readFields(const ClassPlan& plan, const Target& target, ErrorSlot error);
    // True unless it failed: also when there was nothing to bind.
    bool readField(const FieldPlan& field, const Target& target, ErrorSlot error);
    // `plan` is the class whose fields were bound, null where they were bound one by one.
    bool validate(const ClassPlan* plan, const Target& target, ErrorSlot error);

    // What the kinds of binding ask for.
    const MappingPlan& plan() const noexcept { return _plan; }
    ReadingBudget& budget() noexcept { return _budget; }
    OpenCollections& openCollections() noexcept { return _collections; }
    // Tells the item of the object that is to hold it, which comes before that one gets it. False
    // when the item does not take such a parent.
    bool adopt(Object& item, Object& parent, ErrorSlot error);

private:
    // An object that is being bound, and those whose binding led to it.
    struct Frame {
        const ClassPlan* plan;
        const XMLElement* element;
        const Frame* parent;
        std::size_t depth;
    };
    class LentNames;

    bool isBeingBound(const ClassPlan& plan, const XMLElement& element) const;
    bool mayBuild(const ClassPlan& plan, const ChildLookup& source, ErrorSlot error);
    bool keepNamespaces(const Target& target, ErrorSlot error);
    static bool hasBoundAllChildren(const ClassPlan& plan, const Target& target);
    bool validateChildren(const Target& target, ErrorSlot error);
    bool keepChildren(const Target& target, const CountedSet& names, ErrorSlot error);
    bool validateAttributes(const Target& target, ErrorSlot error);
    bool keepAttributes(const Target& target, const CountedSet& names, ErrorSlot error);

    const Ref<QXXMLMarshaller> _marshaller;
    const Ref<XMLElement> _root;
    const MappingPlan& _plan;
    const Use _use;
    ReadingBudget _budget;
    ObjectAccess _access;
    std::vector<const Class*> _classes; // by plan index, looked up once
    std::vector<bool> _classKnown;
    const Frame* _frame = nullptr;
    OpenCollections _collections;
    // A pool of consumed names; the first few are lent to the objects that are being bound.
    std::vector<std::unique_ptr<ConsumedNames>> _names;
    std::size_t _namesLent = 0;
};

} // namespace qx::detail
