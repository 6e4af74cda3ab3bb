// Describes classes in every way that C++ offers, and one in a plug-in that comes and goes; prints
// what is wrong. Compiled with PLUG_IN it is the plug-in.
//
// usage: registrations PLUG_IN

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <iostream>

#include <dlfcn.h>

#ifdef PLUG_IN
namespace {
enum class Size { small, large };
struct Part {
    int number = 0;
    Size size = Size::small;
    std::unique_ptr<Part> next;
};
struct Torch : qx::Object {};
const qx::ClassRegistration registrations[] = {
    qx::Class::define<Part>("Part")
        .members<&Part::number, &Part::size, &Part::next>()
        .names({{Size::small, "S"}, {Size::large, "L"}})
        .registration(),
    qx::Class::define<Torch>("Lamp").registration(), // the name is taken
};
} // namespace

extern "C" QX_API int readPart(QXXMLMarshaller& marshaller) {
    const auto part = marshaller.readString<Part>("<Part number='7' size='L'/>");
    return part && part->size == Size::large ? part->number : -1;
}
#else
namespace {

int failures = 0;

void expect(bool holds, const char* what) {
    if (holds)
        return;
    std::cout << "failed: " << what << '\n';
    ++failures;
}

class Named {
public:
    std::string name;
    int size() const noexcept { return _size; }
    void setSize(int size) noexcept { _size = size; }

private:
    int _size = 0;
};
class Priced {
public:
    double price() const { return _price; }
    double price(int times) const { return _price * times; }
    void price(const double& price) { _price = price; }
    void price(const char*) {}

private:
    double _price = 0;
};
class Item : public qx::Object, public virtual Named, public Priced {};
class Kit : public Item {
public:
    int parts = 0;
};
class Lamp : public virtual qx::Object {
public:
    bool isOn = false;
};
struct Shop : virtual Named, Priced {
    int doors = 0;
};

void define() {
    qx::Class::define<Kit, Item>("Kit").members<&Kit::parts>(); // before its base
    qx::Class::define<Item>("Item")
        .members<&Item::name>()
        .property<&Item::size, &Item::setSize>("size")
        .property<double>("price", &Priced::price, &Priced::price)
        .property<&Named::size>("extent");
    qx::Class::define<Lamp>("Lamp").member<&Lamp::isOn>("on");
    qx::Class::define<Shop>("Shop")
        .members<&Shop::name, &Shop::doors>()
        .property<static_cast<double (Priced::*)() const>(&Shop::price),
                  static_cast<void (Priced::*)(const double&)>(&Shop::price)>("price");
}

qx::Ref<QXXMLMarshaller> marshaller() {
    std::string text = "<mapping>";
    using Names = std::vector<const char*>;
    for (const Names& names :
         {Names{"Kit", "parts", "name", "size", "price"}, Names{"Lamp", "on"},
          Names{"Shop", "name", "doors", "price"}, Names{"Part", "number", "size"}}) {
        const std::string type = names.front();
        text += "<class name='" + type + "'><map-to xml='" + type + "'/>";
        for (std::size_t i = 1; i < names.size(); ++i)
            text +=
                std::string("<field name='") + names[i] + "'><bind-xml node='attribute'/></field>";
        text += "</class>";
    }
    return QXXMLMarshaller::initWithMappingXML(
        qx::XMLDocument::initWithData(text + "</mapping>").get());
}

bool comesBack(QXXMLMarshaller& marshaller, const std::string& text, const char* className) {
    const auto object = marshaller.readString(text);
    return object && object->isa().name() == className &&
           marshaller.marshall(object)->rootElement()->XMLString() == text;
}

// What the plug-in describes is read as long as it is there; records come afterwards.
void loadAndUnload(QXXMLMarshaller& marshaller, const char* path) {
    const std::string text = R"(<Part number="7" size="L"></Part>)";
    for (int round = 0; round < 2; ++round) {
        expect(comesBack(marshaller, text, "QXGenericRecord"), "records without the plug-in");
        void* const plugIn = dlopen(path, RTLD_NOW | RTLD_LOCAL);
        if (plugIn == nullptr)
            return expect(false, dlerror());
        expect(comesBack(marshaller, text, "Part"), "the class of the plug-in");
        const auto readPart =
            reinterpret_cast<int (*)(QXXMLMarshaller&)>(dlsym(plugIn, "readPart"));
        expect(readPart(marshaller) == 7, "structs inside the plug-in");
        dlclose(plugIn);
        expect(dlopen(path, RTLD_NOW | RTLD_NOLOAD) == nullptr, "the plug-in is unloaded");
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
    expect(comesBack(*used, R"(<Kit parts="2" name="n" size="3" price="1.5"></Kit>)", "Kit"),
           "members of bases and virtual bases");
    const auto kit = used->readString<Kit>("<Kit size='3'/>");
    expect(kit && (*kit)->valueForKey("extent") == 3, "a getter of a virtual base");
    expect(comesBack(*used, R"(<Lamp on="1"></Lamp>)", "Lamp"), "Object as a virtual base");
    expect(comesBack(*used, R"(<Shop name="n" doors="2" price="0.5"></Shop>)", "Shop"), "a struct");
    defineTwice();
    loadAndUnload(*used, arguments[1]);
    return failures == 0 ? 0 : 1;
}
#endif
