#include "platform/object/ObservationInfo.h"

#include <algorithm>

namespace qx {

ObservationInfo::ObservationInfo(Object& owner) : _owner(owner) {
    ObjectInternals::addEndListener(owner, *this);
}

ObservationInfo::~ObservationInfo() { endAll(); }

ObservationInfo& ObservationInfo::of(Object& object) {
    auto& info = ObjectInternals::extras(object).observation;
    if (!info)
        info = std::make_unique<ObservationInfo>(object);
    return *info;
}

ObservationInfo* ObservationInfo::existing(const Object& object) noexcept {
    const auto* extras = ObjectInternals::existingExtras(object);
    return extras != nullptr ? extras->observation.get() : nullptr;
}

void ObservationInfo::endAll() noexcept {
    while (!observances.empty()) {
        const Ref<Observance> ending = observances.back();
        ending->end();
    }
    while (!observing.empty()) {
        const Ref<Observance> ending(observing.back());
        ending->end();
    }
    while (!links.empty()) {
        const auto ending = links.begin()->second.back();
        ending->end();
    }
}

ObservationInfo::Pending* ObservationInfo::pending(Key key) noexcept {
    const auto found = std::find_if(_pending.begin(), _pending.end(),
                                    [&](const Pending& change) { return change.key == key; });
    return found != _pending.end() ? &*found : nullptr;
}

std::vector<Ref<Observance>> ObservationInfo::takePending(Key key) noexcept {
    Pending* change = pending(key);
    if (change == nullptr)
        return {};
    std::vector<Ref<Observance>> told = std::move(change->told);
    _pending.erase(_pending.begin() + (change - _pending.data()));
    return told;
}

std::vector<std::shared_ptr<ObservationLink>> ObservationInfo::linksFor(Key key) const {
    const auto list = links.find(key);
    if (list == links.end())
        return {};
    std::vector<std::shared_ptr<ObservationLink>> found(list->second.begin(), list->second.end());
    // A path that led elsewhere for a while has got a new link at the end.
    std::stable_sort(found.begin(), found.end(), [](const auto& one, const auto& other) {
        return one->observance->isEarlierThan(*other->observance);
    });
    return found;
}

void ObservationInfo::willChange(Key key, ChangeKind kind, std::span<const std::size_t> indexes) {
    if (Pending* change = pending(key)) {
        ++change->depth;
        return;
    }
    if (links.empty())
        return;
    const Ref<Object> kept(&_owner);
    _pending.push_back({.key = key});
    std::vector<Ref<Observance>> told;
    try {
        for (const auto& link : linksFor(key)) {
            if (link->object == nullptr)
                continue;
            told.emplace_back(link->observance);
            link->observance->changeBegins(*link, kind, indexes);
        }
        for (const auto& observance : told)
            if (const auto change = observance->priorChange())
                observance->tell(*change);
    } catch (...) {
        // The change does not take place as announced: no end of it will follow.
        for (const auto& observance : told)
            observance->changeEnds();
        takePending(key);
        throw;
    }
    // None when one of those told has ended the change already.
    if (Pending* change = pending(key))
        change->told = std::move(told);
    else
        for (const auto& observance : told)
            observance->changeEnds();
}

void ObservationInfo::didChange(Key key) {
    Pending* pendingChange = pending(key);
    if (pendingChange == nullptr || --pendingChange->depth != 0)
        return;
    const Ref<Object> kept(&_owner);
    std::exception_ptr thrown;
    const auto keeping = [&thrown](const auto& step) {
        try {
            step();
        } catch (...) {
            if (!thrown)
                thrown = std::current_exception();
        }
    };

    std::vector<Ref<Observance>> finished;
    for (auto& observance : takePending(key))
        if (observance->changeEnds())
            finished.push_back(std::move(observance));
    for (const auto& link : linksFor(key))
        keeping([&] { link->rebuildNext(); });

    // All values are read before anybody is told: an observer may change them again.
    std::vector<std::pair<Observance*, ValueChange>> changes;
    changes.reserve(finished.size());
    for (const auto& observance : finished)
        keeping([&] {
            if (auto change = observance->finishedChange())
                changes.emplace_back(observance.get(), std::move(*change));
        });
    for (const auto& change : changes)
        keeping([&] { change.first->tell(change.second); });
    if (thrown)
        std::rethrow_exception(thrown);
}

} // namespace qx
