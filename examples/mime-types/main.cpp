// Reads the MIME database that the package shared-mime-info installs and tells what it got, then
// writes it and reads it again.
//
//     example_mime_types [--records] DATABASE [TYPE | FILE NAME]…
//
// Types and their patterns are objects of this program's own classes, all else are records. With
// --records the classes are not described, and everything is a record under the same mapping.

#include "MimeType.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/model/Error.h>

#include <iostream>

namespace {

using Marshaller = qx::Ref<QXXMLMarshaller>;

// What is printed is read by key, so that it is the same for host objects and for records.

std::vector<qx::Ref<qx::Object>> itemsOf(const qx::Object& object, qx::Key key) {
    std::vector<qx::Ref<qx::Object>> items;
    if (const auto array = object.valueForKey(key).as<qx::Array>())
        for (const qx::Value& item : *array)
            items.push_back(item.as<qx::Object>());
    return items;
}

std::string textOf(const qx::Object& object, qx::Key key) {
    return object.valueForKey(key).string().str();
}

void printAll(const char* label, const qx::Object& type, qx::Key key, qx::Key itemKey) {
    const auto items = itemsOf(type, key);
    if (items.empty())
        return;
    std::cout << label;
    for (const auto& item : items)
        std::cout << ' ' << textOf(*item, itemKey);
    std::cout << '\n';
}

void printComments(const qx::Object& type) {
    static constexpr std::string_view languages[] = {"", "de", "fr", "ja", "pt_BR", "uk"};
    const auto comments = itemsOf(type, "comments");
    for (const std::string_view language : languages)
        for (const auto& comment : comments)
            if (textOf(*comment, "language") == language)
                std::cout << "    comment" << (language.empty() ? "" : ", ") << language << ": "
                          << textOf(*comment, "text") << '\n';
    std::cout << "    comments in " << comments.size() << " languages\n";
}

void printMatches(const qx::Object& holder, const std::string& indent) {
    for (const auto& match : itemsOf(holder, "matches")) {
        std::cout << indent << textOf(*match, "type") << " at " << textOf(*match, "offset") << ": "
                  << textOf(*match, "value") << '\n';
        printMatches(*match, indent + "    ");
    }
}

void printType(const qx::Object& type) {
    std::cout << '\n'
              << textOf(type, "name") << ", an object of the class " << type.isa().name().view()
              << '\n';
    printComments(type);
    printAll("    files named", type, "globs", "pattern");
    printAll("    also called", type, "aliases", "type");
    printAll("    a kind of", type, "superclasses", "type");
    for (const auto& magic : itemsOf(type, "magic")) {
        std::cout << "    known by, with priority " << textOf(*magic, "priority") << ":\n";
        printMatches(*magic, "        ");
    }
}

// Here the class in C++ does something: null where none of its objects fits the file.
qx::Ref<MimeType> typeOfFile(const std::vector<qx::Ref<qx::Object>>& types,
                             const std::string& fileName) {
    qx::Ref<MimeType> best;
    for (const auto& type : types)
        if (const auto candidate = type.as<MimeType>())
            if (const auto weight = candidate->weightFor(fileName))
                if (!best || *weight > best->weightFor(fileName))
                    best = candidate;
    return best;
}

void printNamed(const std::vector<qx::Ref<qx::Object>>& types, const std::string& name) {
    for (const auto& type : types)
        if (textOf(*type, "name") == name)
            return printType(*type);
    if (const auto type = typeOfFile(types, name))
        std::cout << '\n' << name << " is a file of the type " << type->name << '\n';
    else
        std::cout << '\n' << name << ": no such type, and no type's file\n";
}

// Two writings with a reading between them. False with an error.
bool writesTheSameAgain(QXXMLMarshaller& marshaller, const qx::Ref<qx::Object>& database,
                        qx::Ref<qx::Error>& error) {
    const qx::String first = marshaller.writeString(database, &error);
    if (first.isNull())
        return false;
    const auto again = marshaller.readString(first, &error);
    if (!again)
        return false;
    const qx::String second = marshaller.writeString(again, &error);
    if (second.isNull())
        return false;
    std::cout << "\nwritten: " << first.size() << " bytes; read again and written again: "
              << (first == second ? "the same bytes" : "OTHER BYTES") << '\n';
    return first == second;
}

int fail(const qx::Ref<qx::Error>& error) {
    std::cerr << "mime-types: " << (error ? error->description().str() : "nothing was read")
              << '\n';
    return 1;
}

} // namespace

int main(int argc, char** argv) {
    std::vector<std::string> arguments(argv + 1, argv + argc);
    const bool asRecords = !arguments.empty() && arguments.front() == "--records";
    if (asRecords)
        arguments.erase(arguments.begin());
    else
        registerMimeTypes();
    if (arguments.empty()) {
        std::cerr << "usage: example_mime_types [--records] DATABASE [TYPE | FILE NAME]...\n";
        return 2;
    }

    qx::Ref<qx::Error> error;
    const Marshaller marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller)
        return fail(error);
    // Strict: whatever the mapping does not know would be an error.
    marshaller->setLenient(false);
    marshaller->setSaveUnknownXML(false);

    const auto database = marshaller->readFile(arguments.front(), &error);
    if (!database)
        return fail(error);
    const auto types = itemsOf(*database, "types");
    std::cout << types.size() << " types read from " << arguments.front() << '\n';
    for (std::size_t i = 1; i < arguments.size(); ++i)
        printNamed(types, arguments[i]);
    return writesTheSameAgain(*marshaller, database, error) ? 0 : error ? fail(error) : 1;
}
