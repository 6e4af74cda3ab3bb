// A plug-in that describes a struct for as long as it is loaded, and a class whose name is taken.

#include <QXXMLMarshalling/QXXMLMarshalling.h>

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
    qx::Class::define<Torch>("Lamp").registration(),
};

} // namespace

extern "C" QX_API int readPart(QXXMLMarshaller& marshaller) {
    const auto part = marshaller.readString<Part>("<Part number='7' size='L'/>");
    return part && part->size == Size::large ? part->number : -1;
}
