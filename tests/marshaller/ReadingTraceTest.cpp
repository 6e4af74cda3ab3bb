// What a reading tells of the entries that its fields took.

#include "support/Scenario.h"

#include "marshaller/ReadingTrace.h"
#include "marshaller/Unmarshalling.h"

namespace {

using qx::detail::ReadingTrace;

// A line for each use: the key path, the form, and the name of the entry.
std::string traceOf(const char* classes, const std::string& source, bool isLenient = true) {
    static constexpr const char* forms[] = {"attribute", "child",         "text",
                                            "flattened", "item",          "wrapper",
                                            "keptChild", "keptAttribute", "declaration"};
    const auto marshaller = scenario::marshaller(classes);
    marshaller->setLenient(isLenient);
    const auto document = qx::XMLDocument::initWithData(source);
    qx::IndexedXML index(*document);
    ReadingTrace trace;
    qx::Ref<qx::Error> error;
    const auto object = qx::detail::readDocument(*marshaller, index, &error, &trace);
    EXPECT_TRUE(object) << support::told(error);
    std::string told;
    for (const ReadingTrace::Use& use : trace.uses()) {
        told += trace.keyPath(use.owner, use.field).str();
        told += use.form == ReadingTrace::Form::item ? "[" + std::to_string(use.item) + "] " : " ";
        told += forms[static_cast<int>(use.form)];
        told += use.binding != 0 ? " by name " + std::to_string(use.binding) : "";
        told += " " + index.writtenName(use.entry).str();
        told += use.made != ReadingTrace::none ? " made " + std::to_string(use.made) + "\n" : "\n";
    }
    return told;
}

} // namespace

TEST(ReadingTrace, TellsWhichFieldTookEachEntryInWhatForm) {
    EXPECT_EQ(
        traceOf(
            "<class name='Order'><map-to xml='order'/>"
            "<field name='id'><bind-xml name='key' node='attribute'/>"
            "<alt-xml name='id' location='meta' node='attribute'/></field>"
            "<field name='title'><bind-xml name='title' node='text'/></field>"
            "<field name='lines' collection='array' type='Line'>"
            "<bind-xml name='line' location='lines'/></field>"
            "<field name='buyer' type='Person'><bind-xml name='buyer' node='element'/>"
            "</field></class>"
            "<class name='Line'><field name='text'><bind-xml node='text'/></field></class>"
            "<class name='Person'><map-to xml='p'/><field name='name'><bind-xml/></field></class>",
            "<order xmlns:x='urn:x' a='1'><meta id='7'/><title>T</title><lines><line>Pens"
            "</line><line>Ink</line></lines><buyer name='Ada'/><note/><!-- c --></order>"),
        "id wrapper by name 1 meta\n"
        "id attribute by name 1 id\n"
        "title child title\n"
        "lines wrapper lines\n"
        "lines[0] item line made 1\n"
        "lines[0].text text line\n"
        "lines[1] item line made 2\n"
        "lines[1].text text line\n"
        "buyer child buyer made 3\n"
        "buyer.name attribute name\n"
        " declaration x\n"
        " keptChild meta\n"
        " keptChild note\n"
        " keptAttribute a\n");
}

TEST(ReadingTrace, KeepsWhatIsFlattenedApartAndForgetsWhatBecomesNoItem) {
    EXPECT_EQ(
        traceOf("<class name='Order'><map-to xml='order'/>"
                "<field name='address' type='Address' container='false'>"
                "<bind-xml node='element'/></field>"
                "<field name='all' collection='array'/></class>"
                "<class name='Address'><field name='zip'><bind-xml name='zip' node='element'/>"
                "</field></class>"
                "<class name='Pen'><map-to xml='pen'/></class>",
                "<order><ink/><zip>1</zip><pen/>text</order>"),
        "address flattened order made 1\n"
        "address.zip child zip\n"
        "address keptChild ink\n"
        "address keptChild pen\n"
        "all[0] item pen made 2\n"
        " keptChild ink\n");
}
