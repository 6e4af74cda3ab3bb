// Fields of one class, and of those that it extends, that are in each other's way.

#include "check/ClassFields.h"
#include "check/Rules.h"

#include <unordered_map>
#include <unordered_set>

namespace qx::detail {

namespace {

// Classes whose objects are flattened: their fields take one child of a name after the other.
std::unordered_set<const ClassPlan*> flattenedClasses(const MappingCheck& check) {
    std::unordered_set<const ClassPlan*> classes;
    for (const ClassPlan* type : check.classes())
        for (const FieldPlan& field : type->fields) {
            const bool isFlattened = field.kind == BindingKind::flattened && !field.isCollection();
            for (const ClassPlan* at = isFlattened ? field.typeClass : nullptr;
                 at != nullptr && classes.insert(at).second; at = at->parent) {
            }
        }
    return classes;
}

// The one place where the field is written, as a text to compare; empty where that depends on the
// value.
std::string placeOf(const FieldPlan& field) {
    if (field.bindings.empty())
        return {};
    const BindingPlan& binding = field.bindings.front();
    std::string_view name = binding.name;
    std::string_view location;
    char kind = 'e';
    if (field.isCollection()) {
        if (field.hasType())
            location = binding.location;
        if (field.typeClass != nullptr || !field.hasType())
            name = binding.bindTo;
        if (!field.hasType() && binding.classOfBindTo == nullptr)
            return {};
    } else if (field.kind == BindingKind::attribute) {
        kind = '@';
        location = binding.location;
    } else if (field.kind != BindingKind::element) {
        return {};
    }
    if (name.empty())
        return {};
    return std::string(1, kind) + std::string(location) + '/' + std::string(name);
}

const FindingText& textOf(const FieldPlan& a, const FieldPlan& b) {
    if (a.isCollection() || b.isCollection())
        return findings::sameItems;
    return a.kind == BindingKind::attribute ? findings::sameAttribute : findings::sameElement;
}

class ConflictCheck {
public:
    ConflictCheck(MappingCheck& check, const ClassPlan& type, bool isFlattened)
        : _check(check), _type(type), _isFlattened(isFlattened) {}

    // Those of ancestors first, so that what is told is told of the class's own field.
    void run() {
        const auto fields = fieldsAsRead(_type);
        for (const ClassField& inherited : fields)
            if (inherited.owner != &_type)
                see(inherited);
        for (const FieldPlan& own : _type.fields) {
            compare(own);
            see({&_type, &own});
        }
    }

private:
    void see(const ClassField& field) {
        _byKey.emplace(field.field->key.string(), field);
        if (std::string place = placeOf(*field.field); !place.empty())
            _byPlace.emplace(std::move(place), field);
    }
    void compare(const FieldPlan& own) {
        const Subject subject = Subject::of(*own.mapping);
        if (const auto other = _byKey.find(own.key.string()); other != _byKey.end())
            return _check.add(findings::fieldTwice, subject,
                              other->second.owner->mapping->className());
        const auto other = _byPlace.find(placeOf(own));
        if (other == _byPlace.end())
            return;
        const FieldPlan& field = *other->second.field;
        const FindingText& text = textOf(own, field);
        if (!_isFlattened || &text != &findings::sameElement)
            _check.add(text, subject, field.key.string());
    }

    MappingCheck& _check;
    const ClassPlan& _type;
    const bool _isFlattened;
    std::unordered_map<String, ClassField> _byKey;
    std::unordered_map<std::string, ClassField> _byPlace;
};

} // namespace

void checkConflicts(MappingCheck& check) {
    const auto flattened = flattenedClasses(check);
    for (const ClassPlan* type : check.classes())
        ConflictCheck(check, *type, flattened.contains(type)).run();
}

} // namespace qx::detail
