// The pages in docs/ say what is so: their samples are run. A fenced block says by the words behind
// its language what it is:
//
//     xml mapping           the mapping from here on: a <mapping>, or the classes in one
//     xml document          the document from here on
//     text object OPTION…   what reading the document gives
//     xml written OPTION…   what is written of it again
//     text error OPTION…    "CODE: message" of the mapping, of reading or of writing
//
// Options are "strict", "discard" and "no-namespaces"; blocks with other words are left alone.

#include "support/ErrorRows.h"
#include "support/Page.h"
#include "support/Show.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <set>
#include <sstream>

namespace {

using Options = std::set<std::string>;

// Listings are laid out for the reader: white space outside quotes does not count.
std::string withoutLayout(const std::string& text) {
    std::string result;
    bool quoted = false;
    for (const char c : text) {
        quoted ^= c == '"';
        if (quoted || (c != ' ' && c != '\n'))
            result += c;
    }
    return result;
}

// What reading a document gives, what is written of it again, and the error of either.
struct Result {
    std::string object, written, error = "no error\n";
};

Result run(const std::string& mapping, const std::string& document, const Options& options) {
    Result result;
    qx::Ref<qx::Error> error;
    const auto source = qx::XMLDocument::initWithData(
        mapping.starts_with("<mapping") ? mapping : "<mapping>" + mapping + "</mapping>", {},
        &error);
    if (const auto marshaller = QXXMLMarshaller::initWithMappingXML(source.get(), &error)) {
        marshaller->setLenient(!options.contains("strict"));
        marshaller->setSaveUnknownXML(!options.contains("discard"));
        marshaller->setUsingNamespaceURIs(!options.contains("no-namespaces"));
        const auto object = marshaller->readString(document, &error);
        result.object = support::show(object);
        const auto element = object ? marshaller->marshallObject(object, &error) : nullptr;
        result.written = element ? element->XMLString(qx::XMLPrettyPrint).str() + "\n" : "";
    }
    if (error)
        result.error =
            std::to_string(error->code()) + ": " + error->localizedDescription().str() + "\n";
    return result;
}

// How many blocks were compared.
std::size_t runPage(const std::string& page) {
    std::size_t compared = 0;
    std::string mapping, document;
    for (const auto& block : support::blocksOf(QX_SOURCE_DIR "/docs/" + page)) {
        SCOPED_TRACE(page + ":" + std::to_string(block.line));
        std::istringstream words(block.heading);
        std::string language, kind;
        words >> language >> kind;
        if (kind == "mapping")
            mapping = block.text;
        if (kind == "document")
            document = block.text;
        if (kind != "object" && kind != "written" && kind != "error")
            continue;
        const Result result =
            run(mapping, document, {std::istream_iterator<std::string>(words), {}});
        if (kind == "object")
            EXPECT_EQ(withoutLayout(result.object), withoutLayout(block.text)) << result.error;
        else
            EXPECT_EQ(kind == "error" ? result.error : result.written, block.text);
        ++compared;
    }
    return compared;
}

} // namespace

TEST(Pages, ShowWhatMappingsDo) { EXPECT_GT(runPage("mapping-format.md"), 20U); }

TEST(Pages, ShowWhatIsWritten) { EXPECT_GT(runPage("round-trip.md"), 10U); }

// Rows such as "| -204 | `Too many … %@` | …": the table is the whole of what documents can raise.
TEST(Pages, ListEveryError) {
    std::set<std::string> listed, known;
    std::ifstream page(QX_SOURCE_DIR "/docs/mapping-format.md");
    for (std::string line; std::getline(page, line);)
        if (line.rfind("| -", 0) == 0) {
            const auto start = line.find('`') + 1;
            listed.insert(line.substr(2, line.find(' ', 2) - 1) +
                          line.substr(start, line.find('`', start) - start));
        }
    for (const auto& [code, message] : support::errorRows(support::libraryErrors))
        if (std::stoi(code) < 0 && std::stoi(code) > -1000)
            known.insert(code + " " + message);
    EXPECT_EQ(listed, known);
}
