// Any bytes as a document: they are refused with an error, or make a tree that is written, read
// again and written the same.

#include <QXXMLMarshalling/platform/XMLDocument.h>

#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    for (const bool keepWhiteSpace : {false, true}) {
        const qx::XMLParseOptions options{.keepWhiteSpace = keepWhiteSpace};
        qx::Ref<qx::Error> error;
        const auto document = qx::XMLDocument::initWithData(bytes, options, &error);
        if (!document) {
            if (!error || error->localizedDescription().isEmpty() || error->line() == 0)
                std::abort();
            continue;
        }
        document->setCharacterEncoding("UTF-8");
        const std::string written = document->XMLData();
        const auto again = qx::XMLDocument::initWithData(std::string_view(written), options);
        if (!again || again->XMLData() != written)
            std::abort();
    }
    return 0;
}
