// Reads a GPX file into plain structs, tells what is in it and writes it again.

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <iostream>

enum class Fix { none, flat, full, dgps };
struct Point {
    double lat = 0, lon = 0;
    std::optional<double> elevation;
    std::optional<qx::DateTime> time;
    std::optional<std::string> name;
    std::optional<Fix> fix;
    QXUnknownXML unknown; // extensions, among others
};
struct Path { // a route, or a segment of a track
    std::optional<std::string> name;
    std::vector<Point> points;
    QXUnknownXML unknown;
};
struct Track {
    std::optional<std::string> name;
    std::vector<Path> segments;
    QXUnknownXML unknown;
};
struct Gpx {
    std::string version;
    std::vector<Point> waypoints;
    std::vector<Path> routes;
    std::vector<Track> tracks;
    QXUnknownXML unknown;
};

int main(int, char** arguments) {
    qx::Class::define<Point>("Point")
        .members<&Point::lat, &Point::lon, &Point::elevation, &Point::time, &Point::name,
                 &Point::fix, &Point::unknown>()
        .names({{Fix::none, "none"}, {Fix::flat, "2d"}, {Fix::full, "3d"}, {Fix::dgps, "dgps"}});
    qx::Class::define<Path>("Path").members<&Path::name, &Path::points, &Path::unknown>();
    qx::Class::define<Track>("Track").members<&Track::name, &Track::segments, &Track::unknown>();
    qx::Class::define<Gpx>("Gpx")
        .members<&Gpx::version, &Gpx::waypoints, &Gpx::routes, &Gpx::tracks, &Gpx::unknown>();
    const auto marshaller = QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml");
    const auto gpx = marshaller->readFile<Gpx>(arguments[1]);
    if (gpx)
        std::cout << gpx->waypoints.size() << " waypoints, " << gpx->tracks.size() << " tracks\n";
    else
        std::cerr << gpx.error()->localizedDescription().view() << '\n';
    return gpx && marshaller->writeFile(*gpx, arguments[2]) ? 0 : 1;
}
