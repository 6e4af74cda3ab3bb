// Any bytes as a document: the scanner, where it takes them, and the C parser make the same tree or
// the same error. The first byte chooses how the document is read; in the seeds it is a digit.

#include "xml/XMLDocumentContent.h"
#include "xml/XMLParser.h"

#include <algorithm>
#include <cstdlib>
#include <iostream>

namespace {

using qx::XMLNode;
using Way = qx::XMLParser::Way;

void require(bool condition, std::string_view expectation) {
    if (condition)
        return;
    std::cerr << "not so: " << expectation << '\n';
    std::abort();
}

qx::XMLParseOptions optionsOf(unsigned choice) {
    qx::XMLParseOptions options{.keepWhiteSpace = (choice & 1) != 0};
    if ((choice & 2) != 0) {
        options.maximumDepth = 4;
        options.maximumTextSize = 16;
    }
    return options;
}

void requireSame(const XMLNode& node, const XMLNode& other);

template <class Nodes>
void requireSameNodes(const Nodes& nodes, const Nodes& others) {
    const auto isSame = [](const XMLNode& node, const XMLNode& other) {
        requireSame(node, other);
        return true;
    };
    require(std::equal(nodes.begin(), nodes.end(), others.begin(), others.end(), isSame),
            "both find as many nodes");
}

void requireSame(const XMLNode& node, const XMLNode& other) {
    require(node.kind() == other.kind() && node.name() == other.name(), "kinds and names agree");
    require(node.line() == other.line() && node.column() == other.column(), "places agree");
    requireSameNodes(node.children(), other.children());
    const qx::XMLElement* const element = node.asElement();
    if (element == nullptr)
        return require(node.stringValue() == other.stringValue(), "values agree");
    requireSameNodes(element->namespaces(), other.asElement()->namespaces());
    requireSameNodes(element->attributes(), other.asElement()->attributes());
}

void requireSame(const qx::Error& error, const qx::Error& other) {
    require(error.code() == other.code(), "codes agree");
    require(error.localizedDescription() == other.localizedDescription(), "messages agree");
    require(error.line() == other.line() && error.column() == other.column(), "places agree");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size == 0)
        return 0;
    const qx::XMLParseOptions options = optionsOf(data[0]);
    const std::string_view bytes(reinterpret_cast<const char*>(data) + 1, size - 1);

    const auto parsed = [&](qx::Ref<qx::Error>& error, qx::XMLParser::Kept* kept, Way way) {
        return qx::XMLDocumentContent::document(
            qx::XMLParser::parseCopy(bytes, options, &error, kept, way));
    };
    qx::Ref<qx::Error> error;
    qx::Ref<qx::Error> otherError;
    qx::XMLParser::Kept kept;
    parsed(error, &kept, Way::fastest);
    error = nullptr;
    const auto document = parsed(error, &kept, Way::fastest); // with what it left
    const auto other = parsed(otherError, nullptr, Way::cParserOnly);
    require((document == nullptr) == (other == nullptr), "both read it or none");
    if (!document) {
        requireSame(*error, *otherError);
        return 0;
    }
    require(document->version() == other->version() &&
                document->standalone() == other->standalone() &&
                document->characterEncoding() == other->characterEncoding(),
            "declarations agree");
    requireSame(*document, *other);
    return 0;
}
