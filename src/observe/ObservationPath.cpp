#include "observe/ObservationPath.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/CountedSet.h>

#include "model/ObjectExtras.h"

#include <unordered_map>

namespace qx {

namespace {

constexpr std::size_t mostValues = 1000000;

void addPaths(const Value& paths, std::vector<String>& result) {
    if (const auto array = paths.as<Array>()) {
        for (const Value& path : *array)
            result.push_back(path.string());
    } else if (const auto set = paths.as<CountedSet>()) {
        for (const String& path : set->names())
            result.push_back(path);
    }
}

// Of the operation "keyPathsForValuesAffecting" and the key with a capital.
void addPathsOfOperationFor(const Class& type, Key key, std::vector<String>& result) {
    if (key.view().empty())
        return;
    std::string name("keyPathsForValuesAffecting");
    name += key.view();
    char& first = name[name.size() - key.view().size()];
    if (first >= 'a' && first <= 'z')
        first = static_cast<char>(first - 'a' + 'A');
    // A class that has such an operation has interned its name.
    if (Key::existing(name).isNull())
        return;
    const Selector selector{std::string_view(name)};
    if (type.classOperation(selector) != nullptr)
        addPaths(type.perform(selector), result);
}

std::vector<String> pathsThatAffect(const Class& type, Key key) {
    static const Selector general("keyPathsForValuesAffectingValueForKey:");
    std::vector<String> result;
    if (type.classOperation(general) != nullptr)
        addPaths(type.perform(general, key.string()), result);
    addPathsOfOperationFor(type, key, result);
    std::erase_if(result,
                  [key](const String& path) { return path.isNull() || path == key.view(); });
    return result;
}

// A walk along the path, and along each path that a value met depends on. What is still to be
// walked is a list, so that chains of dependencies of any length need no stack. Everything met is
// kept alive: asking the objects runs foreign code.
class PathWalk {
public:
    std::vector<ObservedValue> walk(Object& root, Key keyPath) {
        follow(Ref<Object>(&root), keyPath.view(), true);
        while (!_open.empty()) {
            const Ref<Object> object = std::move(_open.back().first);
            const String path = std::move(_open.back().second);
            _open.pop_back();
            follow(object, path.view(), false);
        }
        return std::move(_values);
    }

private:
    // A key beside an object or a class.
    using Place = std::pair<const void*, Key>;
    struct HashOfPlace {
        std::size_t operator()(const Place& place) const noexcept {
            return std::hash<Key>()(place.second) * 31 + std::hash<const void*>()(place.first);
        }
    };

    void follow(Ref<Object> object, std::string_view path, bool isObserved) {
        for (;;) {
            const std::size_t dot = path.find('.');
            ObservedValue& value = _values[visit(object, path.substr(0, dot))];
            if (dot == std::string_view::npos) {
                value.endsPath = value.endsPath || isObserved;
                return;
            }
            path.remove_prefix(dot + 1);
            if (!value.leadsOn)
                value.value = valueOnPath(*object, value.key.view());
            value.leadsOn = true;
            object = Ref<Object>(objectLedTo(value.value));
            if (!object)
                return;
        }
    }

    // The place of the value. What it depends on is walked later, when it is met first.
    std::size_t visit(const Ref<Object>& object, Key key) {
        const auto [found, isNew] = _places.try_emplace({object.get(), key}, _values.size());
        if (!isNew)
            return found->second;
        const std::size_t place = _values.size();
        if (place == mostValues)
            throw Exception(Exception::internalInconsistency,
                            String::concat({"too many values to observe at key ", key.view(),
                                            " of class ", object->isa().name()}));
        _values.push_back({.object = object, .key = key});
        for (const String& path : dependenciesOf(object->isa(), key))
            _open.emplace_back(object, path);
        return place;
    }

    // A class is asked once for each key.
    const std::vector<String>& dependenciesOf(const Class& type, Key key) {
        const auto [found, isNew] = _dependencies.try_emplace({&type, key});
        if (isNew)
            found->second = pathsThatAffect(type, key);
        return found->second;
    }

    std::vector<ObservedValue> _values;
    std::unordered_map<Place, std::size_t, HashOfPlace> _places;
    std::unordered_map<Place, std::vector<String>, HashOfPlace> _dependencies;
    std::vector<std::pair<Ref<Object>, String>> _open;
};

} // namespace

std::vector<ObservedValue> valuesOnPath(Object& root, Key keyPath) {
    return PathWalk().walk(root, keyPath);
}

Value valueOnPath(const Object& object, std::string_view keyPath) {
    try {
        return object.valueForKeyPath(keyPath);
    } catch (const UndefinedKeyException&) {
        // A key that is announced by hand need not be readable.
        return {};
    }
}

Object* objectLedTo(const Value& value) noexcept {
    Object* object = value.isNullOrMarker() ? nullptr : value.object();
    return object != nullptr && !ObjectInternals::isEnding(*object) ? object : nullptr;
}

} // namespace qx
