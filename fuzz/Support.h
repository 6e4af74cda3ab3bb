#pragma once

// What the fuzz programs share. The program is one source file, so this holds definitions.

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/model/Format.h>

#include <cstdlib>
#include <iostream>

// The log is put together, so that it is tried too, and goes nowhere.
void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    qx::format(format, arguments);
}
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    qx::format(format, arguments);
}

namespace fuzz {

// Ends the program, which keeps the input, unless the condition holds.
inline void require(bool condition, std::string_view expectation) {
    if (condition)
        return;
    std::cerr << "not so: " << expectation << '\n';
    std::abort();
}

// What every failure leaves: an error with texts, and nothing else.
inline void requireError(const qx::Ref<qx::Error>& error) {
    require(static_cast<bool>(error), "a failure has an error");
    require(error->code() != 0, "an error has a code");
    require(!error->localizedDescription().isEmpty(), "an error has a message");
    require(!error->description().isEmpty(), "an error can be printed");
}

// Lets mappings include documents, all of them in memory: "common.xml" with a class, "twice.xml"
// that includes it, "loop.xml" that includes itself, "faulty.xml". No file is looked for.
inline void offerIncludes() {
    constexpr std::pair<const char*, const char*> documents[]{
        {"common.xml", "<m><class name='Common'><map-to xml='common'/><field name='id'>"
                       "<bind-xml name='id' node='attribute'/></field></class></m>"},
        {"twice.xml", "<m><include href='common.xml'/><class name='Twice' extends='Common'/></m>"},
        {"loop.xml", "<m><include href='loop.xml'/></m>"},
        {"faulty.xml", "<m><class/></m>"},
    };
    const auto inMemory = QXXMLVolatileDataRepository::init();
    for (const auto& [name, text] : documents)
        inMemory->setDocument(qx::XMLDocument::initWithData(text), name);
    const auto manager = QXXMLDataRepositoryManager::defaultManager();
    manager->setVolatileRepository(inMemory);
    auto order = qx::make<qx::Array>();
    order->add(QXXMLDataRepositoryVolatileName);
    manager->setRepositoryNames(order);
}

} // namespace fuzz
