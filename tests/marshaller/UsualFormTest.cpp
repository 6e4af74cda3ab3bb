// Elements of their class's usual form are bound straight, all others the general way, which a
// report handler brings about for every element: what comes of both is the same.

#include "Structs.h"

#include "marshaller/Unmarshalling.h"

#include <functional>

using namespace structs;
using qx::detail::ReadingTrace;
using qx::detail::Unmarshalling;

namespace {

struct Leaf {
    std::string a = "none";
    int n = 1;
};
// Its own constructor gives its members other values than they have by themselves.
struct Branch {
    Branch() : leaf{"owner's", 7}, maybe(Leaf{"owner's", 8}), leaves(3, Leaf{"owner's", 9}) {}
    std::string a;
    Leaf leaf;
    std::optional<Leaf> maybe;
    std::vector<Leaf> leaves;
    void setWord(const std::string& word) {
        if (word == "thrown")
            throw std::runtime_error(word);
        if (onWord)
            onWord();
        _word = word;
    }
    const std::string& word() const { return _word; }
    inline static std::function<void()> onWord;

private:
    std::string _word;
};

constexpr const char* classes =
    "<Record xml='r'><a node='attribute'/><n type='int' node='element'/><b/>"
    "<c type='int' name='i'/></Record>"
    "<Word xml='w'><a node='attribute'/><b node='element'/><text node='text'/></Word>"
    "<List xml='l'><a node='attribute'/><items type='Leaf' collection='array' name='leaf'/>"
    "<numbers type='int' collection='array' name='number' location='numbers'/>"
    "<must node='element' required='true'/></List>"
    "<Leaf xml='leaf'><a/><n type='int' node='attribute'/></Leaf>"
    "<Branch xml='branch'><a node='attribute'/><leaf type='Leaf' node='element'/>"
    "<maybe type='Leaf' node='element'/><leaves type='Leaf' collection='array' name='item'/>"
    "<word node='element'/></Branch><Wood xml='wood'><plants collection='array'/></Wood>";

class UsualForm : public Structs {
protected:
    UsualForm() : Structs(classes) {}

    void SetUp() override {
        Structs::SetUp();
        qx::Class::define<Leaf>("Leaf").members<&Leaf::a, &Leaf::n>();
        qx::Class::define<Branch>("Branch")
            .members<&Branch::a, &Branch::leaf, &Branch::maybe, &Branch::leaves>()
            .property<&Branch::word, &Branch::setWord>("word");
    }
    void TearDown() override {
        qx::Class::forget("Leaf");
        qx::Class::forget("Branch");
        Structs::TearDown();
    }

    // The object, of a record the order of its keys and changes too, and the errors with places.
    std::string read(const std::string& document, bool hasSlot) {
        qx::Ref<qx::Error> error;
        std::string all;
        try {
            const auto object = marshaller->readString(document, hasSlot ? &error : nullptr);
            all = support::show(object);
            if (const auto record = object.as<QXGenericRecord>(); record && record->contents())
                all += support::oneLine(record->contents()->allKeys()) +
                       support::oneLine(record->changeCache()->allKeys());
        } catch (const std::exception& exception) {
            all = exception.what();
        }
        if (error)
            for (const auto& one : error->all())
                all += "\n" + one->report().str();
        return all;
    }
    // Expects the same of both ways.
    void compare(const std::string& document, bool hasSlot) {
        marshaller->setReportHandler(nullptr);
        const std::string usual = read(document, hasSlot);
        marshaller->setReportHandler([](const QXXMLReport&) {});
        EXPECT_EQ(usual, read(document, hasSlot)) << document;
    }
    // What a reading tells its trace; in single steps it goes the general way.
    std::string traceOf(const std::string& document, bool hasSlot, Unmarshalling::Use use) {
        const auto parsed = qx::XMLDocument::initWithData(document);
        qx::IndexedXML index(*parsed);
        ReadingTrace trace;
        qx::Ref<qx::Error> error;
        qx::Ref<qx::Error>* const slot = hasSlot ? &error : nullptr;
        qx::detail::ReadingProgress progress(*marshaller, index.size());
        qx::detail::ErrorCollector collector(*marshaller, slot);
        Unmarshalling reading(*marshaller, index, use);
        reading.setTrace(&trace);
        std::string all;
        try {
            reading.read(index.root(), slot, progress, collector);
        } catch (const std::exception& exception) {
            all = exception.what();
        }
        for (const ReadingTrace::Use& one : trace.uses())
            all += "\n" + trace.keyPath(one.owner, one.field).str() + " of " +
                   std::to_string(one.owner) + " made " + std::to_string(one.made) + " from " +
                   std::to_string(one.entry) + " as " + std::to_string(int(one.form)) + " name " +
                   std::to_string(one.binding) + " item " + std::to_string(one.item);
        for (const ReadingTrace::Owner& owner : trace.owners())
            all += "\n" + owner.plan->className.string().str() + " of " +
                   std::to_string(owner.element) + " by " + std::to_string(owner.use) + ": " +
                   std::to_string(owner.firstUse) + " to " + std::to_string(owner.usesEnd);
        return all;
    }
};

constexpr const char* documents[] = {
    "<r a='1' b='2' i='3'><n>4</n></r>",
    "<r a='1'><b>2</b><n/><i>5</i></r>",
    "<r i='none' a='x'/>",
    "<r>text<n>1</n></r>",
    "<w a='1'>text</w>",
    "<w> <!-- c -->\n</w>",
    "<w>t<!-- c -->u</w>",
    "<w a='1'>t<b>4</b></w>",
    "<r><n>1</n><n>2</n></r>",
    "<r><n>four</n></r>",
    "<r b='1'><b>2</b></r>",
    "<r z='1'/>",
    "<r><z/></r>",
    "<r xmlns:p='urn:p'><?i d?></r>",
    "<l><leaf a='1'/><!-- c --><leaf n='2'/> t <must/></l>",
    "<l><leaf/><must/><leaf/></l>",
    "<l><leaf n='x'/><leaf n='2'/><must/></l>",
    "<l><leaf a='1'/></l>",
    "<l><must/><numbers k='1'><number>1</number><z/>t<number>2</number></numbers></l>",
    "<l><must/><numbers/><numbers><number>1</number></numbers></l>",
    "<l><must/><numbers><number>1</number><number>two</number></numbers></l>",
    "<branch/>",
    "<branch a='1'><leaf/><maybe/><item/><item a='2'/></branch>",
    "<branch><leaf a='1'><a>2</a></leaf></branch>",
    "<branch><maybe n='1'/><leaf n='x'/></branch>",
    "<branch><item n='1'/><item z='2'/><item n='x'/></branch>",
    "<branch><item n='1'/><word>thrown</word></branch>",
    "<counted zero='1' cut='0.5'/>",
    "<counted plain='x' zero='2'/>"};

} // namespace

TEST_F(UsualForm, IsReadLikeAnyOtherAndTellsATraceTheSame) {
    testing::internal::CaptureStderr();
    for (const char* document : documents)
        for (unsigned options = 0; options < 64; ++options) {
            const bool hasSlot = (options & 16U) != 0;
            marshaller->setLenient((options & 1U) != 0);
            marshaller->setSaveUnknownXML((options & 2U) != 0);
            marshaller->setMaximumErrors((options & 4U) != 0 ? 5 : 1);
            marshaller->setKeepsPartial((options & 8U) != 0);
            marshaller->setKeepsExactly((options & 32U) != 0);
            compare(document, hasSlot);
            EXPECT_EQ(traceOf(document, hasSlot, Unmarshalling::Use::document),
                      traceOf(document, hasSlot, Unmarshalling::Use::steps))
                << document;
        }
    testing::internal::GetCapturedStderr();
}

TEST_F(UsualForm, StopsAtTheSameLimits) {
    const std::string document = "<l a='1'><leaf a='1'/><leaf n='2'/><must/></l>";
    for (std::size_t limit = 0; limit < 6; ++limit)
        for (const bool isOfDepth : {false, true}) {
            marshaller->setMaximumDepth(isOfDepth ? limit : 256);
            marshaller->setMaximumObjects({isOfDepth ? 100 : limit, 0});
            compare(document, true);
        }
}

// Whatever the owner's constructor made of them.
TEST_F(UsualForm, MakesStructsInPlaceFromTheirOwnDefaults) {
    const auto read = marshaller->readString<Branch>(
        "<branch><leaf n='2'/><maybe a='3'/><item/><item a='4'/></branch>");
    ASSERT_TRUE(read) << errorOf(read);
    EXPECT_EQ(read->leaf.a + std::to_string(read->leaf.n), "none2");
    EXPECT_EQ(read->maybe->a + std::to_string(read->maybe->n), "31");
    ASSERT_EQ(read->leaves.size(), 2U);
    EXPECT_EQ(read->leaves[0].a + read->leaves[1].a, "none4");
    const auto none = marshaller->readString<Branch>("<branch/>");
    EXPECT_EQ(none->leaves.size(), 3U);
}

// A marshaller keeps what it has found out about classes, as long as that holds.
TEST_F(UsualForm, TellsWhenClassesComeAndGo) {
    struct Sheet {
        int a = 0;
    };
    const auto shown = [&] { return support::show(marshaller->readString("<leaf a='5'/>")); };
    const std::string asLeaf = shown();
    EXPECT_EQ(shown(), asLeaf);
    Branch::onWord = [&] {
        qx::Class::forget("Leaf");
        qx::Class::define<Sheet>("Leaf").members<&Sheet::a>();
        EXPECT_EQ(support::show(marshaller->readString("<leaf a='5'/>")), "Leaf{a: 5}");
    };
    const auto read = marshaller->readString("<branch><leaf n='2'/><word>w</word></branch>");
    Branch::onWord = nullptr;
    EXPECT_TRUE(read);
    EXPECT_EQ(shown(), "Leaf{a: 5}");
    qx::Class::forget("Leaf");
    EXPECT_EQ(marshaller->readString("<leaf a='5'/>")->isa().name(), "QXGenericRecord");
    qx::Class::define<Leaf>("Leaf").members<&Leaf::a, &Leaf::n>();
    EXPECT_EQ(shown(), asLeaf);

    Branch::onWord = [] { qx::Class::forget("Leaf"); };
    const auto wood =
        marshaller->readString("<wood><branch><word>w</word></branch><leaf a='5'/></wood>");
    Branch::onWord = nullptr;
    EXPECT_EQ(wood->valueForKey("plants").as<qx::Array>()->at(1).object()->isa().name(),
              "QXGenericRecord");
}
