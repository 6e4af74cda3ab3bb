#pragma once

// The classes of a document and of those that it includes, in the order in which they are merged:
// each document's own, then those of its includes, depth first. What one document brings along,
// its includes among it, is thus one stretch of the list, and has to name no class and no element
// twice in itself. Each class is looked at once, however deep the includes nest.

#include "mapping/MappingSource.h"
#include "model/Errors.h"
#include "plan/MappingPlan.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace qx::detail {

class MergedClasses {
public:
    std::size_t count() const noexcept { return _count; }

    void add(const QXXMLDocumentMapping& document) {
        for (const auto& mapping : document.classMappings())
            add(*mapping);
    }

    // Whether the classes behind the first `begin` ones have names of their own; else false with
    // the error for the first that has not:
    //   -205  "Class redefined: %@"
    //   -205  "Element redefined: %@ class: %@"
    bool areDistinctFrom(std::size_t begin, Ref<Error>* error) const {
        if (_latestRepeated <= begin)
            return true;
        const auto isIn = [begin](const Repeated& repeated) { return repeated.latest() > begin; };
        return isRefused(*std::find_if(_repeated.begin(), _repeated.end(), isIn), begin, error);
    }

    // Calls visit(QXXMLClassMapping&, Ref<Error>) for each class behind the first `begin` ones that
    // has no names of its own, once.
    template <class Visit>
    void tellRepeatedFrom(std::size_t begin, Visit visit) {
        if (_latestRepeated <= begin)
            return;
        for (Repeated& repeated : _repeated) {
            if (repeated.isTold || repeated.latest() <= begin)
                continue;
            repeated.isTold = true;
            Ref<Error> error;
            isRefused(repeated, begin, &error);
            visit(*repeated.mapping, std::move(error));
        }
    }

private:
    // Positions count from 1; 0 stands for none.
    struct Position {
        std::size_t number = 0;
        const QXXMLClassMapping* mapping = nullptr;
    };
    using Latest = std::unordered_map<String, Position>;
    struct Repeated {
        const QXXMLClassMapping* mapping;
        std::size_t sameClass; // the latest class before it that has its name
        std::size_t sameElement;
        const QXXMLClassMapping* withClass; // those
        const QXXMLClassMapping* withElement;
        bool isTold = false; // see tellRepeatedFrom
        std::size_t latest() const noexcept { return std::max(sameClass, sameElement); }
    };

    static std::string written(const DocumentPlace& place) {
        return (place.documentName.isNull() ? "" : place.documentName.str() + ":") +
               std::to_string(place.line) + ":" + std::to_string(place.column);
    }

    static bool isRefused(const Repeated& repeated, std::size_t begin, Ref<Error>* error) {
        const QXXMLClassMapping& mapping = *repeated.mapping;
        if (repeated.sameClass > begin)
            fail(error, errors::classRedefined, mapping.className());
        else
            fail(error, errors::elementRedefined, MappingPlan::elementNameOf(mapping),
                 mapping.className());
        if (error != nullptr) {
            MappingSource::of(mapping).locate(*error, MappingSource::elementOf(mapping));
            const QXXMLClassMapping& first =
                repeated.sameClass > begin ? *repeated.withClass : *repeated.withElement;
            const std::string place = written(first.place());
            ErrorDetails::suggest(**error, place == written(mapping.place())
                                               ? String("its document is included twice")
                                               : String("class \"" + first.className().str() +
                                                        "\" stands at " + place + ", too"));
        }
        return false;
    }

    void add(const QXXMLClassMapping& mapping) {
        ++_count;
        const Position here{_count, &mapping};
        const Position sameClass = std::exchange(_byClassName[mapping.className()], here);
        const Position sameElement =
            std::exchange(_byElementName[MappingPlan::elementNameOf(mapping)], here);
        if (sameClass.number == 0 && sameElement.number == 0)
            return;
        _repeated.push_back({&mapping, sameClass.number, sameElement.number, sameClass.mapping,
                             sameElement.mapping});
        _latestRepeated = std::max(_latestRepeated, _repeated.back().latest());
    }

    std::size_t _count = 0;
    Latest _byClassName;
    Latest _byElementName;
    std::vector<Repeated> _repeated;
    std::size_t _latestRepeated = 0;
};

} // namespace qx::detail
