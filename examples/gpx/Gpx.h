#pragma once

// GPX files as plain structs: waypoints, routes and tracks. Extensions, and whatever else a file
// holds, stay in the members of type QXUnknownXML.

#include <QXXMLMarshalling/QXUnknownXML.h>
#include <QXXMLMarshalling/model/DateTime.h>

namespace gpx {

enum class Fix { none, flat, full, dgps };
struct Point {
    double lat = 0, lon = 0;
    std::optional<double> elevation;
    std::optional<qx::DateTime> time;
    std::optional<std::string> name;
    std::optional<Fix> fix;
    QXUnknownXML unknown;
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

inline void describeClasses() {
    qx::Class::define<Point>("Point")
        .members<&Point::lat, &Point::lon, &Point::elevation, &Point::time, &Point::name,
                 &Point::fix, &Point::unknown>()
        .names({{Fix::none, "none"}, {Fix::flat, "2d"}, {Fix::full, "3d"}, {Fix::dgps, "dgps"}});
    qx::Class::define<Path>("Path").members<&Path::name, &Path::points, &Path::unknown>();
    qx::Class::define<Track>("Track").members<&Track::name, &Track::segments, &Track::unknown>();
    qx::Class::define<Gpx>("Gpx")
        .members<&Gpx::version, &Gpx::waypoints, &Gpx::routes, &Gpx::tracks, &Gpx::unknown>();
}

// Renames the first waypoint, route or track that is called so. False where nothing is.
inline bool rename(Gpx& gpx, const std::string& from, const std::string& to) {
    const auto renamed = [&](auto& items) {
        for (auto& item : items)
            if (item.name == from)
                return item.name = to, true;
        return false;
    };
    return renamed(gpx.waypoints) || renamed(gpx.routes) || renamed(gpx.tracks);
}

} // namespace gpx
