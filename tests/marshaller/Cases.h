#pragma once

// What the blocks of a page say of a marshaller (see support/Cases.h for pages):
//
//     xml mapping      a <mapping>, or the classes in one
//     text prefixes    the table of namespaces, one PREFIX=URI a line
//     xml document     what is read, and of what comes is written again
//     text given       an object, shown as the next, that is written; nothing is read then
//     text object      what reading gives
//     xml written      what is written
//     text error       "CODE: message (reason)" of the mapping, of reading or of writing; the
//                      reason may be left out
//     text place       where it is: "LINE:COLUMN PATH" in the document, or the path from the object
//                      that was to be written, then a line each for
//                      "by LINE:COLUMN FIELD of CLASS" in the mapping, as far as that is known, and
//                      for the suggestion
//
// What is read is also read into an object that is there.
//
// Options are "strict", "discard", "exactly", "no-namespaces" and "by-namespace" (of the class
// mappings), and "given" where nothing is read although the page has shown a document. Each case
// runs on records, on host classes and on plain structs; where they differ, a block says for which
// it is: "records", "hosts", "structs".

#include "ObjectKinds.h"
#include "support/Cases.h"
#include "support/Show.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/model/Array.h>

#include <algorithm>
#include <charconv>
#include <sstream>

namespace cases {

using support::Expectation;

// Makes the object that support::show() prints as a text.
class Maker {
public:
    explicit Maker(std::string_view text) : _rest(text) {}

    qx::Value value() {
        if (takes('"')) {
            const std::string text = upTo("\"");
            _rest.remove_prefix(1);
            return text;
        }
        if (takes('[')) {
            const auto array = qx::make<qx::Array>();
            while (!takes(']'))
                array->add(value());
            return array;
        }
        const std::string word = upTo(":{,]} \n");
        if (takes('{'))
            return object(word);
        if (word == "null" || word == "true" || word == "false")
            return word == "null" ? qx::Value() : qx::Value(word == "true");
        double number = 0;
        std::from_chars(word.data(), word.data() + word.size(), number);
        return word.find('.') == std::string::npos ? qx::Value(static_cast<int>(number)) : number;
    }

private:
    qx::Value object(const std::string& className) {
        const qx::Class* const type = qx::Class::named(className);
        const auto record = type == nullptr ? qx::make<QXGenericRecord>() : nullptr;
        const qx::Ref<qx::Object> object = record ? record : type->create();
        if (record)
            record->setClassNameForMarshalling(className);
        while (!takes('}')) {
            const std::string key = upTo(":");
            takes(':');
            object->setValueForKey(value(), key);
        }
        return object;
    }
    // Passes over the character where it is the next, and what separates it from others.
    bool takes(char c) {
        _rest.remove_prefix(std::min(_rest.find_first_not_of(", \n"), _rest.size()));
        const bool isNext = _rest.starts_with(c);
        _rest.remove_prefix(isNext ? 1 : 0);
        return isNext;
    }
    std::string upTo(const char* ends) {
        const std::string_view text = _rest.substr(0, _rest.find_first_of(ends));
        _rest.remove_prefix(text.size());
        return std::string(text);
    }

    std::string_view _rest;
};

// Whatever an object holds, reading a document into it makes it what reading makes of the document.
inline void checkReload(QXXMLMarshaller& marshaller, const std::string& source) {
    const qx::Ref<qx::Object> held = marshaller.readString(source);
    const std::string root = qx::XMLDocument::initWithData(source)->rootElement()->name().str();
    for (const std::string& text : {source, "<" + root + "/>", source}) {
        qx::Ref<qx::Error> error, errorInto;
        const std::string before = support::show(held);
        const auto fresh = marshaller.readString(text, &error);
        EXPECT_EQ(marshaller.readStringInto(held, text, &errorInto), fresh.get() != nullptr);
        EXPECT_EQ(support::told(errorInto), support::told(error));
        EXPECT_EQ(support::show(held), fresh ? support::show(fresh) : before);
    }
}

struct Result {
    std::string object, written, error = "no error\n", errorWithoutReason, place = "no error\n";
};

// A tree does not know where its attributes stand.
inline std::string placeOf(const qx::Error& error, bool isTree) {
    const auto told = [](const qx::DocumentPlace& place) {
        return std::to_string(place.line) + ":" + std::to_string(place.column);
    };
    const std::string path = error.path().str();
    const bool isKnown = !isTree || path.find('@') == std::string::npos;
    const std::string place = isKnown ? told(error.place()) : "?";
    std::string text = (place != "0:0" ? place + " " : "") + path + "\n";
    if (!error.mappingClass().isNull())
        text += "by " + told(error.mappingPlace()) +
                (error.mappingField().isNull() ? "" : " " + error.mappingField().str()) + " of " +
                error.mappingClass().str() + "\n";
    if (!error.suggestion().isNull())
        text += error.suggestion().str() + "\n";
    return text;
}

constexpr const char* declaration = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

inline QXXMLMarshaller::NamespacePrefixes
prefixesOf(const std::map<std::string, std::string>& given) {
    const auto text = given.find("prefixes");
    std::istringstream lines(text != given.end() ? text->second : "");
    QXXMLMarshaller::NamespacePrefixes prefixes;
    for (std::string prefix, URI; std::getline(lines, prefix, '=') && std::getline(lines, URI);)
        prefixes.emplace(URI, prefix);
    return prefixes;
}

// What comes of a case. A document is read as a text, or as a tree. What is written is a tree, and
// the same as a text without one.
inline Result run(const Expectation& expectation, qx::XMLDocument& mapping, bool isTree) {
    const auto& [kind, text, options, given] = expectation;
    Result result;
    qx::Ref<qx::Error> error;
    const auto marshaller = QXXMLMarshaller::initWithMappingXML(&mapping, &error);
    if (marshaller && marshaller->setNamespacePrefixes(prefixesOf(given), &error) &&
        marshaller->setMatchesNamespaces(options.contains("by-namespace"), &error)) {
        marshaller->setLenient(!options.contains("strict"));
        marshaller->setSaveUnknownXML(!options.contains("discard"));
        marshaller->setKeepsExactly(options.contains("exactly"));
        marshaller->setUsingNamespaceURIs(!options.contains("no-namespaces"));
        const auto source = options.contains("given") ? given.end() : given.find("document");
        const bool isRead = source != given.end();
        const auto document =
            isTree && isRead ? qx::XMLDocument::initWithData(source->second) : nullptr;
        const qx::Value object = !isRead    ? Maker(given.at("given")).value()
                                 : document ? qx::Value(marshaller->unmarshall(document, &error))
                                            : marshaller->readString(source->second, &error);
        EXPECT_FALSE(!object.isNull() && error) << "both an object and an error";
        result.object = support::show(object);
        if (isRead && !error && object.isObject())
            checkReload(*marshaller, source->second);
        const auto element = error ? nullptr : marshaller->marshallObject(object, &error);
        EXPECT_FALSE(element && error) << "both an element and an error";
        result.written = element ? element->XMLString(qx::XMLPrettyPrint).str() + "\n" : "";
        qx::Ref<qx::Error> problem;
        const qx::String untreed =
            object.isNull() ? qx::String() : marshaller->writeString(object, &problem);
        EXPECT_EQ(untreed.str(), element ? std::string(declaration) + result.written : "")
            << "written without a tree: " << support::told(problem);
        EXPECT_TRUE(element || object.isNull() || support::told(problem) == support::told(error));
    }
    if (error) {
        result.place = placeOf(*error, isTree);
        result.error = support::told(error) + "\n";
        result.errorWithoutReason =
            std::to_string(error->code()) + ": " + error->localizedDescription().str() + "\n";
    }
    return result;
}

// Compares what comes with the block, on that kind of object.
inline void checkOn(kinds::Kind kind, const Expectation& expectation) {
    static const support::Words known = {"strict",        "discard",      "exactly",
                                         "no-namespaces", "by-namespace", "records",
                                         "hosts",         "structs",      "given"};
    for (const std::string& option : expectation.options)
        EXPECT_TRUE(known.contains(option)) << option << " is no option";
    const auto isFor = [&](const char* name) { return expectation.options.contains(name); };
    if (std::ranges::any_of(kinds::names, isFor) && !isFor(kinds::names[kind]))
        return;
    const std::string& text = expectation.given.at("mapping");
    const auto mapping =
        support::parsed(text.starts_with("<mapping") ? text : "<mapping>" + text + "</mapping>");
    const kinds::Defined classes(kind, *mapping->rootElement());
    for (const bool isTree : {false, true}) {
        SCOPED_TRACE(std::string("on ") + kinds::names[kind] +
                     (isTree ? ", from a tree" : ", from a text"));
        const Result result = run(expectation, *mapping, isTree);
        if (expectation.kind == "object") {
            EXPECT_EQ(support::withoutLayout(result.object),
                      support::withoutLayout(expectation.text))
                << result.error;
        } else if (expectation.kind == "written") {
            EXPECT_EQ(result.written, expectation.text) << result.error;
        } else if (expectation.kind == "place") {
            const std::string& place = expectation.text;
            const bool isHidden = isTree && place.find('@') < place.find('\n');
            EXPECT_EQ(result.place, isHidden ? "?" + place.substr(place.find(' ')) : place)
                << result.error;
        } else if (expectation.text != result.errorWithoutReason) {
            EXPECT_EQ(result.error, expectation.text);
        }
    }
}

inline bool addPage(const std::string& page, std::vector<kinds::Kind> on) {
    return support::addCases(page, {"mapping", "prefixes", "document", "given"},
                             {"object", "written", "error", "place"},
                             [=](const Expectation& expectation) {
                                 for (const kinds::Kind kind : on)
                                     checkOn(kind, expectation);
                             });
}

} // namespace cases
