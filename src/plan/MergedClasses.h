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
    using Latest = std::unordered_map<String, std::size_t>;
    struct Repeated {
        const QXXMLClassMapping* mapping;
        std::size_t sameClass; // the latest class before it that has its name
        std::size_t sameElement;
        bool isTold = false; // see tellRepeatedFrom
        std::size_t latest() const noexcept { return std::max(sameClass, sameElement); }
    };

    static bool isRefused(const Repeated& repeated, std::size_t begin, Ref<Error>* error) {
        const QXXMLClassMapping& mapping = *repeated.mapping;
        if (repeated.sameClass > begin)
            fail(error, errors::classRedefined, mapping.className());
        else
            fail(error, errors::elementRedefined, MappingPlan::elementNameOf(mapping),
                 mapping.className());
        if (error != nullptr)
            MappingSource::of(mapping).locate(*error, MappingSource::elementOf(mapping));
        return false;
    }

    void add(const QXXMLClassMapping& mapping) {
        ++_count;
        const std::size_t sameClass = std::exchange(_byClassName[mapping.className()], _count);
        const std::size_t sameElement =
            std::exchange(_byElementName[MappingPlan::elementNameOf(mapping)], _count);
        if (sameClass == 0 && sameElement == 0)
            return;
        _repeated.push_back({&mapping, sameClass, sameElement});
        _latestRepeated = std::max(_latestRepeated, _repeated.back().latest());
    }

    std::size_t _count = 0;
    Latest _byClassName;
    Latest _byElementName;
    std::vector<Repeated> _repeated;
    std::size_t _latestRepeated = 0;
};

} // namespace qx::detail
