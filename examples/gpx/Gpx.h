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

void describeClasses();

// Renames the first waypoint, route or track that is called so. False where nothing is.
bool rename(Gpx& gpx, const std::string& from, const std::string& to);

} // namespace gpx
