#include "support/Page.h"
#include "tools/qxxml/Shell.h"

#include <gtest/gtest.h>

#include <regex>

namespace {

constexpr const char* mapping = R"(<mapping>
    <description>looks like &lt;QXXMLClassMapping: 0x10&gt;</description>
    <include href="line.xml"/>
    <class name="Order">
        <map-to xml="order"/>
        <field name="number"><bind-xml name="number" node="attribute"/></field>
        <field name="count" type="integer"><bind-xml name="count" node="attribute"/></field>
        <field name="line" type="Line"><bind-xml name="line" node="element"/></field>
    </class>
</mapping>)";
constexpr const char* line =
    R"(<mapping><class name="Line"><field name="text"><bind-xml node="text"/></field></class></mapping>)";
constexpr const char* order =
    "<order number=\"7\" state=\"new\">\n    <line>tea</line>\n    <note>n</note>\n</order>\n";
constexpr const char* orderAsJson = R"({
    "@class": "Order",
    "number": "7",
    "line": {
        "@class": "Line",
        "text": "tea"
    }
}
)";
constexpr const char* kept = "qxxml: warning: Unbound fields: (note [1])\n"
                             "qxxml: warning: Unbound attributes: (state [1])\n";

// A home with the documents above and some that are broken.
struct Home : Shell {
    Home() {
        write("mapping.xml", mapping);
        write("line.xml", line);
        write("order.xml", order);
        write("read", order);
        write("other.xml", "<other/>");
        write("spaced.xml", "<order xmlns:x=\"urn:x\"><x:a>\n<b/></x:a></order>");
        write("open.xml", "<order>\n  <line></order>");
        write("words.xml", "<order count=\"many\"/>");
        write("maps/outer.xml", R"(<mapping><include href="inner.xml"/></mapping>)");
        write("maps/inner.xml", R"(<mapping><include href="broken.xml"/></mapping>)");
        write("maps/broken.xml", "<mapping>\n<class></mapping>");
        write("maps/self.xml", R"(<mapping><include href="self.xml"/></mapping>)");
        write("twice.xml", R"(<mapping><class name="A"/><class name="A"/></mapping>)");
        write("bad-name.xml", R"(<mapping><class name="O"><map-to xml="order"/>
            <field name="n"><bind-xml name="n" node="attribute"/></field>
            <field name="m"><bind-xml name="1 m" node="element"/><alt-xml name="m"/></field>
            </class></mapping>)");
        write("m.xml", "<order n=\"1\"><m>text</m></order>");
        write(".local/share/Client/2.1.57/mapping.xml", mapping);
    }
};

// What docs/qxxml.md shows is not repeated here.
struct Case {
    const char* name;
    std::string command;
    Outcome expected;
};

const Case cases[] = {
    {"describe leaves out addresses, and nothing that looks like one",
     "qxxml describe mapping.xml | sed 1q",
     {0, "<QXXMLDocumentMapping> description: looks like <QXXMLClassMapping: 0x10> includes:\n",
      ""}},
    {"read of a document that no class handles is null",
     "qxxml read mapping.xml other.xml",
     {0, "null\n", ""}},
    {"read takes standard input and includes from the mapping's folder",
     "mkdir below; cd below; qxxml read --discard-unknown ../mapping.xml - <../order.xml",
     {0, orderAsJson, ""}},
    {"a document may be called like a command",
     "qxxml read --discard-unknown mapping.xml read",
     {0, orderAsJson, ""}},
    {"roundtrip brings unknown XML along",
     "qxxml roundtrip mapping.xml order.xml",
     {0,
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?><order number=\"7\" state=\"new\"><line>tea</line>"
      "<note>n</note></order>\n",
      kept}},
    {"white space is kept, and namespaces are left out, when that is asked for",
     "qxxml roundtrip mapping.xml spaced.xml 2>&- && "
     "qxxml roundtrip --keep-white-space --no-namespace-uris mapping.xml spaced.xml 2>&-",
     {0,
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?><order xmlns:x=\"urn:x\"><x:a><b></b></x:a>"
      "</order>\n<?xml version=\"1.0\" encoding=\"UTF-8\"?><order><x:a>\n<b></b></x:a></order>\n",
      ""}},
    {"strict refuses unknown roots",
     "qxxml read --strict mapping.xml other.xml",
     {1, "", "qxxml: error -211: No definition to handle element: <other></other>\n"}},
    {"a failing conversion is warned about, too",
     "qxxml read mapping.xml words.xml",
     {1, "",
      "qxxml: warning: <count>: Unable to convert value to integer: many\n"
      "qxxml: error -221: <count>: Unable to convert value to integer: many\n"}},
    // The column and the text behind it are the parser's, whose version decides.
    {"a parse error names file, line and column",
     "for file in open.xml -; do qxxml read mapping.xml $file <open.xml 2>&1 | "
     "sed -E 's/:[1-9][0-9]*: .+/ and column/'; done",
     {0, "qxxml: error 76: open.xml:2 and column\nqxxml: error 76: <stdin>:2 and column\n", ""}},
    {"a DOCTYPE is refused when that is asked for",
     "echo '<!DOCTYPE other [<!ENTITY e \"x\">]><other>&e;</other>' >dtd.xml; "
     "qxxml read --no-doctype mapping.xml dtd.xml",
     {1, "",
      "qxxml: error 1: dtd.xml:1:17: The document has a DOCTYPE, which is not allowed here\n"}},
    {"a parse error in an include of an include names that file",
     "qxxml describe maps/outer.xml 2>&1 | sed -E 's/:[1-9][0-9]*: .+/ and column/'",
     {0, "qxxml: error 76: maps/broken.xml:2 and column\n", ""}},
    {"a mapping that includes itself fails",
     "qxxml describe maps/self.xml",
     {1, "", "qxxml: error -218: Unable to load included file: self.xml\n"}},
    {"a mapping's own fault fails",
     "qxxml read twice.xml order.xml",
     {1, "", "qxxml: error -205: Class redefined: A\n"}},
    {"absent and unreadable files fail",
     "qxxml describe absent.xml; qxxml read mapping.xml maps",
     {1, "",
      "qxxml: error 260: There is no such file: absent.xml\n"
      "qxxml: error 256: The file cannot be read: maps\n"}},
    {"messages speak the user's language",
     "export LC_ALL=de_DE.UTF-8; qxxml describe absent.xml; "
     "qxxml where absent.xml 2>&1 | sed 1q >&2",
     {0, "",
      "qxxml: error 260: Die Datei gibt es nicht: absent.xml\n"
      "qxxml: error 260: Es gibt kein Dokument mit dem Namen: absent.xml\n"}},
    {"where tells the path and the places up to it",
     "qxxml where mapping.xml --search-path maps --application 'Client/2.1(57)'",
     {0,
      "/home/ada/.local/share/Client/2.1.57/mapping.xml\nlooked in maps\n"
      "looked in /home/ada/.local/share/Client/2.1.57\n",
      ""}},
    {"given folders are searched in their order, before all others",
     "mkdir -p a b; cp order.xml a; cp order.xml b; qxxml where order.xml --search-path b "
     "--search-path a",
     {0, "b/order.xml\nlooked in b\n", ""}},
    {"where fails for what is nowhere",
     "qxxml where mapping.xml",
     {1, "",
      "qxxml: error 260: There is no document of the name: mapping.xml\n"
      "looked in /home/ada/.local/share/qxxml\nlooked in /usr/bin\n"
      "looked in /usr/share/QXXMLMarshalling\n"}},
    {"an exception ends in an error",
     "qxxml roundtrip bad-name.xml m.xml",
     {1, "", "qxxml: error NSInvalidArgumentException: a name is no XML name at /order/1 m\n"}},
    {"output that cannot be written is an error",
     "qxxml read mapping.xml other.xml >/dev/full; qxxml --help >/dev/full; "
     "qxxml read mapping.xml other.xml >&-; "
     "{ until test -e gone; do sleep 0.01; done; qxxml read mapping.xml other.xml; "
     "echo $? >status; } | { exec <&-; : >gone; }; cat status",
     {0, "1\n",
      "qxxml: error 512: The standard output cannot be written: No space left on device\n"
      "qxxml: error 512: The standard output cannot be written: No space left on device\n"
      "qxxml: error 512: The standard output cannot be written: Bad file descriptor\n"
      "qxxml: error 512: The standard output cannot be written: Broken pipe\n"}},
    {"wrong usage has a status of its own, and says what is wrong",
     "check() { qxxml $2 2>&1 >/dev/null | grep -cE \"^qxxml: .*$1\"; qxxml $2 2>&- || echo $?; }; "
     "check subcommand; check 'subcommand|tell' tell; check DOCUMENT 'read mapping.xml'; "
     "check ' c$' 'read a b c'; check ' --fast$' 'read --fast a b'",
     {0, "1\n2\n1\n2\n1\n2\n1\n2\n1\n2\n", ""}},
    {"an application and its version are checked",
     "for name in .. A/ A/v2 A/..; do qxxml where x --application $name 2>&1 | "
     "sed -nE '1s/.*--application: //p'; qxxml where x --application $name 2>&- || echo $?; done",
     {0,
      "an application's name is a file name, not \"..\"\n2\n"
      "NAME or NAME/VERSION is expected, not \"A/\"\n2\n"
      "a version begins with a number, unlike \"v2\"\n2\n"
      "a version begins with a number, unlike \"..\"\n2\n",
      ""}},
};

// Without the column and the text of a parser's error, which its version decides.
std::string withoutParserText(const std::string& output) {
    static const std::regex parserError("(qxxml: error [0-9]+: [^:\n]+:[0-9]+):[0-9]+: .+");
    return std::regex_replace(output, parserError, "$1");
}

} // namespace

TEST(Commands, AreAnsweredWithOutputStatusAndErrors) {
    const Home home;
    for (const Case& test : cases)
        EXPECT_EQ(home.run(test.command), test.expected) << test.name;
}

// The page's documents ("xml NAME") are laid out, its commands ("console") run.
TEST(Commands, DoWhatTheirPageShows) {
    Shell home;
    std::size_t commands = 0;
    for (const auto& [heading, text, line] : support::blocksOf(QX_SOURCE_DIR "/docs/qxxml.md")) {
        if (heading.starts_with("xml "))
            home.write(heading.substr(4), text);
        if (heading != "console")
            continue;
        const std::size_t end = text.find('\n');
        ASSERT_TRUE(text.starts_with("$ ")) << line;
        EXPECT_EQ(withoutParserText(home.run(text.substr(2, end - 2) + " 2>&1").output),
                  withoutParserText(text.substr(end + 1)))
            << line;
        ++commands;
    }
    EXPECT_GE(commands, 8U);
}

TEST(Commands, EachHasHelp) {
    const Home home;
    for (const std::string command : {"", "describe ", "read ", "roundtrip ", "where "}) {
        const Outcome outcome = home.run("qxxml " + command + "--help");
        EXPECT_EQ(outcome.status, 0) << outcome;
        EXPECT_NE(outcome.output.find("qxxml " + command + "[OPTIONS]"), std::string::npos)
            << outcome;
    }
}
