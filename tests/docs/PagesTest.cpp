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

// What the blocks up to here have set up, and what it does.
class Sample {
public:
    void setMapping(const std::string& text) {
        const bool isWhole = text.rfind("<mapping", 0) == 0;
        _mapping = isWhole ? text : "<mapping>" + text + "</mapping>";
    }
    void setDocument(const std::string& text) { _document = text; }

    void run(const Options& options) {
        _error.reset();
        _object.reset();
        _written = qx::String();
        const auto mapping = qx::XMLDocument::initWithData(_mapping, {}, &_error);
        const auto marshaller = QXXMLMarshaller::initWithMappingXML(mapping.get(), &_error);
        if (!marshaller)
            return;
        marshaller->setLenient(!options.contains("strict"));
        marshaller->setSaveUnknownXML(!options.contains("discard"));
        marshaller->setUsingNamespaceURIs(!options.contains("no-namespaces"));
        _object = marshaller->readString(_document, &_error);
        _shown = support::show(_object);
        if (!_object)
            return;
        if (const auto element = marshaller->marshallObject(_object, &_error))
            _written = element->XMLString(qx::XMLPrettyPrint);
    }

    const std::string& shown() const { return _shown; }
    std::string written() const { return _written.str() + "\n"; }
    std::string error() const {
        if (!_error)
            return "no error\n";
        return std::to_string(_error->code()) + ": " + _error->localizedDescription().str() + "\n";
    }

private:
    std::string _mapping, _document;
    qx::Ref<qx::Error> _error;
    qx::Ref<qx::Object> _object;
    std::string _shown;
    qx::String _written;
};

// How many blocks were compared.
std::size_t runPage(const std::string& page) {
    std::size_t compared = 0;
    Sample sample;
    for (const auto& block : support::blocksOf(QX_SOURCE_DIR "/docs/" + page)) {
        SCOPED_TRACE(page + ":" + std::to_string(block.line));
        std::istringstream words(block.heading);
        std::string language, kind;
        words >> language >> kind;
        if (kind == "mapping")
            sample.setMapping(block.text);
        if (kind == "document")
            sample.setDocument(block.text);
        if (kind != "object" && kind != "written" && kind != "error")
            continue;
        sample.run({std::istream_iterator<std::string>(words), {}});
        if (kind == "object")
            EXPECT_EQ(withoutLayout(sample.shown()), withoutLayout(block.text)) << sample.error();
        else
            EXPECT_EQ(kind == "error" ? sample.error() : sample.written(), block.text);
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
