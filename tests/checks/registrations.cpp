// Describes classes in every way that C++ offers, and one in a plug-in that comes and goes; prints
// what is wrong.
//
// usage: registrations PLUG_IN

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <iostream>

#include <dlfcn.h>

namespace {

int failures = 0;

void expect(bool holds, const char* what) {
    if (!holds) {
        std::cout << "failed: " << what << '\n';
        ++failures;
    }
}

class Named {
public:
    virtual ~Named() = default;
    std::string name;
    int size() const noexcept { return _size; }
    void setSize(int size) noexcept { _size = size; }

private:
    int _size = 0;
};
class Counted {
public:
    virtual ~Counted() = default;
    std::optional<int> count;
    double price() const { return _price; }
    double price(int times) const { return _price * times; }
    void price(const double& price) { _price = price; }
    void price(const char*) {}

private:
    double _price = 0;
};
class Item : public qx::Object, public virtual Named, public Counted {};
class Kit : public virtual Item {
public:
    int parts = 0;
};
class Lamp : public virtual qx::Object {
public:
    bool isOn() const noexcept { return _isOn; }
    bool setOn(bool isOn) noexcept { return _isOn = isOn; }

private:
    bool _isOn = false;
};
struct Place {
    std::string city;
};
struct Shop : virtual Place, Counted {
    int doors = 0;
};

// Derived before base, members under their own names and under others, of bases and virtual bases.
void define() {
    qx::Class::define<Kit, Item>("Kit").members<&Kit::parts, &Kit::count>();
    qx::Class::define<Item>("Item")
        .members<&Item::name>()
        .member<&Counted::count>("number")
        .property<&Item::size, &Item::setSize>("size")
        .property<double>("price", &Counted::price, &Counted::price)
        .property<&Named::size>("extent");
    qx::Class::define<Lamp>("Lamp").property<&Lamp::isOn, &Lamp::setOn>("on");
    qx::Class::define<Shop>("Shop")
        .members<&Shop::city, &Shop::doors>()
        .property<static_cast<double (Counted::*)() const>(&Shop::price),
                  static_cast<void (Counted::*)(const double&)>(&Shop::price)>("price");
}

std::string mappingOf(const std::string& name, std::initializer_list<const char*> fields) {
    std::string text = "<class name='" + name + "'><map-to xml='" + name + "'/>";
    for (const char* field : fields)
        text += std::string("<field name='") + field + "'><bind-xml node='attribute'/></field>";
    return text + "</class>";
}

qx::Ref<QXXMLMarshaller> marshaller() {
    const std::string text =
        "<mapping>" + mappingOf("Kit", {"parts", "count", "name", "number", "size", "price"}) +
        mappingOf("Lamp", {"on"}) + mappingOf("Shop", {"city", "doors", "price"}) +
        mappingOf("Part", {"number", "size"}) + "</mapping>";
    return QXXMLMarshaller::initWithMappingXML(qx::XMLDocument::initWithData(text).get());
}

bool comesBack(QXXMLMarshaller& marshaller, const std::string& text, const char* className) {
    const auto object = marshaller.readString(text);
    return object && object->isa().name() == className &&
           marshaller.marshall(object)->rootElement()->XMLString() == text;
}

void readAndWrite(QXXMLMarshaller& marshaller) {
    const auto kit =
        marshaller.readString<Kit>("<Kit parts='2' number='7' name='n' size='3' price='1.5'/>");
    expect(kit && (*kit)->parts == 2 && (*kit)->count == 7 && (*kit)->name == "n" &&
               (*kit)->size() == 3 && (*kit)->price() == 1.5,
           "members of bases and virtual bases");
    expect(kit && (*kit)->valueForKey("extent") == 3, "a getter of a virtual base");
    expect(comesBack(marshaller, R"(<Lamp on="1"></Lamp>)", "Lamp"), "Object as a virtual base");
    expect(comesBack(marshaller, R"(<Shop city="Bath" doors="2" price="0.5"></Shop>)", "Shop"),
           "a struct with bases");
}

using Entry = int (*)(QXXMLMarshaller&);

// What the plug-in describes is read as long as it is there; records come afterwards.
void loadAndUnload(QXXMLMarshaller& marshaller, const char* path) {
    const std::string text = R"(<Part number="7" size="L"></Part>)";
    for (int round = 0; round < 2; ++round) {
        expect(comesBack(marshaller, text, "QXGenericRecord"), "records without the plug-in");
        void* const plugIn = dlopen(path, RTLD_NOW | RTLD_LOCAL);
        if (plugIn == nullptr) {
            std::cout << dlerror() << '\n';
            ++failures;
            return;
        }
        expect(comesBack(marshaller, text, "Part"), "the class of the plug-in");
        expect(reinterpret_cast<Entry>(dlsym(plugIn, "readPart"))(marshaller) == 7,
               "structs inside the plug-in");
        expect(qx::Class::named("Lamp") != nullptr, "a class of its host");
        dlclose(plugIn);
        expect(dlopen(path, RTLD_NOW | RTLD_NOLOAD) == nullptr, "the plug-in is unloaded");
        expect(qx::Class::named("Part") == nullptr, "its class is gone");
        expect(qx::Class::named("Lamp") != nullptr, "a class of its host, whose name it wanted");
    }
    expect(comesBack(marshaller, text, "QXGenericRecord"), "records in place of it");
}

// The first description of a name or of a type stays, and with it its registration.
void defineTwice() {
    struct One {};
    struct Two {};
    auto one = qx::Class::define<One>("One").registration();
    {
        const auto again = qx::Class::define<One>("Again").registration();
        const auto two = qx::Class::define<Two>("One").registration();
        expect(qx::Class::named("Again") == nullptr, "a type twice");
        expect(qx::Class::named("One")->type() == typeid(One), "a name twice");
    }
    expect(qx::Class::named("One") != nullptr && qx::Class::described(typeid(Two)) == nullptr,
           "registrations take back their own");
    one = {};
    expect(qx::Class::named("One") == nullptr, "a registration that ends");
}

} // namespace

int main(int, char** arguments) {
    define();
    const auto used = marshaller();
    readAndWrite(*used);
    defineTwice();
    loadAndUnload(*used, arguments[1]);
    return failures == 0 ? 0 : 1;
}
