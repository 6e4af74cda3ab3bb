// Members that hold objects of several classes: which one stands there, the element's name says.

#include "Structs.h"

#include <algorithm>
#include <map>
#include <regex>

using structs::errorOf;

namespace {

// Nobody describes it: it has no members.
struct Form {
    virtual ~Form() = default;
    virtual double area() const = 0;
};
struct Disc : Form {
    double radius = 0;
    double area() const override { return 3 * radius * radius; }
};
struct Ring : Disc {
    double hole = 0;
};
struct Label {
    std::string text;
};
struct Caption : Label {
    int size = 0;
};
class Animal : public QXMappedObject {
public:
    std::string name;
};
class Dog : public Animal {
public:
    int age = 0;
};

struct Members {
    std::unique_ptr<Form> own;
    std::shared_ptr<Form> shared;
    std::optional<std::variant<Disc, std::unique_ptr<Form>>> maybe;
    std::variant<std::monostate, std::string, Label, qx::Ref<Animal>> either;
    qx::Ref<Animal> animal;
    std::shared_ptr<Label> label;
    Label place;
    std::vector<std::unique_ptr<Form>> owned;
    std::vector<std::shared_ptr<Form>> common;
    std::vector<std::variant<Label, Caption, std::unique_ptr<Form>>> mixed;
    std::vector<qx::Ref<Animal>> animals;
};
struct Struct : Members {};
class Hosted : public QXMappedObject, public Members {
public:
    const qx::Ref<Animal>& animalOf() const { return animal; }
    void setAnimal(const qx::Ref<Animal>& taken) { animal = taken; }
};

// What the classes are written as, and which of them each member takes.
const std::map<std::string, std::string> elements = {
    {"Disc", R"(<disc radius="1"></disc>)"},
    {"Ring", R"(<ring radius="2" hole="1"></ring>)"},
    {"Label", R"(<label text="t"></label>)"},
    {"Caption", R"(<caption text="c" size="7"></caption>)"},
    {"Animal", R"(<animal name="a"></animal>)"},
    {"Dog", R"(<dog name="d" age="3"></dog>)"},
    {"QXGenericRecord", "<nobody></nobody>"}};
const std::map<std::string, std::vector<std::string>> taken = {
    {"own", {"Disc", "Ring"}},     {"shared", {"Disc", "Ring"}},
    {"maybe", {"Disc", "Ring"}},   {"either", {"Animal", "Dog", "Label"}},
    {"animal", {"Animal", "Dog"}}, {"label", {"Label"}},
    {"place", {"Label"}},          {"owned", {"Disc", "Ring"}},
    {"common", {"Disc", "Ring"}},  {"mixed", {"Caption", "Disc", "Label", "Ring"}},
    {"animals", {"Animal", "Dog"}}};
bool isList(const std::string& key) {
    return key == "owned" || key == "common" || key == "mixed" || key == "animals";
}

// Lists stand in the element of their name; single members take what they find first.
std::string mapping(const std::string& key) {
    std::string field = "<" + key + " name='" + key + "'";
    field += isList(key) ? " collection='array'>" : " node='element'>";
    for (const char* name : {"disc", "ring", "label", "caption", "animal", "dog", "nobody"})
        field += isList(key) ? "" : std::string("<alt-xml name='") + name + "'/>";
    return "<Members xml='Members'>" + field + "</" + key +
           "></Members><Disc xml='disc'><radius node='attribute'/></Disc>"
           "<Ring xml='ring' extends='Disc'><hole node='attribute'/></Ring>"
           "<Label xml='label'><text node='attribute'/></Label>"
           "<Caption xml='caption' extends='Label'><size node='attribute'/></Caption>"
           "<Animal xml='animal'><name node='attribute'/></Animal>"
           "<Dog xml='dog' extends='Animal'><age node='attribute'/></Dog><Nobody xml='nobody'/>";
}

class Polymorphism : public testing::Test {
protected:
    void SetUp() override {
        qx::Class::define<Disc, Form>("Disc").members<&Disc::radius>();
        qx::Class::define<Ring, Disc>("Ring").members<&Ring::hole>();
        qx::Class::define<Label>("Label").members<&Label::text>();
        qx::Class::define<Caption, Label>("Caption").members<&Caption::size>();
        qx::Class::define<Animal, QXMappedObject>("Animal").members<&Animal::name>();
        qx::Class::define<Dog, Animal>("Dog").members<&Dog::age>();
    }
    void TearDown() override {
        for (const char* name : {"Disc", "Ring", "Label", "Caption", "Animal", "Dog", "Members"})
            qx::Class::forget(name);
    }
};

template <class T>
auto describe(qx::ClassBuilder<T>&& builder) {
    builder.template members<&T::own, &T::shared, &T::maybe, &T::either, &T::label, &T::place>()
        .template members<&T::owned, &T::common, &T::mixed, &T::animals>();
    if constexpr (std::is_same_v<T, Struct>)
        builder.template members<&T::animal>();
    else
        builder.template property<&T::animalOf, &T::setAnimal>("animal");
}

// What becomes of the document when it is read as a T and written; the error, without addresses.
template <class T>
std::string readAndWritten(QXXMLMarshaller& marshaller, const std::string& document) {
    const auto read = marshaller.readString<T>(document);
    if (!read)
        return std::regex_replace(errorOf(read), std::regex(": 0x[0-9a-f]+>[^>]* for"), "> for");
    return marshaller.marshall(*read)->rootElement()->XMLString().str();
}

template <class T>
void checkMembersOf() {
    for (const auto& [key, classes] : taken) {
        const auto marshaller = scenario::marshaller(mapping(key));
        std::string names;
        for (const std::string& name : classes)
            names += (names.empty() ? "" : ", ") + name;
        for (const auto& [name, element] : elements) {
            const bool isTaken = std::ranges::find(classes, name) != classes.end();
            const std::string content =
                isList(key) ? "<" + key + ">" + element + "</" + key + ">" : element;
            const std::string document = "<Members>" + content + "</Members>";
            EXPECT_EQ(readAndWritten<T>(*marshaller, document),
                      isTaken
                          ? document
                          : "-222: Unable to set value: <" + name + "> for key: " + key +
                                " in class: Members, which takes: " + names + " (Invalid Value)");
        }
    }
}

} // namespace

TEST_F(Polymorphism, IsByTheNamesOfElements) {
    describe(qx::Class::define<Struct>("Members"));
    checkMembersOf<Struct>();
    qx::Class::forget("Members");
    describe(qx::Class::define<Hosted, QXMappedObject>("Members"));
    checkMembersOf<Hosted>();
}

TEST_F(Polymorphism, KeepsAListThatIsRefusedAsItIs) {
    describe(qx::Class::define<Struct>("Members"));
    qx::Boxed<Struct> members;
    for (const char* key : {"owned", "mixed"}) {
        const auto list = qx::make<qx::Array>();
        list->add(qx::make<qx::Boxed<Disc>>());
        list->add(qx::make<Animal>());
        list->at(0).object()->setValueForKey(5, "radius");
        EXPECT_EQ(members.trySetValueForKey(list, key), qx::SetOutcome::refused);
        EXPECT_EQ(list->at(0).object()->valueForKey("radius"), 5) << "it was moved out";
    }
    EXPECT_TRUE(members->owned.empty() && members->mixed.empty());
}

// Nothing could be read again of what stands for a struct's address.
TEST_F(Polymorphism, WritesNoStructThatTheMappingDoesNotHave) {
    describe(qx::Class::define<Struct>("Members"));
    struct Secret : Form {
        double area() const override { return 0; }
    };
    for (const char* node : {"element", "any"}) {
        const auto marshaller = scenario::marshaller(std::string("<Members><own node='") + node +
                                                     "'/></Members><Label/>");
        Struct members;
        for (const bool isDescribed : {true, false}) {
            if (isDescribed)
                members.own = std::make_unique<Disc>();
            else
                members.own = std::make_unique<Secret>();
            qx::Ref<qx::Error> error;
            EXPECT_FALSE(marshaller->marshall(members, &error));
            EXPECT_NE(support::told(error).find("-211: No mapping definition for class: "),
                      std::string::npos)
                << support::told(error);
        }
    }
}
