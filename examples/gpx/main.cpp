// Tells what is in a GPX file. With two names more, renames a waypoint, route or track there, and
// leaves the rest of the file as it is.
//
//     example_gpx FILE [FROM TO]

#include "Gpx.h"

#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include <cmath>
#include <iostream>
#include <numbers>

namespace {

// In metres, on a round earth.
double distance(const gpx::Point& a, const gpx::Point& b) {
    constexpr double radius = 6371000, degree = std::numbers::pi / 180;
    const double y = std::sin((b.lat - a.lat) * degree / 2);
    const double x = std::sin((b.lon - a.lon) * degree / 2);
    const double h = y * y + std::cos(a.lat * degree) * std::cos(b.lat * degree) * x * x;
    return 2 * radius * std::asin(std::sqrt(h));
}

void tell(const gpx::Gpx& gpx) {
    for (const gpx::Point& point : gpx.waypoints)
        std::cout << "waypoint " << point.name.value_or("without a name") << '\n';
    for (const gpx::Path& route : gpx.routes)
        std::cout << "route " << route.name.value_or("without a name") << ", "
                  << route.points.size() << " points\n";
    for (const gpx::Track& track : gpx.tracks) {
        double length = 0;
        for (const gpx::Path& segment : track.segments)
            for (std::size_t i = 1; i < segment.points.size(); ++i)
                length += distance(segment.points[i - 1], segment.points[i]);
        std::cout << "track " << track.name.value_or("without a name") << ", "
                  << track.segments.size() << " segments, " << std::lround(length) << " m\n";
    }
}

int fail(const qx::Ref<qx::Error>& error) {
    std::cerr << "gpx: " << error->report().view() << '\n';
    return 1;
}

} // namespace

int main(int count, char** arguments) {
    if (count != 2 && count != 4) {
        std::cerr << "usage: example_gpx FILE [FROM TO]\n";
        return 2;
    }
    gpx::describeClasses();
    qx::Ref<qx::Error> error;
    const auto marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller)
        return fail(error);
    // Extensions are unknown here, and are to stay.
    marshaller->setReportHandler([](const QXXMLReport&) {});
    const auto file = QXXMLDocumentFile::open(arguments[1], marshaller, &error);
    if (!file)
        return fail(error);
    auto* gpx = file->root<gpx::Gpx>();
    if (count == 4 && !gpx::rename(*gpx, arguments[2], arguments[3])) {
        std::cerr << "gpx: nothing is called " << arguments[2] << '\n';
        return 1;
    }
    tell(*gpx);
    return file->save(&error) ? 0 : fail(error);
}
