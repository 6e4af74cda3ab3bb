// Parses documents with memory that fails at the first request, at the second, and so on, once or
// from there on. What comes out is std::bad_alloc or what came out with enough memory: the same
// document, or the same error.

#include "FailingMemory.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <cstring>
#include <iostream>
#include <libxml/parser.h>
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

std::vector<std::string> documents() {
    const std::string latin = "<?xml version='1.0' encoding='ISO-8859-1' standalone='yes'?>";
    return {
        "<!DOCTYPE a [<!ENTITY e 'x<b c=\"&amp;\">y</b>'><!ENTITY f '[&e;&#13;]'>]><a>&f;z&e;</a>",
        "<!DOCTYPE a [<!ENTITY i '1'><!ENTITY o '[&i;]'>]><a b='&o;&#x20AC;'>&o;</a>",
        "<!DOCTYPE a [<!ENTITY % p \"<!ENTITY e 'x'><!ENTITY &#37; q ''>\"> %p; %q;]><a>&e;</a>",
        "<!DOCTYPE a [<!ELEMENT a (b|(c,d?)*)><!ATTLIST a b CDATA 'd' p:c (x|y) 'y' xmlns CDATA 'u'"
        " i ID #IMPLIED n NMTOKENS ' 1  2 ' q:m NMTOKENS #REQUIRED>]><a i=' j ' q:m=' 1  2 '/>",
        "<!DOCTYPE a PUBLIC 'p' 's' [<!NOTATION n PUBLIC 'n'><!ENTITY u SYSTEM 'u' NDATA n>"
        "<!ENTITY % x SYSTEM 'x'>%x;<!ATTLIST a d CDATA 'd'>]><!--c--><a/><?p i?>",
        "<p:a xmlns:p='u' q:b='1' xmlns='v'><c xmlns:q='w' q:b='" + repeated("&lt;&#10;", 400) +
            "'/><![CDATA[<>]]><!--c--><?p d?><r:s/></p:a>",
        "<\xC3\xA9 \xC3\xA8='" + repeated("\xC3\xA9", 700) + "'>" + repeated("\xE2\x82\xAC", 700) +
            "<" + repeated("n", 5000) + "/></\xC3\xA9>",
        "<!--" + repeated("\xC3\xA9 - ", 900) + "--><a><![CDATA[" + repeated("\xC3\xA9]", 900) +
            "]]><?p " + repeated("\xC3\xA9?", 900) + "?></a>",
        "<!DOCTYPE \xC3\xA9 [<!ENTITY \xC3\xA8 'x'><!ATTLIST \xC3\xA9 \xC3\xA8:\xC3\xA9 CDATA 'd'>"
        "<!ENTITY \xC3\xA8 '2'><?\xC3\xA9 p?>]><\xC3\xA9 xmlns:\xC3\xA7='u' \xC3\xA7:b='' a:b:c=''>"
        "&\xC3\xA8;<a:b:c/><?\xC3\xA9?></\xC3\xA9>",
        "<a xml:space='preserve' xmlns:p=''> <b xml:space='default'>\n</b></a>",
        repeated("<a xmlns:p='u' b='c'>", 60) + repeated("</a>", 60),
        latin + "<a>\xE9</a>",
        std::string("\xFE\xFF\0<\0a\0/\0>", 10),
        // What has an error.
        "<a><b></a>",
        "<a b='1' b='2'/>",
        "<p:a xmlns:p='u' xmlns:q='u' p:b='' q:b=''/>",
        "<a xmlns:p=''><c:b>&lt;</a>",
        "<a>&nothing;</a>",
        "<!DOCTYPE a [<!ENTITY e '<b>'>]><a>&e;</a>",
        "<!DOCTYPE a [<!ENTITY e 'x'><!ENTITY e SYSTEM 'y'><!ATTLIST a b CDATA '&n;'>]><a>&e;</a>",
        "<!DOCTYPE a [<!ENTITY e SYSTEM 'file.txt'>]><a>&e;</a>",
        "<!DOCTYPE a [<!ENTITY % e SYSTEM 'file.txt'> %f; <!ATTLIST a b (c|d|c) #FIXED 'c'>]><a/>",
        latin + "<a b='\xE9></a>",
        "<?xml version='1.0' encoding='no-such-name'?><a/>",
        "<a>\xC3(</a>",
    };
}

// What the last call left, told with enough memory.
std::string told(const qx::Ref<qx::XMLDocument>& document, const qx::Ref<qx::Error>& error) {
    if (document)
        return document->XMLString().str();
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
