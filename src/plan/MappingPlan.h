#pragma once

// What a resolved mapping means for marshalling and unmarshalling, worked out once. A plan is
// immutable and lives as long as its mapping, so threads share it. Everything in it is found
// without a look-up by name, but for the elements of a document and the class names of objects.

#include <QXXMLMarshalling/QXXMLDocumentMapping.h>

#include "plan/ClassPlan.h"

#include <memory>
#include <unordered_map>

class QXXMLMarshallingMapping;

namespace qx::detail {

class IncludeLoader;

class MappingPlan {
public:
    // That of the mapping; of a null one a plan without classes.
    static const MappingPlan& of(const QXXMLMarshallingMapping* mapping);
    // What the mapping was made of.
    static const IncludeLoader& includesOf(const QXXMLMarshallingMapping& mapping);
    // The classes of the document are to have names of their own.
    explicit MappingPlan(const QXXMLDocumentMapping& document);
    MappingPlan(const MappingPlan&) = delete;
    MappingPlan& operator=(const MappingPlan&) = delete;

    // Null where no class has that name, no class maps to that element.
    const ClassPlan* classNamed(const String& className) const {
        return find(_byClassName, className);
    }
    const ClassPlan* classForElement(const String& elementName) const {
        return find(_byElementName, elementName);
    }
    // The plan of a class or a field that stands in the mapping; null for any other, a copy too.
    const ClassPlan* planOf(const QXXMLClassMapping& mapping) const;
    const FieldPlan* planOf(const QXXMLFieldMapping& mapping) const;

    std::size_t classCount() const noexcept { return _classes.size(); }

    // The plan of a class or a field that stands in no mapping, as one of this mapping.
    std::unique_ptr<ClassPlan> newPlan(const QXXMLClassMapping& mapping) const;
    std::unique_ptr<FieldPlan> newPlan(const QXXMLFieldMapping& mapping) const;

    // The name under which documents give an element of the class: "map-to", or the class name in
    // lower case.
    static String elementNameOf(const QXXMLClassMapping& mapping);

private:
    static const ClassPlan* find(const std::unordered_map<String, const ClassPlan*>& plans,
                                 const String& name) {
        const auto found = plans.find(name);
        return found != plans.end() ? found->second : nullptr;
    }
    void fill(ClassPlan& plan) const;
    FieldPlan planFor(const QXXMLFieldMapping& mapping) const;
    void markCycles();

    std::vector<std::unique_ptr<ClassPlan>> _classes;
    std::unordered_map<String, const ClassPlan*> _byClassName;
    std::unordered_map<String, const ClassPlan*> _byElementName;
    std::unordered_map<const QXXMLFieldMapping*, const FieldPlan*> _fields;
};

} // namespace qx::detail
