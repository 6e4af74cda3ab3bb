#pragma once

// What the programs log_*.cpp share: they make the library say things and look where they go.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Format.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <cstdio>
#include <cstdlib>
#include <string>

#include <unistd.h>

class TakenOnce : public qx::Object {};
class TakenTwice : public qx::Object {};

// Runs the function and returns what it wrote to standard error.
template <class Function>
std::string standardErrorOf(Function function) {
    std::FILE* const file = std::tmpfile();
    const int former = ::dup(STDERR_FILENO);
    ::dup2(::fileno(file), STDERR_FILENO);
    function();
    ::dup2(former, STDERR_FILENO);
    ::close(former);
    std::string text(65536, '\0');
    std::rewind(file);
    text.resize(std::fread(text.data(), 1, text.size(), file));
    std::fclose(file);
    return text;
}

// Defines a class under a taken name, and reads a document with an attribute and an element that
// its mapping does not know: a warning, a warning and a message for debugging, in this order.
inline void saySomething() {
    qx::Class::define<TakenOnce>("Taken");
    qx::Class::define<TakenTwice>("Taken");
    const auto mapping = qx::XMLDocument::initWithData(
        R"(<mapping><class name="Order"><map-to xml="order"/></class></mapping>)");
    const auto marshaller = QXXMLMarshaller::initWithMappingXML(mapping.get());
    const auto document = qx::XMLDocument::initWithData("<order number='1'><note>n</note></order>");
    if (!marshaller || !marshaller->unmarshall(document)) {
        std::puts("the document could not be read");
        std::exit(2);
    }
}

// Counts how often the text holds the part.
inline int timesIn(const std::string& text, const std::string& part) {
    int count = 0;
    for (std::size_t at = 0; (at = text.find(part, at)) != std::string::npos; ++at)
        ++count;
    return count;
}

// Ends the program where something else was counted.
inline void expectTimes(int expected, const std::string& part, const std::string& text) {
    if (timesIn(text, part) == expected)
        return;
    std::printf("\"%s\" should stand %d times in:\n%s\n", part.c_str(), expected, text.c_str());
    std::exit(1);
}
