#pragma once

// What an object that takes part in observation keeps: the observances of its own key paths, the
// links of everybody's paths that pass through it, the observances in which it is the observer, and
// the changes that were announced and are not over.
//
// An observance is a tree of links: one for each object on its path, and beside each the paths that
// the key there depends on. A change at any link is a change of the observed value; what hangs
// below the link is built anew afterwards.
//
// Telling runs foreign code, which may end anything: whatever is walked meanwhile is a copy that
// keeps observances and links; both know when they have ended.

#include <QXXMLMarshalling/platform/Observation.h>
#include <QXXMLMarshalling/platform/Value.h>

#include "platform/object/ObjectExtras.h"

#include <exception>
#include <functional>
#include <list>
#include <memory>
#include <optional>
#include <span>
#include <unordered_map>

namespace qx {

struct ObservationInfo;

struct ObservationLink : std::enable_shared_from_this<ObservationLink> {
    using List = std::list<std::shared_ptr<ObservationLink>>;

    Observance* observance = nullptr;
    ObservationLink* parent = nullptr;
    Object* object = nullptr; // null when the link has ended
    Key key;
    std::shared_ptr<const std::vector<Key>> path;
    std::size_t index = 0;
    bool onMainPath = false;
    List::iterator position;
    std::shared_ptr<ObservationLink> next;
    std::vector<std::shared_ptr<ObservationLink>> dependencies;

    bool isLast() const noexcept { return index + 1 == path->size(); }
    // The key as it is now leads to another object: follows it.
    void rebuildNext();
    void end() noexcept;
};

class Observance {
public:
    Observance(Object& root, Key keyPath, unsigned options);

    void retain() noexcept { ++_count; }
    void release() noexcept {
        if (--_count == 0)
            delete this;
    }

    void begin(Object* observer, Selector context, std::function<void(const ValueChange&)> call);
    // Takes it out of all objects; the callable lives on until nobody tells it any more.
    void end() noexcept;
    bool hasEnded() const noexcept { return _root == nullptr; }
    bool isFor(const Object* observer, Key keyPath) const noexcept {
        return _observer == observer && _keyPath == keyPath;
    }
    Selector context() const noexcept { return _context; }
    bool isEarlierThan(const Observance& other) const noexcept { return _number < other._number; }

    // A change is announced at the link. `kind` and `indexes` count for the end of the path only.
    void changeBegins(const ObservationLink& link, ChangeKind kind,
                      std::span<const std::size_t> indexes);
    // Whether this was the outermost announced change.
    bool changeEnds() noexcept { return --_changing == 0; }
    std::optional<ValueChange> priorChange() const;
    // The change that has just ended, with the new value; none when the observance has ended.
    std::optional<ValueChange> finishedChange();
    void tell(const ValueChange& change);

private:
    friend struct ObservationInfo;

    Value currentValue() const;

    unsigned _count = 1;
    std::uint64_t _number; // counts all observances of the process
    Object* _root;
    Object* _observer = nullptr;
    Key _keyPath;
    unsigned _options;
    Selector _context;
    std::function<void(const ValueChange&)> _call;
    std::shared_ptr<ObservationLink> _first;
    std::list<Ref<Observance>>::iterator _rootPosition;
    std::list<Observance*>::iterator _observerPosition;

    std::size_t _changing = 0;
    ChangeKind _kind = ChangeKind::setting;
    std::vector<std::size_t> _indexes;
    Value _oldValue;
};

struct ObservationInfo final : private EndListener {
    explicit ObservationInfo(Object& owner);
    ~ObservationInfo();
    ObservationInfo(const ObservationInfo&) = delete;
    ObservationInfo& operator=(const ObservationInfo&) = delete;

    static ObservationInfo& of(Object& object);
    // Null when nothing was ever observed at or by the object.
    static ObservationInfo* existing(const Object& object) noexcept;

    void willChange(Key key, ChangeKind kind, std::span<const std::size_t> indexes);
    void didChange(Key key);

    std::list<Ref<Observance>> observances;
    std::unordered_map<Key, ObservationLink::List> links; // by their key; no list is empty
    std::list<Observance*> observing;

private:
    struct Pending {
        Key key;
        std::size_t depth = 1;
        std::vector<Ref<Observance>> told{};
    };

    void objectEnds(Object&) noexcept override { endAll(); }
    void endAll() noexcept;
    Pending* pending(Key key) noexcept;
    std::vector<Ref<Observance>> takePending(Key key) noexcept;
    // Those of the earliest observance first.
    std::vector<std::shared_ptr<ObservationLink>> linksFor(Key key) const;

    Object& _owner;
    std::vector<Pending> _pending;
};

} // namespace qx
