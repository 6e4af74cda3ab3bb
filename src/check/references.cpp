// What a mapping names: documents that it includes, types of fields, classes that others extend or
// that are flattened.

#include "check/Rules.h"

#include <algorithm>
#include <unordered_set>

namespace qx::detail {

namespace {

constexpr std::string_view simpleTypes[] = {"boolean", "integer", "int", "string"};

// Words of other languages, and what stands for them here.
constexpr std::pair<std::string_view, std::string_view> foreignTypes[] = {
    {"bool", "boolean"},     {"long", "integer"},    {"short", "integer"},  {"byte", "integer"},
    {"unsigned", "integer"}, {"int32", "integer"},   {"int64", "integer"},  {"uint", "integer"},
    {"double", "string"},    {"float", "string"},    {"decimal", "string"}, {"number", "integer"},
    {"date", "string"},      {"datetime", "string"}, {"text", "string"},    {"char", "string"},
};

String suggestedType(MappingCheck& check, const String& type) {
    const String lower = type.lowercased();
    for (const auto& [foreign, ours] : foreignTypes)
        if (lower == foreign)
            return ours;
    std::vector<std::string_view> names(std::begin(simpleTypes), std::end(simpleTypes));
    for (const ClassPlan* known : check.classes())
        names.push_back(known->mapping->className());
    return check.nearest(type, names);
}

void checkType(MappingCheck& check, const FieldPlan& field) {
    if (field.valueType != ValueType::other || field.typeClass != nullptr)
        return;
    const Subject subject = Subject::of(*field.mapping);
    const String& type = field.mapping->type();
    const bool isElement =
        field.kind == BindingKind::element || field.kind == BindingKind::flattened;
    const FindingText& text = field.isCollection() ? findings::unknownItemType
                              : isElement          ? findings::unknownElementType
                                                   : findings::unknownType;
    check.suggest(suggestedType(check, type), text, subject, type);
}

void checkExtends(MappingCheck& check, const ClassPlan& type) {
    const String& name = type.mapping->className();
    if (type.isOnCycle)
        check.add(findings::extendsItself, Subject::of(*type.mapping), name);
    else if (type.parent == nullptr && !type.mapping->extends().isEmpty())
        check.suggest(check.nearestClass(type.mapping->extends()), findings::unknownExtends,
                      Subject::of(*type.mapping), type.mapping->extends(), name);
}

// Marks the classes that are flattened into themselves: those on a ring of flattened fields, their
// ancestors' among them.
class FlattenedRings {
public:
    explicit FlattenedRings(const MappingCheck& check) : _states(check.plan().classCount()) {
        for (const ClassPlan* type : check.classes())
            visit(*type);
    }
    const std::vector<const ClassPlan*>& found() const noexcept { return _found; }

private:
    enum class State : std::uint8_t { unseen, open, done };
    struct Step {
        const ClassPlan* type;
        std::vector<const ClassPlan*> inner;
    };

    // With a stack of its own: mappings may chain as many classes as they like.
    void visit(const ClassPlan& start) {
        std::vector<Step> steps;
        open(start, steps);
        while (!steps.empty()) {
            Step& step = steps.back();
            if (step.inner.empty()) {
                state(*step.type) = State::done;
                steps.pop_back();
                continue;
            }
            const ClassPlan& next = *step.inner.back();
            step.inner.pop_back();
            if (state(next) == State::open)
                _found.push_back(&next);
            else
                open(next, steps);
        }
    }
    void open(const ClassPlan& type, std::vector<Step>& steps) {
        if (state(type) != State::unseen)
            return;
        state(type) = State::open;
        Step step{&type, {}};
        for (const FieldPlan& field : type.fields)
            if (field.kind == BindingKind::flattened && !field.isCollection() &&
                field.typeClass != nullptr)
                step.inner.push_back(field.typeClass);
        if (type.parent != nullptr && !type.isOnCycle)
            step.inner.push_back(type.parent);
        steps.push_back(std::move(step));
    }
    State& state(const ClassPlan& type) { return _states[type.index]; }

    std::vector<State> _states;
    std::vector<const ClassPlan*> _found;
};

} // namespace

void checkReferences(MappingCheck& check) {
    for (const IncludeLoader::Missing& missing : check.includes().missing()) {
        const QXXMLMappingPlace place = missing.includer->includePlace(missing.number);
        check.add(findings::includeNotFound,
                  {&MappingSource::of(*missing.includer), place.line, place.column},
                  missing.includer->includes()[missing.number]);
    }
    for (const ClassPlan* type : check.classes()) {
        checkExtends(check, *type);
        for (const FieldPlan& field : type->fields)
            checkType(check, field);
    }
    const FlattenedRings rings(check);
    for (const ClassPlan* type : rings.found())
        check.add(findings::flattenedIntoItself, Subject::of(*type->mapping),
                  type->mapping->className());
}

} // namespace qx::detail
