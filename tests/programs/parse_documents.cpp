// Reads the files given and tells of each what became of it: its text, or the error. Without any it
// reads one that refers to a file, which must fail.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <cstdlib>
#include <iostream>
#include <span>

namespace {

bool read(const qx::Ref<qx::XMLDocument>& document, const qx::Ref<qx::Error>& error) {
    std::cout << (document ? document->stringValue() : error->localizedDescription()).view()
              << '\n';
    return static_cast<bool>(document);
}

} // namespace

int main(int argc, char** argv) {
    qx::Ref<qx::Error> error;
    if (argc < 2) {
        constexpr const char* hostile =
            "<!DOCTYPE a [<!ENTITY e SYSTEM 'file:///etc/passwd'>]><a>&e;</a>";
        return read(qx::XMLDocument::initWithData(hostile, {}, &error), error) ? EXIT_FAILURE
                                                                               : EXIT_SUCCESS;
    }
    for (const char* path : std::span(argv + 1, static_cast<std::size_t>(argc - 1))) {
        error.reset();
        read(qx::XMLDocument::initWithContentsOfFile(path, {}, &error), error);
    }
}
