// Parses documents with memory that fails at the first request, at the second, and so on, once or
// from there on. What comes out is std::bad_alloc or what came out with enough memory: the same
// document, or the same error.

#include "FailingMemory.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <libxml/parser.h>
#include <sstream>
#include <vector>

namespace {

void* allocate(std::size_t size) { return failing::allocate(size); }
void* reallocate(void* block, std::size_t size) {
#ifdef __clang__
    if (failing::failsNow())
        return nullptr;
#endif
    return std::realloc(block, size);
}
char* duplicate(const char* text) {
    void* const copy = allocate(std::strlen(text) + 1);
    return copy != nullptr ? std::strcpy(static_cast<char*>(copy), text) : nullptr;
}

std::string repeated(std::string_view text, int times) {
    std::string all;
    while (times-- > 0)
        all += text;
    return all;
}

// Texts that outgrow their first memory, and the first inputs of the fuzz program, without the
// digit for its options.
std::vector<std::string> documents() {
    std::vector<std::string> all{
        "<p:a xmlns:p='u' q:b='1' xmlns='v'><c xmlns:q='w' q:b='" + repeated("&lt;&#10;", 400) +
            "'/><![CDATA[<>]]><!--c--><?p d?><r:s/></p:a>",
        "<\xC3\xA9 \xC3\xA8='" + repeated("\xC3\xA9", 700) + "'>" + repeated("\xE2\x82\xAC", 700) +
            "<" + repeated("n", 5000) + "/></\xC3\xA9>",
        "<!--" + repeated("\xC3\xA9 - ", 900) + "--><a><![CDATA[" + repeated("\xC3\xA9]", 900) +
            "]]><?p " + repeated("\xC3\xA9?", 900) + "?></a>",
        repeated("<a xmlns:p='u' b='c'>", 60) + repeated("</a>", 60)};
    for (const auto& seed :
         std::filesystem::directory_iterator(QX_SOURCE_DIR "/fuzz/seeds/parse")) {
        std::ostringstream text;
        text << std::ifstream(seed.path(), std::ios::binary).rdbuf();
        all.push_back(text.str().substr(1));
    }
    return all;
}

// What the last call left, told with enough memory.
std::string told(const qx::Ref<qx::XMLDocument>& document, const qx::Ref<qx::Error>& error) {
    if (document)
        return document->description().str();
    if (!error)
        return "neither a document nor an error";
    return std::to_string(error->line()) + ":" + std::to_string(error->column()) + " " +
           std::to_string(error->code()) + " " + error->localizedDescription().str();
}

long attempts = 0;

int faultsOf(const std::string& text) {
    int faults = 0;
    std::string expected;
    const auto attempt = [&](long n) {
        ++attempts;
        qx::Ref<qx::XMLDocument> document;
        qx::Ref<qx::Error> error;
        const auto outcome =
            failing::run(n, [&] { document = qx::XMLDocument::initWithData(text, {}, &error); });
        if (outcome == failing::Outcome::failed)
            return outcome;
        const std::string said = told(document, error);
        if (n == failing::never)
            expected = said;
        if (said == expected)
            return outcome;
        ++faults;
        std::cout << "request " << n << (failing::allFollowing ? " and all after it" : "")
                  << " failed: " << text.substr(0, 300) << "\n  instead of "
                  << expected.substr(0, 300) << "\n  came       " << said.substr(0, 300) << '\n';
        return outcome;
    };
    attempt(failing::never);
    failing::eachAllocation(attempt);
    return faults;
}

} // namespace

int main() {
    if (::xmlMemSetup(std::free, allocate, reallocate, duplicate) != 0)
        return EXIT_FAILURE;
    int faults = 0;
    for (const std::string& text : documents())
        faults += faultsOf(text);
    std::cout << attempts << " attempts, " << faults << " wrong\n";
    return faults == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
