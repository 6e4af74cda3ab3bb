#pragma once

// What an object that takes part in observation keeps: the observances of its own key paths, the
// links of everybody's paths that pass through it, the observances in which it is the observer, and
// the changes that were announced and are not over.
//
// Telling runs foreign code, which may end anything: whatever is walked meanwhile is a copy that
// keeps the observances, which know when they have ended.

#include "model/ObjectExtras.h"
#include "observe/Observance.h"

#include <list>
#include <map>
#include <span>
#include <tuple>
#include <unordered_map>

namespace qx {

struct ObservationInfo final : ChangeListener, private EndListener {
    explicit ObservationInfo(Object& owner);
    ~ObservationInfo() override = default;
    ObservationInfo(const ObservationInfo&) = delete;
    ObservationInfo& operator=(const ObservationInfo&) = delete;

    static ObservationInfo& of(Object& object);
    // Null when nothing was ever observed at or by the object.
    static ObservationInfo* existing(const Object& object) noexcept;

    void willChange(Key key, ChangeKind kind, std::span<const std::size_t> indexes) override;
    void didChange(Key key) override;

    ObservationLink& addLink(Key key);
    void removeLink(const ObservationLink& link) noexcept;

    // The latest observance of the key path by the observer, with the context if one is given;
    // null when there is none.
    Observance* latest(const Object* observer, Key keyPath, const Selector* context) const;

    std::list<Ref<Observance>> observances;
    std::list<Observance*> observing;

private:
    friend class Observance;

    // By observer, key path, context and number.
    using Listing = std::tuple<const void*, const void*, const void*, std::uint64_t>;

    // The links of one key, and the change of its value that is announced. Neither: no entry.
    struct ObservedKey {
        ObservationLink::List links;
        std::size_t depth = 0;
        std::uint64_t change = 0; // tells one change from the next
        std::vector<Ref<Observance>> told;
    };
    struct Concerned {
        Ref<Observance> observance;
        bool atEndOfPath;
    };

    static Listing listingOf(const Observance& observance) noexcept;
    void objectEnds(Object&) noexcept override;
    bool isUnderWay(Key key, std::uint64_t change) const noexcept;
    std::vector<Ref<Observance>> takeTold(Key key) noexcept;
    // Those of the earliest observance first.
    std::vector<Concerned> concernedBy(Key key) const;
    // Those whose path leads elsewhere now that the value under the key has changed.
    std::vector<Ref<Observance>> outdatedBy(Key key) const;

    Object& _owner;
    std::uint64_t _changes = 0;
    std::unordered_map<Key, ObservedKey> _keys;
    std::map<Listing, Observance*> _byObserver;
};

} // namespace qx
