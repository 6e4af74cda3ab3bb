#include "Watcher.h"

#include "Paths.h"

#include <ostream>

Watcher::Watcher(qx::Ref<qx::Object> root, std::ostream& out) : _root(std::move(root)), _out(out) {
    watch(_root);
}

void Watcher::watch(const qx::Value& value) {
    if (const auto array = value.as<qx::Array>()) {
        for (const qx::Value& item : *array)
            watch(item);
    } else if (const auto object = value.as<qx::Object>()) {
        for (const qx::Key key : keysOf(*object)) {
            watchKey(object, key);
            watch(object->valueForKey(key));
        }
    }
}

void Watcher::watchKey(const qx::Ref<qx::Object>& object, qx::Key key) {
    Watched& watched = _objects[object.get()];
    watched.object = object;
    const auto [entry, isNew] = watched.keys.try_emplace(key.identity());
    if (!isNew)
        return;
    entry->second = object->observe(key, [this, key](const qx::ValueChange& change) {
        if (change.newValue == change.oldValue) // set anew, or refused
            return;
        const std::string path = pathOf(change.object, _root);
        _out << "    " << path << (path.empty() ? "" : ".") << key.view() << ": "
             << shortText(change.oldValue) << " -> " << shortText(change.newValue) << '\n';
        watch(change.newValue);
    });
}

void Watcher::watchPath(const std::string& path) {
    _paths[path] = _root->observe(path, [this, path](const qx::ValueChange& change) {
        _out << "    * " << path << ": " << shortText(change.oldValue) << " -> "
             << shortText(change.newValue) << '\n';
    });
}
