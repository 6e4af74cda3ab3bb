// Objects of a document that is read bit by bit: the same as of the document as a whole, however
// its bytes come, up to where it has a fault, which is told at the same place.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/model/Class.h>

#include <sstream>

namespace {

using qx::Ref;
using scenario::repeated;

// Gives a few bytes at a time, as a pipe may.
class Trickle final : public std::streambuf {
public:
    Trickle(std::string bytes, std::size_t atOnce) : _bytes(std::move(bytes)), _atOnce(atOnce) {}

protected:
    int_type underflow() override {
        const std::size_t count = std::min(_atOnce, _bytes.size() - _given);
        char* const begin = _bytes.data() + _given;
        setg(begin, begin, begin + count);
        _given += count;
        return count != 0 ? traits_type::to_int_type(*begin) : traits_type::eof();
    }

private:
    std::string _bytes;
    std::size_t _atOnce;
    std::size_t _given = 0;
};

constexpr const char* mapping =
    "<Item xml='item'><id node='attribute'/><text node='text'/></Item>"
    "<Others xml='o'><items collection='array' type='Item' name='item'/></Others>";

struct Told {
    std::string objects;
    std::string error;
    friend bool operator==(const Told&, const Told&) = default;
};
std::ostream& operator<<(std::ostream& out, const Told& told) {
    return out << told.objects << " / " << told.error;
}

std::string toldWithPlace(const Ref<qx::Error>& error) {
    return scenario::told(error) + " at " + std::to_string(error->line()) + ":" +
           std::to_string(error->column());
}

Told each(const std::string& document, std::size_t atOnce) {
    Trickle bytes(document, atOnce);
    std::istream stream(&bytes);
    Told told;
    Ref<qx::Error> error;
    const bool isWhole = scenario::marshaller(mapping)->unmarshallEach(
        stream, "item",
        [&](const Ref<qx::Object>& item) { told.objects += support::show(item) + ";"; }, &error);
    EXPECT_EQ(isWhole, !error);
    told.error = error ? toldWithPlace(error) : "";
    return told;
}

// The items of the tree, and the error of parsing.
Told whole(const std::string& text) {
    Told told;
    Ref<qx::Error> error;
    const auto document = qx::XMLDocument::initWithData(text, {}, &error);
    if (!document)
        return {"", toldWithPlace(error)};
    const auto marshaller = scenario::marshaller(mapping);
    const std::function<void(qx::XMLElement&)> visit = [&](qx::XMLElement& element) {
        if (element.name() == "item") {
            told.objects += support::show(marshaller->unmarshallElement(&element)) + ";";
            return;
        }
        for (qx::XMLNode& child : element.children())
            if (qx::XMLElement* const inner = child.asElement())
                visit(*inner);
    };
    visit(*document->rootElement());
    return told;
}

const std::pair<const char*, std::string> documents[] = {
    {"items at every depth, with what looks like tags between them",
     "<?xml version='1.0' standalone='yes'?>\n<!-- <item> --><?p <item?>\n<all a='1>\"2'>x\n<item "
     "id='1'>one<item id='in'/></item><![CDATA[<item>]]><items/>\n  <deep b=\"it's\"><item\tid='2' "
     "/><?q >?><item id='3'>&lt;&#x10FFFF;<!-- </item> --><![CDATA[</item>]]]]></item ></deep >"
     "<item/></all>\n<!-- end <item/> -->\n<?r?>"},
    {"the root is the item", "<item id='1'>a<item>b</item></item><!-- c -->"},
    {"no item at all", "<all><b/><c>d</c></all>"},
    {"entities and defaults, in every piece",
     "<!DOCTYPE all [<!-- ]> ' --><!ENTITY e \"<item id='e'/>]>\"><?p ]>?>\n<!ENTITY t 'text'>"
     "<!ATTLIST item id CDATA 'none'>]>\n<all><item>&t;</item>&e;<b><item id='2'>&e;</item></b>"
     "</all>"},
    {"namespaces and xml:space of what stands around",
     "<all xmlns:n='urn:n' xml:space='preserve'><n:b><item>\n <n:c n:d='e'/></item></n:b></all>"},
    {"line ends", "<all>\r\n<item id='a\r\nb'>\r\n c\r</item>\r\n</all>\r\n"},
};

std::string utf16(std::string_view text) {
    std::string bytes = "\xFF\xFE";
    for (const char c : text)
        (bytes += c) += '\0';
    return bytes;
}

} // namespace

TEST(Sequences, AreTheObjectsOfTheWholeDocumentHoweverItComes) {
    for (const auto& [name, document] : documents) {
        SCOPED_TRACE(name);
        const Told expected = whole(document);
        ASSERT_EQ(expected.error, "");
        for (const std::size_t atOnce : {1, 2, 3, 7, 64, 100'000}) {
            EXPECT_EQ(each(document, atOnce), expected) << atOnce;
            EXPECT_EQ(each(utf16(document), atOnce), expected) << atOnce;
        }
    }
}

// Tags are told apart in many bytes at a time: each mark stands at each place among those.
TEST(Sequences, EndWhereTheyDoWhereverAMarkFalls) {
    const std::string inside =
        "<b c='/>' d=\"it's>\" >it's \"&gt;></b ><item e=''/><item ><b/></item\n>"
        "<!-- </item> --><![CDATA[</item>]]><?p </item>?>";
    for (std::size_t width = 0; width < 64; ++width) {
        const std::string item = "<item id='" + std::string(width, 'x') + "'>" + inside + "</item>";
        const std::string document = "<all>" + item + "<b>'</b>" + item + item + "</all>";
        EXPECT_EQ(each(document, document.size()), whole(document)) << width;
        const std::string faulty = "<all>" + item + "<item>" + inside + "<b c='<'/></item></all>";
        const Told first{whole("<all>" + item + "</all>").objects, whole(faulty).error};
        EXPECT_EQ(each(faulty, faulty.size()), first) << width;
    }
}

TEST(Sequences, HandOverWhatComesBeforeAFaultAndTellItsPlace) {
    for (const auto& [name, document] : documents) {
        SCOPED_TRACE(name);
        const std::string objects = whole(document).objects;
        for (std::size_t size = 0; size < document.size(); ++size) {
            const std::string cut = document.substr(0, size);
            const Told expected = whole(cut);
            const Told told = each(cut, 5);
            EXPECT_EQ(told.error, expected.error) << cut;
            EXPECT_TRUE(objects.starts_with(told.objects)) << cut << "\n" << told;
        }
    }
    const std::string before = "<all>\n<item id='1'/>\n<item id='2'/>\n ";
    const std::string objects = whole(before + "</all>").objects;
    for (const char* fault : {"<b></c>",
                              "</c>",
                              "<item><b></item>",
                              "<b a='<'/>",
                              "<b a=1/>",
                              "&none;",
                              "]]>",
                              "\x01",
                              "<!DOCTYPE all>",
                              "<!ENTITY>",
                              "<b a='1' a='2'/>",
                              "</all><again/>",
                              "</all>text",
                              "</all>&amp;",
                              "\xFF",
                              "< b/>",
                              "<b",
                              "<!-- -- -->",
                              "<?xml version='1.0'?>",
                              "<n:b/>"}) {
        const std::string document = before + fault + "<item id='3'/></all>";
        const Told told = each(document, 1'000);
        EXPECT_EQ(told.error, whole(document).error) << fault;
        EXPECT_EQ(told.objects.substr(0, objects.size()), objects) << fault;
    }
}

TEST(Sequences, ATreeLargerThanABlockKeepsItsPlaces) {
    const std::string item = "<item id='1'>" + repeated("x", 1'000) + "</item>\n";
    const std::string document = "<all>\n" + repeated(item, 2'000) + "<item><b></item></all>";
    std::size_t count = 0;
    Ref<qx::Error> error;
    std::istringstream stream(document);
    EXPECT_FALSE(scenario::marshaller(mapping)->unmarshallEach(
        stream, "item", [&](const Ref<qx::Object>&) { ++count; }, &error));
    EXPECT_EQ(count, 2'000U);
    ASSERT_TRUE(error);
    EXPECT_EQ(toldWithPlace(error), whole(document).error);
    const std::string comments = repeated("<!-- no root -->\n", 40'000);
    EXPECT_EQ(each(comments, 1'000'000).error, whole(comments).error);
    const std::string late =
        comments + "<!DOCTYPE all [<!ENTITY e 'e'>]>\n<all><item>&e;</item></all>";
    EXPECT_EQ(each(late, 1'000'000), whole(late));
}

TEST(Sequences, StopWhenTheVisitorSaysSoOrAnObjectFails) {
    const auto marshaller = scenario::marshaller(
        "<Item xml='item'><n node='attribute' type='integer' required='true'/></Item>");
    const auto read = [&](const std::string& document, std::size_t most,
                          const char* name = "item") {
        std::istringstream stream(document);
        std::string told;
        Ref<qx::Error> error;
        marshaller->unmarshallEach(
            stream, name,
            [&](const Ref<qx::Object>& item) {
                told += item->valueForKey("n").description().str();
                return told.size() < most;
            },
            &error);
        return error ? told + " " + scenario::told(error) : told;
    };
    const std::string good = "<a><item n='1'/><item n='2'/><item n='3'/>";
    EXPECT_EQ(read(good + "</a>", 9), "123");
    EXPECT_EQ(read(good + "<none", 2), "12");
    EXPECT_EQ(read("<a><item n='1'/><item/><item n='3'/></a>", 9),
              "1 -202: Required attribute missing for field: n in element: <item></item> (Invalid "
              "XML)");
    EXPECT_EQ(read(good, 9, "other"),
              " -211: No definition to handle element: other (Invalid Mapping)");
    Ref<qx::Error> error;
    EXPECT_FALSE(marshaller->unmarshallEach(
        "/no/such/file", "item", [](const Ref<qx::Object>&) {}, &error));
    EXPECT_EQ(error->code(), 260);
}

TEST(Sequences, AReadingTellsHowFarItIsAndCanBeCancelled) {
    const std::string item = "<item id='1'>" + repeated("x", 1'000) + "</item>";
    const std::string document = "<o>" + repeated(item, 3'500) + "</o>";
    const auto marshaller = scenario::marshaller(mapping);
    std::vector<std::uint64_t> told;
    std::size_t most = 9;
    marshaller->setProgressHandler([&](const QXXMLMarshaller::Progress& progress) {
        told.push_back(progress.bytesRead / 1'000'000);
        EXPECT_LE(progress.bytesRead, document.size());
        return told.size() < most;
    });
    const auto readEach = [&](Ref<qx::Error>* error, const char* name = "item") {
        std::istringstream stream(document);
        return marshaller->unmarshallEach(
            stream, name, [](const Ref<qx::Object>&) {}, error);
    };
    using Megabytes = std::vector<std::uint64_t>;
    EXPECT_TRUE(marshaller->readString(document));
    EXPECT_EQ(std::exchange(told, {}), (Megabytes{1, 2, 3}));
    EXPECT_TRUE(readEach(nullptr));
    EXPECT_EQ(std::exchange(told, {}), (Megabytes{1, 2, 3}));
    EXPECT_TRUE(readEach(nullptr, "o"));
    EXPECT_EQ(std::exchange(told, {}).size(), 3U) << "inside of one object";
    most = 2;
    EXPECT_FALSE(marshaller->readString(document)) << "without a slot, too";
    EXPECT_EQ(std::exchange(told, {}), (Megabytes{1, 2}));
    for (const bool isEach : {false, true}) {
        Ref<qx::Error> error;
        EXPECT_FALSE(isEach ? readEach(&error) : !!marshaller->readString(document, &error));
        EXPECT_EQ(scenario::told(error),
                  "-226: The reading was cancelled (The program asked for it.)");
        told.clear();
    }
}

TEST(Sequences, AreWrittenAsTheWholeDocumentWouldBe) {
    const auto marshaller = scenario::marshaller(mapping);
    const auto compact = static_cast<qx::XMLOptions>(qx::XMLCompactEmptyElements);
    for (const char* text : {"<o><item id='1'/><item id='2'>a\nb</item></o>", "<o/>"})
        for (const qx::XMLOptions layout : {qx::XMLPrettyPrint, qx::XMLNoOptions, compact}) {
            const auto whole = marshaller->readString(text);
            const auto items = whole->valueForKey("items").as<qx::Array>();
            std::ostringstream written;
            std::size_t next = 0;
            EXPECT_TRUE(marshaller->marshallEach(
                written, "o",
                [&] { return items && next < items->count() ? items->at(next++) : qx::Value(); },
                nullptr, layout));
            EXPECT_EQ(written.str(), marshaller->writeString(whole, nullptr, layout).str());
        }
}

TEST(Sequences, AreWrittenWholeOrNotAtAll) {
    const auto marshaller = scenario::marshaller(mapping);
    const TemporaryFolder folder;
    const qx::String path = folder.write("items.xml", "old");
    const auto items = marshaller->readString("<o><item id='1'/><item id='2'/></o>")
                           ->valueForKey("items")
                           .as<qx::Array>();
    const auto write = [&](const char* root, std::size_t many, const char* last) {
        std::size_t next = 0;
        Ref<qx::Error> error;
        marshaller->marshallEach(
            path, root,
            [&]() -> qx::Value {
                if (next++ < many)
                    return items->at(next % 2);
                return next == many + 1 && last != nullptr ? qx::Value(last) : qx::Value();
            },
            &error);
        return error ? scenario::told(error) : "";
    };
    EXPECT_EQ(write("o", 10'000, "text"),
              "-211: No mapping definition for class: <string> (Invalid XML)");
    EXPECT_EQ(write("a b", 1, nullptr),
              "517: The text cannot be written: a b is no name of an element ()");
    items->at(0).object()->setValueForKey("\x01", "text");
    EXPECT_TRUE(write("o", 9, nullptr).find("/item/text()") != std::string::npos);
    EXPECT_EQ(folder.read("items.xml"), "old");
    items->at(0).object()->setValueForKey("", "text");
    EXPECT_EQ(write("o", 10'000, nullptr), "");
    std::size_t count = 0;
    EXPECT_TRUE(marshaller->unmarshallEach(path, "item", [&](const Ref<qx::Object>&) { ++count; }));
    EXPECT_EQ(count, 10'000U);
}
