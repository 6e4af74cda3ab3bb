#include "Gpx.h"

namespace gpx {

void describeClasses() {
    qx::Class::define<Point>("Point")
        .members<&Point::lat, &Point::lon, &Point::elevation, &Point::time, &Point::name,
                 &Point::fix, &Point::unknown>()
        .names({{Fix::none, "none"}, {Fix::flat, "2d"}, {Fix::full, "3d"}, {Fix::dgps, "dgps"}});
    qx::Class::define<Path>("Path").members<&Path::name, &Path::points, &Path::unknown>();
    qx::Class::define<Track>("Track").members<&Track::name, &Track::segments, &Track::unknown>();
    qx::Class::define<Gpx>("Gpx")
        .members<&Gpx::version, &Gpx::waypoints, &Gpx::routes, &Gpx::tracks, &Gpx::unknown>();
}

bool rename(Gpx& gpx, const std::string& from, const std::string& to) {
    const auto renamed = [&](auto& items) {
        for (auto& item : items)
            if (item.name == from)
                return item.name = to, true;
        return false;
    };
    return renamed(gpx.waypoints) || renamed(gpx.routes) || renamed(gpx.tracks);
}

} // namespace gpx
