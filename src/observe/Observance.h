#pragma once

// An observance: one observer or callable, told of the changes at one key path of one object. It
// has one link for each value that it hears of: those on its path, and those that one of them
// depends on (ObservationPath.h). A link that leads on knows the object that the value led to; once
// it leads to another, or an object on the way has ended, the path is walked again from its
// beginning and all links are made anew.
//
// It is counted, since telling runs foreign code, which may end it: it knows when it has ended.

#include <QXXMLMarshalling/model/Value.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <list>
#include <optional>
#include <span>
#include <vector>

namespace qx {

struct ObservationInfo;
struct ObservedValue;

struct ObservationLink {
    using List = std::list<ObservationLink>;

    Observance* observance = nullptr;
    Object* object = nullptr;
    Key key;
    std::size_t place = 0; // among the links of the observance
    bool endsPath = false; // the value is the observed one itself
    bool leadsOn = false;
    const Object* next = nullptr; // what the value led to; for comparison only
    List::iterator position;
};

class Observance {
public:
    Observance(Object& root, Key keyPath, unsigned options);

    void retain() noexcept { ++_count; }
    void release() noexcept {
        if (--_count == 0)
            delete this;
    }

    // Ended at once where one of the objects is ending.
    void begin(Object* observer, Selector context,
               detail::UniqueFunction<void(const ValueChange&)> call);
    // Takes it out of all objects; the callable lives on until nobody tells it any more.
    void end() noexcept;
    bool hasEnded() const noexcept { return _root == nullptr; }
    bool isEarlierThan(const Observance& other) const noexcept { return _number < other._number; }

    // Links the values on the path and those that they depend on. When that fails, which raises,
    // the links stay as they were, and are outdated.
    void walkPath();
    bool isOutdated() const noexcept { return _isOutdated; }
    void markOutdated() noexcept { _isOutdated = true; }
    // The object of the link ends.
    void loseLink(const ObservationLink& link) noexcept;

    // A change is announced. `kind` and `indexes` count for the end of the path only.
    void changeBegins(bool atEndOfPath, ChangeKind kind, std::span<const std::size_t> indexes);
    // Whether this was the outermost announced change.
    bool changeEnds() noexcept { return --_changing == 0; }
    std::optional<ValueChange> priorChange() const;
    // The change that has just ended, with the new value; none when the observance has ended.
    std::optional<ValueChange> finishedChange();
    void tell(const ValueChange& change);

private:
    friend struct ObservationInfo;

    bool maySpeak() const noexcept;
    void enlist(Object* observer);
    void link(const std::vector<ObservedValue>& values);
    static void unlink(const std::vector<ObservationLink*>& links) noexcept;
    Value currentValue() const;

    unsigned _count = 1;
    std::uint64_t _number; // counts all observances of the process
    Object* _root;
    Object* _observer = nullptr;
    Key _keyPath;
    unsigned _options;
    Selector _context;
    detail::UniqueFunction<void(const ValueChange&)> _call;
    std::vector<ObservationLink*> _links; // null for a link whose object has ended
    bool _isOutdated = false;
    bool _isWalking = false;
    std::list<Ref<Observance>>::iterator _rootPosition;
    std::list<Observance*>::iterator _observerPosition;

    std::size_t _changing = 0;
    ChangeKind _kind = ChangeKind::setting;
    std::vector<std::size_t> _indexes;
    Value _oldValue;
};

} // namespace qx
