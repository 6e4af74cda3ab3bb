#include "Editor.h"

#include "Task.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Error.h>

#include <ostream>
#include <sstream>
#include <stdexcept>

struct Editor::Command {
    std::string line, name, path;
    std::string rest; // what stands behind the path
};

namespace {

void giveUndoManager(const qx::Value& value, const qx::Ref<qx::UndoManager>& manager) {
    if (const auto array = value.as<qx::Array>()) {
        for (const qx::Value& item : *array)
            giveUndoManager(item, manager);
    } else if (const auto object = value.as<qx::Object>()) {
        for (const qx::Key key : keysOf(*object))
            giveUndoManager(object->valueForKey(key), manager);
        if (object->respondsTo("setUndoManager:"))
            object->perform("setUndoManager:", manager);
    }
}

// What is typed has the kind of what stands there, if it can.
qx::Value valueFrom(const std::string& text, const qx::Value& former) {
    std::int64_t number = 0;
    bool truth = false;
    if (former.kind() == qx::Value::Kind::boolean && qx::ValueTraits<bool>::fromValue(text, truth))
        return truth;
    if (former.kind() == qx::Value::Kind::integer &&
        qx::ValueTraits<std::int64_t>::fromValue(text, number))
        return number;
    return text;
}

void print(std::ostream& out, const qx::Value& value, const std::string& label,
           const std::string& indent) {
    out << indent << label << shortText(value) << '\n';
    if (const auto array = value.as<qx::Array>()) {
        for (std::size_t i = 0; i < array->count(); ++i)
            print(out, array->at(i), std::to_string(i + 1) + ": ", indent + "    ");
    } else if (const auto object = value.as<qx::Object>()) {
        for (const qx::Key key : keysOf(*object))
            print(out, object->valueForKey(key), key.string().str() + ": ", indent + "    ");
    }
}

} // namespace

Editor::Editor(qx::Ref<QXXMLMarshaller> marshaller, qx::Ref<QXXMLDocumentFile> file,
               std::ostream& out)
    : _marshaller(std::move(marshaller)), _file(std::move(file)), _document(_file->root()),
      _out(out), _watcher(_document, out) {
    _file->setUndoManager(_undoManager);
    giveUndoManager(_document, _undoManager);
}

Editor::~Editor() { _undoManager->removeAllActions(); }

void Editor::perform(const std::string& line) {
    struct Entry {
        void (Editor::*call)(const Command&);
        bool isStep; // can be undone
    };
    static const std::map<std::string, Entry> commands = {
        {"show", {&Editor::show, false}},         {"set", {&Editor::set, true}},
        {"unset", {&Editor::unset, true}},        {"new", {&Editor::makeObject, true}},
        {"add", {&Editor::addItem, true}},        {"remove", {&Editor::removeItem, true}},
        {"finish", {&Editor::finish, true}},      {"begin", {&Editor::begin, false}},
        {"end", {&Editor::end, false}},           {"undo", {&Editor::undo, false}},
        {"redo", {&Editor::redo, false}},         {"watch", {&Editor::watch, false}},
        {"edited", {&Editor::tellEdited, false}}, {"save", {&Editor::save, false}},
    };
    Command command{line, {}, {}, {}};
    std::istringstream words(line);
    words >> command.name >> command.path;
    std::getline(words >> std::ws, command.rest);
    const auto found = commands.find(command.name);
    if (found == commands.end())
        throw std::runtime_error("there is no command " + command.name);
    // Between "begin" and "end" the group that is open, and its name, are for all commands.
    const auto [call, isStep] = found->second;
    const bool isAlone = isStep && _undoManager->groupingLevel() == 0;
    const qx::UndoGroup step(isAlone ? _undoManager.get() : nullptr, line);
    (this->*call)(command);
}

void Editor::show(const Command& command) {
    print(_out, valueAt(_document, command.path), "", "    ");
}

void Editor::assign(const Place& place, const qx::Value& value) {
    _watcher.watchKey(place.holder, place.key);
    place.holder->setValueForKey(value, place.key);
}

void Editor::set(const Command& command) {
    const Place place = placeAt(_document, command.path);
    assign(place, valueFrom(command.rest, place.value()));
}

void Editor::unset(const Command& command) { assign(placeAt(_document, command.path), nullptr); }

qx::Ref<qx::Object> Editor::newObject(const std::string& className) {
    qx::Ref<qx::Object> object;
    if (const qx::Class* type = qx::Class::named(className)) {
        object = type->create();
    } else {
        const auto record = qx::make<QXGenericRecord>();
        record->setClassNameForMarshalling(className);
        object = record;
    }
    giveUndoManager(object, _undoManager);
    return object;
}

void Editor::makeObject(const Command& command) {
    assign(placeAt(_document, command.path), newObject(command.rest));
}

// A list that changes is replaced: an array that is changed in place is not undone.
void Editor::addItem(const Command& command) {
    const Place place = placeAt(_document, command.path);
    const auto former = place.value().as<qx::Array>();
    const auto list = former ? former->mutableCopy() : qx::make<qx::Array>();
    list->add(newObject(command.rest));
    assign(place, list);
}

void Editor::removeItem(const Command& command) {
    const auto [path, index] = listAndIndex(_document, command.path);
    const Place place = placeAt(_document, path);
    const auto list = place.value().as<qx::Array>()->mutableCopy();
    list->remove(index);
    assign(place, list);
}

void Editor::finish(const Command& command) {
    const auto task = valueAt(_document, command.path).as<Task>();
    if (!task)
        throw std::runtime_error(command.path + " is no task");
    task->finish();
}

void Editor::begin(const Command& command) {
    _undoManager->beginUndoGrouping();
    _undoManager->setActionName(command.line.substr(command.line.find(' ') + 1));
}

void Editor::end(const Command&) { _undoManager->endUndoGrouping(); }

void Editor::undo(const Command&) {
    if (!_undoManager->canUndo())
        throw std::runtime_error("there is nothing to undo");
    _out << "    (takes back: " << _undoManager->undoActionName().view() << ")\n";
    _undoManager->undo();
}

void Editor::redo(const Command&) {
    if (!_undoManager->canRedo())
        throw std::runtime_error("there is nothing to redo");
    _out << "    (does again: " << _undoManager->redoActionName().view() << ")\n";
    _undoManager->redo();
}

void Editor::watch(const Command& command) { _watcher.watchPath(command.path); }

void Editor::tellEdited(const Command&) {
    _out << "    " << (_file->isEdited() ? "yes" : "no") << '\n';
}

void Editor::save(const Command& command) {
    qx::Ref<qx::Error> error;
    if (!_file->saveAs(command.path, &error))
        throw std::runtime_error(error->localizedDescription().str());
}
