// Any bytes as a document: they are refused with an error that has a place, or make a tree that is
// written, read again and written the same. The first byte chooses how it is read and written; in
// the seeds it is a digit.

#include "Support.h"

namespace {

qx::XMLParseOptions optionsOf(unsigned choice) {
    qx::XMLParseOptions options{.keepWhiteSpace = (choice & 1) != 0};
    if ((choice & 2) != 0) {
        options.maximumDepth = 4;
        options.maximumTextSize = 64;
    }
    return options;
}

std::size_t childrenOf(const qx::XMLNode& node) {
    std::size_t count = 0;
    for (const qx::XMLNode* child = node.firstChild(); child != nullptr;
         child = child->nextSibling()) {
        fuzz::require(child->parent() == &node, "a child knows its parent");
        count += 1 + childrenOf(*child);
    }
    return count;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size == 0)
        return 0;
    const unsigned choice = data[0];
    const std::string_view bytes(reinterpret_cast<const char*>(data) + 1, size - 1);
    const qx::XMLParseOptions options = optionsOf(choice);

    qx::Ref<qx::Error> error;
    const auto document = qx::XMLDocument::initWithData(bytes, options, &error);
    if (!document) {
        fuzz::requireError(error);
        fuzz::require(error->line() > 0, "a parser's error has a place");
        return 0;
    }
    fuzz::require(!error, "success leaves no error");
    document->setCharacterEncoding("UTF-8");
    const std::string written = document->XMLData();
    const auto copy = document->copy().as<qx::XMLDocument>();
    fuzz::require(copy && copy->XMLData() == written, "a copy is written as its original");

    document->setCharacterEncoding((choice & 4) != 0 ? "UTF-16" : "UTF-8");
    const std::string encoded = document->XMLData();
    const auto again = qx::XMLDocument::initWithData(encoded, options, &error);
    fuzz::require(again && !error, "what is written can be read");
    fuzz::require(childrenOf(*again) == childrenOf(*document), "no node is lost or comes about");
    again->setCharacterEncoding("UTF-8");
    fuzz::require(again->XMLData() == written, "what is read again is written the same");
    return 0;
}
