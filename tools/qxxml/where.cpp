#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Session.h"

#include <algorithm>

namespace qxxml {

namespace {

struct Search {
    std::vector<std::string> places; // that were looked at, in order
    qx::String path;                 // null when none of them has the name

    // The same place is looked at once: without a version two of them are one.
    void lookIn(const qx::String& place, const qx::String& found) {
        if (!path.isNull())
            return;
        if (std::find(places.begin(), places.end(), place.view()) == places.end())
            places.push_back(place.str());
        path = found;
    }
};

// Asks for the name in one place after the other, as the repository does.
Search searchFor(const qx::String& name, ToolRepository& repository) {
    Search search;
    const auto directories = repository.searchPaths();
    const auto bundles = repository.searchBundles();
    repository.setSearchBundles(nullptr);
    for (const qx::Value& directory : *directories) {
        repository.setSearchPaths(qx::make<qx::Array>(std::vector<qx::Value>{directory}));
        search.lookIn(directory.string(), repository.pathForResourceNamed(name));
    }
    for (const qx::Value& item : *bundles)
        if (const auto bundle = item.as<qx::Bundle>())
            search.lookIn(bundle->bundlePath(), bundle->pathForResource(name));
    return search;
}

} // namespace

std::string where(const Options& options) {
    const Session session(options);
    const Search search = searchFor(options.name, session.repository());
    std::string looked;
    for (const std::string& place : search.places)
        looked += "looked in " + place + "\n";
    if (search.path.isNull()) {
        looked.pop_back();
        throw Failure("260: " + message("There is no document of the name: %@", options.name) +
                      "\n" + looked);
    }
    return search.path.str() + "\n" + looked;
}

} // namespace qxxml
