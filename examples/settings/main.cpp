// Lists the palette of a settings file. With a shape's name and a factor more, makes that shape so
// much larger, and leaves the rest of the file as it is.
//
//     example_settings FILE [SHAPE FACTOR]

#include "Settings.h"

#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include <cstdlib>
#include <iostream>

namespace {

int fail(std::string_view reason) {
    std::cerr << "settings: " << reason << '\n';
    return 1;
}

} // namespace

int main(int count, char** arguments) {
    if (count != 2 && count != 4) {
        std::cerr << "usage: example_settings FILE [SHAPE FACTOR]\n";
        return 2;
    }
    settings::describeClasses();
    qx::Ref<qx::Error> error;
    const auto marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller)
        return fail(error->report());
    // What the palette does not know is kept: nobody needs to hear of it.
    marshaller->setReportHandler([](const QXXMLReport&) {});
    const auto file = QXXMLDocumentFile::open(arguments[1], marshaller, &error);
    if (!file)
        return fail(error->report());
    const auto& palette = file->root<settings::Settings>()->palette;
    if (count == 4) {
        settings::Shape* shape = settings::shapeNamed(palette, arguments[2]);
        if (shape == nullptr)
            return fail("no shape is called " + std::string(arguments[2]));
        shape->scale(std::strtod(arguments[3], nullptr));
    }
    for (const auto& shape : palette)
        std::cout << shape->name << ", area " << shape->area() << '\n';
    return file->save(&error) ? 0 : fail(error->report());
}
