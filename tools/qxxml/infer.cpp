#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/infer/Writers.h"

#include <iostream>

namespace qxxml {

namespace {

// One document is in memory at a time.
void count(const std::string& path, const Options& options, Statistics& statistics) {
    qx::XMLParseOptions parsing;
    parsing.refuseDoctype = options.noDoctype;
    qx::Ref<qx::Error> error;
    const bool isStandardInput = path == "-";
    const auto document = isStandardInput
                              ? qx::XMLDocument::initWithStream(std::cin, parsing, &error)
                              : qx::XMLDocument::initWithContentsOfFile(path, parsing, &error);
    if (!document)
        throw Failure(error, isStandardInput ? "<stdin>" : path);
    statistics.add(*document);
}

} // namespace

std::string infer(const Options& options) {
    Statistics statistics;
    for (const std::string& path : options.documents)
        count(path, options, statistics);
    const auto classes = infer(statistics, options.keepOrder);
    return options.classes ? structsText(classes, statistics.documentCount())
                           : mappingText(classes, statistics.documentCount());
}

} // namespace qxxml
