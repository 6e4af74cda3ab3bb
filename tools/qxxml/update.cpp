#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/FromJson.h"
#include "qxxml/Saving.h"

#include <fstream>
#include <iostream>
#include <sstream>

namespace qxxml {

namespace {

std::string textOf(const std::string& path) {
    std::ostringstream text;
    std::ifstream file;
    if (path != "-") {
        file.open(path, std::ios::binary);
        if (!file)
            throw Failure("260: " + message("There is no such file: %@", path));
    }
    text << (path == "-" ? std::cin : file).rdbuf();
    return text.str();
}

} // namespace

std::string update(const Options& options) {
    if (options.document == "-" && options.object == "-")
        throw Failure(
            message("The document and the object cannot both be standard input: %@", "-"));
    const Session session(options);
    const auto marshaller = session.makeMarshaller();
    const std::string original = session.readBytes(*marshaller);
    return saved(session, *marshaller, original, objectOf(textOf(options.object)));
}

} // namespace qxxml
