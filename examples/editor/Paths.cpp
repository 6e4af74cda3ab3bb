#include "Paths.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>

#include <charconv>
#include <optional>
#include <stdexcept>

namespace {

// The number of an item, counted from 1, as an index; none for any other text.
std::optional<std::size_t> indexFrom(std::string_view text) {
    std::size_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size() || number == 0)
        return std::nullopt;
    return number - 1;
}

// "a.b.c" as "a.b" and "c".
std::pair<std::string, std::string> split(const std::string& path) {
    const std::size_t dot = path.rfind('.');
    if (dot == std::string::npos)
        return {"", path};
    return {path.substr(0, dot), path.substr(dot + 1)};
}

[[noreturn]] void fail(const std::string& path) {
    throw std::runtime_error("there is nothing at " + path);
}

std::string joined(const std::string& path, std::string_view step) {
    return path.empty() ? std::string(step) : path + "." + std::string(step);
}

// An empty text where the value does not hold the object. Documents are trees: the search ends.
std::string searched(const qx::Value& value, const qx::Object& object, const std::string& path) {
    if (value.object() == &object)
        return path;
    std::string found;
    if (const auto array = value.as<qx::Array>()) {
        for (std::size_t i = 0; i < array->count() && found.empty(); ++i)
            found = searched(array->at(i), object, joined(path, std::to_string(i + 1)));
    } else if (const auto holder = value.as<qx::Object>()) {
        for (const qx::Key key : keysOf(*holder))
            if (found.empty())
                found = searched(holder->valueForKey(key), object, joined(path, key.view()));
    }
    return found;
}

} // namespace

qx::Value valueAt(const qx::Ref<qx::Object>& root, const std::string& path) {
    if (path.empty())
        return root;
    const auto [rest, step] = split(path);
    const auto holder = valueAt(root, rest).as<qx::Object>();
    if (!holder)
        fail(path);
    const auto array = holder.as<qx::Array>();
    if (!array)
        return holder->valueForKey(step);
    const auto index = indexFrom(step);
    if (!index || *index >= array->count())
        fail(path);
    return array->at(*index);
}

Place placeAt(const qx::Ref<qx::Object>& root, const std::string& path) {
    const auto [rest, step] = split(path);
    auto holder = valueAt(root, rest).as<qx::Object>();
    if (!holder)
        fail(path);
    if (holder.as<qx::Array>())
        throw std::runtime_error(path + " is an item of a list");
    return {std::move(holder), step};
}

std::pair<std::string, std::size_t> listAndIndex(const qx::Ref<qx::Object>& root,
                                                 const std::string& path) {
    const auto [list, step] = split(path);
    const auto array = valueAt(root, list).as<qx::Array>();
    const auto index = indexFrom(step);
    if (!array || !index || *index >= array->count())
        fail(path);
    return {list, *index};
}

std::string pathOf(const qx::Object& object, const qx::Ref<qx::Object>& root) {
    if (root.get() == &object)
        return "";
    const std::string path = searched(root, object, "");
    return path.empty() ? "(gone)" : path;
}

std::vector<qx::Key> keysOf(const qx::Object& object) {
    std::vector<qx::Key> keys;
    if (const auto* record = dynamic_cast<const QXGenericRecord*>(&object)) {
        for (const qx::String& key : record->keys())
            keys.emplace_back(key);
    } else {
        for (const qx::Property& property : object.isa().ownProperties())
            keys.push_back(property.key);
    }
    std::erase_if(keys, [](qx::Key key) {
        return key == "unboundChildren" || key == "unboundAttributes" || key == "__namespaces";
    });
    return keys;
}

std::string shortText(const qx::Value& value) {
    if (value.isNullOrMarker())
        return "nothing";
    if (value.isString())
        return "\"" + value.string().str() + "\"";
    if (value.kind() == qx::Value::Kind::boolean)
        return value.boolValue() ? "true" : "false";
    if (const auto array = value.as<qx::Array>())
        return std::to_string(array->count()) + (array->count() == 1 ? " item" : " items");
    if (value.isObject())
        return "a " + value.object()->classNameForMarshalling().str();
    return value.description().str();
}
