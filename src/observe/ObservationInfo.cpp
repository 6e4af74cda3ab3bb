#include "observe/ObservationInfo.h"

#include "observe/ObservationPath.h"

#include <algorithm>
#include <exception>
#include <limits>
#include <memory>

namespace qx {

ObservationInfo::ObservationInfo(Object& owner) : _owner(owner) {
    ObjectInternals::addEndListener(owner, *this);
}

ObservationInfo& ObservationInfo::of(Object& object) {
    auto& listener = ObjectInternals::extras(object).changeListener;
    if (!listener)
        listener = std::make_unique<ObservationInfo>(object);
    return static_cast<ObservationInfo&>(*listener);
}

ObservationInfo* ObservationInfo::existing(const Object& object) noexcept {
    const auto* extras = ObjectInternals::existingExtras(object);
    return extras != nullptr ? static_cast<ObservationInfo*>(extras->changeListener.get())
                             : nullptr;
}

// Nothing is added from now on: no observance begins at or by an object that is ending, and no path
// leads through it.
void ObservationInfo::objectEnds(Object&) noexcept {
    while (!observances.empty()) {
        const Ref<Observance> ending = observances.back();
        ending->end();
    }
    while (!observing.empty()) {
        const Ref<Observance> ending(observing.back());
        ending->end();
    }
    for (auto& [key, observed] : _keys) {
        for (const ObservationLink& link : observed.links)
            link.observance->loseLink(link);
        observed.links.clear();
    }
}

ObservationLink& ObservationInfo::addLink(Key key) {
    ObservationLink::List made(1);
    ObservationLink& link = made.front();
    link.object = &_owner;
    link.key = key;
    link.position = made.begin();
    auto& links = _keys[key].links;
    links.splice(links.end(), made);
    return link;
}

void ObservationInfo::removeLink(const ObservationLink& link) noexcept {
    const auto found = _keys.find(link.key);
    found->second.links.erase(link.position);
    if (found->second.links.empty() && found->second.depth == 0)
        _keys.erase(found);
}

ObservationInfo::Listing ObservationInfo::listingOf(const Observance& observance) noexcept {
    return {observance._observer, observance._keyPath.identity(), observance._context.identity(),
            observance._number};
}

Observance* ObservationInfo::latest(const Object* observer, Key keyPath,
                                    const Selector* context) const {
    constexpr auto last = std::numeric_limits<std::uint64_t>::max();
    Observance* latest = nullptr;
    auto next = _byObserver.lower_bound(
        {observer, keyPath.identity(), context != nullptr ? context->identity() : nullptr, 0});
    // One turn for each context.
    while (next != _byObserver.end() && next->second->_observer == observer &&
           next->second->_keyPath == keyPath &&
           (context == nullptr || next->second->_context == *context)) {
        next = _byObserver.upper_bound(
            {observer, keyPath.identity(), next->second->_context.identity(), last});
        Observance* candidate = std::prev(next)->second;
        if (latest == nullptr || latest->isEarlierThan(*candidate))
            latest = candidate;
    }
    return latest;
}

bool ObservationInfo::isUnderWay(Key key, std::uint64_t change) const noexcept {
    const auto found = _keys.find(key);
    return found != _keys.end() && found->second.depth != 0 && found->second.change == change;
}

std::vector<Ref<Observance>> ObservationInfo::takeTold(Key key) noexcept {
    const auto found = _keys.find(key);
    found->second.depth = 0;
    auto told = std::exchange(found->second.told, {});
    if (found->second.links.empty())
        _keys.erase(found);
    return told;
}

std::vector<ObservationInfo::Concerned> ObservationInfo::concernedBy(Key key) const {
    std::vector<Concerned> concerned;
    const auto found = _keys.find(key);
    concerned.reserve(found->second.links.size());
    for (const ObservationLink& link : found->second.links)
        concerned.push_back({Ref<Observance>(link.observance), link.endsPath});
    // A path that was walked again has got new links at the end.
    std::sort(concerned.begin(), concerned.end(), [](const auto& one, const auto& other) {
        return one.observance->isEarlierThan(*other.observance);
    });
    return concerned;
}

std::vector<Ref<Observance>> ObservationInfo::outdatedBy(Key key) const {
    const auto linksOf = [this](Key wanted) {
        const auto found = _keys.find(wanted);
        return found != _keys.end() ? &found->second.links : nullptr;
    };
    const auto* links = linksOf(key);
    if (links == nullptr)
        return {};
    Value value;
    if (std::any_of(links->begin(), links->end(), [](const auto& link) { return link.leadsOn; })) {
        try {
            value = valueOnPath(_owner, key.view());
        } catch (...) {
            if ((links = linksOf(key)) != nullptr)
                for (const ObservationLink& link : *links)
                    link.observance->markOutdated();
            throw;
        }
        if ((links = linksOf(key)) == nullptr)
            return {};
    }
    std::vector<Ref<Observance>> outdated;
    for (const ObservationLink& link : *links)
        if (link.observance->isOutdated() || (link.leadsOn && link.next != objectLedTo(value)))
            outdated.emplace_back(link.observance);
    std::sort(outdated.begin(), outdated.end(),
              [](const auto& one, const auto& other) { return one->isEarlierThan(*other); });
    return outdated;
}

void ObservationInfo::willChange(Key key, ChangeKind kind, std::span<const std::size_t> indexes) {
    const auto observed = _keys.find(key);
    if (observed == _keys.end())
        return;
    if (observed->second.depth != 0) {
        ++observed->second.depth;
        return;
    }
    const Ref<Object> kept(&_owner);
    const std::vector<Concerned> concerned = concernedBy(key);
    std::vector<Ref<Observance>> told;
    told.reserve(concerned.size());
    const std::uint64_t change = ++_changes;
    observed->second.depth = 1;
    observed->second.change = change;
    try {
        for (const auto& [observance, atEndOfPath] : concerned) {
            told.push_back(observance);
            observance->changeBegins(atEndOfPath, kind, indexes);
        }
        for (const auto& observance : told)
            if (const auto prior = observance->priorChange())
                observance->tell(*prior);
    } catch (...) {
        // The change does not take place as announced: no end of it will follow.
        for (const auto& observance : told)
            observance->changeEnds();
        if (isUnderWay(key, change))
            takeTold(key);
        throw;
    }
    // One of those told may have ended the change already.
    if (isUnderWay(key, change))
        _keys.find(key)->second.told = std::move(told);
    else
        for (const auto& observance : told)
            observance->changeEnds();
}

void ObservationInfo::didChange(Key key) {
    const auto observed = _keys.find(key);
    if (observed == _keys.end() || observed->second.depth == 0 || --observed->second.depth != 0)
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

    auto finished = takeTold(key);
    std::erase_if(finished, [](const auto& observance) { return !observance->changeEnds(); });
    keeping([&] {
        for (const auto& observance : outdatedBy(key))
            keeping([&] { observance->walkPath(); });
    });

    // All values are read before anybody is told: an observer may change them again.
    std::vector<std::pair<Observance*, ValueChange>> changes;
    keeping([&] { changes.reserve(finished.size()); });
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
