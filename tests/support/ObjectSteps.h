#pragma once

// Steps with objects, their keys and who observes them (support/Steps.h for how they are written):
//
//     make NAME CLASS [KEY VALUE]…    an object, by its name from here on
//     set NAME.KEY VALUE              a word, a number, null, <null> or an object
//     get NAME.KEY                    says the value
//     perform NAME MESSAGE VALUE…     says what comes back
//     observe NAME.PATH [CONTEXT [OPTION]…]
//     ignore NAME.PATH [CONTEXT]
//     change NAME.KEY                 the beginning of a change, which "changed" ends
//
// Observers say "CONTEXT: OLD > NEW", in the context "whole" all that they are told.

#include "support/Steps.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <charconv>

namespace support {

// Notes "context: old > new".
class Notebook : public qx::Object {
public:
    void observeValueForKeyPath(const qx::String& keyPath, Object* object,
                                const qx::Dictionary& change, qx::Selector context) override {
        seen = change.mutableCopy();
        notes.push_back((context.isNull() ? keyPath : qx::String(context.name())).str() + ": " +
                        change.get("old").description().str() + " > " +
                        change.get("new").description().str());
        if (then)
            then(*object);
    }
    std::vector<std::string> notes;
    qx::Ref<qx::Dictionary> seen;
    std::function<void(qx::Object&)> then;
};

class ObjectSteps : public Steps {
public:
    ObjectSteps() {
        notebook->then = [this](qx::Object&) {
            const std::string& note = notebook->notes.back();
            say(note.starts_with("whole:") ? oneLine(notebook->seen) : note);
        };
        know("make", [this](auto& words) { makeObject(words); });
        know("set", [this](auto& words) { set(words.at(0), value(words.at(1))); });
        know("get", [this](auto& words) {
            const auto [object, key] = place(words.at(0));
            sayValue(object->valueForKey(key));
        });
        know("perform", [this](auto& words) { performMessage(words); });
        know("observe", [this](auto& words) { observe(words); });
        know("ignore", [this](auto& words) {
            const auto [object, path] = place(words.at(0));
            if (words.size() > 1)
                object->removeObserver(notebook.get(), path, words[1].c_str());
            else
                object->removeObserver(notebook.get(), path);
        });
        know("change", [this](auto& words) {
            const auto [object, key] = place(words.at(0));
            scopes.push_back(std::make_unique<qx::ChangeScope>(*object, key));
        });
        know("changed", [this](auto&) { scopes.pop_back(); });
    }

protected:
    // The object and the key of "NAME.KEY".
    std::pair<qx::Object*, std::string> place(const std::string& text) const {
        const std::size_t dot = text.find('.');
        return {objects.at(text.substr(0, dot)).get(), text.substr(dot + 1)};
    }
    qx::Value value(const std::string& word) const {
        const auto object = objects.find(word);
        if (object != objects.end())
            return object->second;
        double number = 0;
        const auto end = word.data() + word.size();
        if (std::from_chars(word.data(), end, number).ptr == end && !word.empty())
            return word.find('.') == word.npos ? qx::Value(static_cast<int>(number)) : number;
        if (word == "<null>")
            return qx::Null::marker();
        return word == "null" ? qx::Value() : qx::Value(word);
    }
    void sayValue(const qx::Value& value) {
        const std::string text = value.isNull() ? "null" : oneLine(value);
        say(value.kind() == qx::Value::Kind::string ? '"' + text + '"' : text);
    }
    void set(const std::string& where, const qx::Value& value) const {
        const auto [object, key] = place(where);
        object->setValueForKey(value, key);
    }

    qx::Ref<Notebook> notebook = qx::make<Notebook>();
    std::map<std::string, qx::Ref<qx::Object>> objects;

private:
    void makeObject(const Arguments& words) {
        objects[words.at(0)] = qx::Class::named(words.at(1))->create();
        for (std::size_t i = 2; i < words.size(); i += 2)
            set(words[0] + "." + words[i], value(words.at(i + 1)));
    }
    void performMessage(const Arguments& words) {
        std::vector<qx::Value> arguments;
        for (std::size_t i = 2; i < words.size(); ++i)
            arguments.push_back(value(words[i]));
        const qx::Value result =
            objects.at(words.at(0))->performWithArguments(words.at(1).c_str(), arguments);
        if (!result.isNull())
            sayValue(result);
    }
    void observe(const Arguments& words) const {
        static const std::map<std::string, unsigned> known = {{"none", 0},
                                                              {"new", qx::Observing::newValue},
                                                              {"old", qx::Observing::oldValue},
                                                              {"initial", qx::Observing::initial},
                                                              {"prior", qx::Observing::prior}};
        const auto [object, path] = place(words.at(0));
        unsigned options = words.size() > 2 ? 0 : qx::Observing::newValue | qx::Observing::oldValue;
        for (std::size_t i = 2; i < words.size(); ++i)
            options |= known.at(words[i]);
        object->addObserver(notebook.get(), path, options,
                            words.size() > 1 ? words[1].c_str() : path.c_str());
    }

    std::vector<std::unique_ptr<qx::ChangeScope>> scopes;
};

} // namespace support
