// Any document as a mapping: it is refused with an error, the first of all those that a check
// finds, or resolves, twice alike, to classes that are found under their names, and can be
// described.

#include "Support.h"

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

extern "C" int LLVMFuzzerInitialize(int* argumentCount, char*** arguments);
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    fuzz::offerIncludes();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    const auto document = qx::XMLDocument::initWithData(bytes);
    if (!document)
        return 0;
    const qx::String before = document->XMLString();
    qx::Ref<qx::Error> error;
    const auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get(), &error);
    fuzz::require(document->XMLString() == before, "a mapping document is left as it is");

    qx::Ref<qx::Error> secondError;
    const auto second = QXXMLMarshallingMapping::initWithDocument(document.get(), &secondError);
    fuzz::require(!mapping == !second, "a mapping resolves twice, or never");
    const auto whole =
        QXXMLMarshallingMapping::initWithDocument(document.get(), {.collectsFaults = true});
    fuzz::require(whole && whole->faults().empty() == (mapping.get() != nullptr),
                  "faults are collected where there are any");
    fuzz::require(whole->check().size() >= whole->faults().size(), "a check tells all faults");
    if (!mapping) {
        fuzz::requireError(error);
        fuzz::require(whole->faults().front().fault->description() == error->description(),
                      "the first fault is the error of a mapping that collects none");
        fuzz::require(secondError && error->description() == secondError->description(),
                      "the error is the same each time");
        return 0;
    }
    fuzz::require(!error, "success leaves no error");
    const auto& classes = mapping->mapping()->classMappings();
    for (const auto& type : classes)
        fuzz::require(mapping->mappingForClassName(type->className()) == type.get(),
                      "a class is found under its name");
    fuzz::require(second->mapping()->classMappings().size() == classes.size(),
                  "a mapping has the same classes each time");
    fuzz::require(!mapping->mapping()->description().isEmpty(), "a mapping can be described");
    return 0;
}
