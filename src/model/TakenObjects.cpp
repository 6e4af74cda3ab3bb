#include <QXXMLMarshalling/detail/TakenObjects.h>

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/TypeNames.h"

namespace qx::detail {

String namesOfTypes(std::span<const TakenType> types) {
    std::set<std::string> names;
    for (const TakenType& taken : types) {
        std::vector<const Class*> classes;
        if (taken.orDerived)
            classes = Class::derivedFrom(*taken.type);
        else if (const Class* described = Class::described(*taken.type))
            classes = {described};
        for (const Class* described : classes)
            names.insert(described->name().str());
        if (classes.empty())
            names.insert(readableName(*taken.type));
    }
    std::string joined;
    for (const std::string& name : names)
        joined += (joined.empty() ? "" : ", ") + name;
    return joined;
}

Value firstRefusedItem(const Value& list, Value (*firstRefused)(const Value& item)) {
    const auto array = list.as<Array>();
    if (!array)
        return list.isObject() ? list : Value();
    for (const Value& item : std::as_const(*array))
        if (Value refused = firstRefused(item); !refused.isNull())
            return refused;
    return {};
}

} // namespace qx::detail
