#include "observe/Observance.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/Null.h>

#include "observe/ObservationInfo.h"
#include "observe/ObservationPath.h"

#include <atomic>
#include <utility>

namespace qx {

namespace {

Value itemsAt(const Value& collection, const std::vector<std::size_t>& indexes) {
    const auto array = collection.as<Array>();
    if (!array)
        return {};
    auto items = make<Array>();
    for (const std::size_t index : indexes)
        if (index < array->count())
            items->add(array->at(index));
    return items;
}

Value orMarker(const Value& value) { return value.isNull() ? Value(Null::marker()) : value; }

Ref<Dictionary> dictionaryOf(const ValueChange& change, unsigned options) {
    static const Key kind(ChangeKey::kind);
    static const Key newValue(ChangeKey::newValue);
    static const Key oldValue(ChangeKey::oldValue);
    static const Key indexes(ChangeKey::indexes);
    static const Key isPrior(ChangeKey::isPrior);
    auto result = make<Dictionary>();
    result->set(kind, static_cast<int>(change.kind));
    if ((options & Observing::oldValue) != 0 && change.kind != ChangeKind::insertion)
        result->set(oldValue, orMarker(change.oldValue));
    if ((options & Observing::newValue) != 0 && change.kind != ChangeKind::removal &&
        !change.isPrior)
        result->set(newValue, orMarker(change.newValue));
    if (change.kind != ChangeKind::setting) {
        auto numbers = make<Array>();
        for (const std::size_t index : change.indexes)
            numbers->add(index);
        result->set(indexes, numbers);
    }
    if (change.isPrior)
        result->set(isPrior, true);
    return result;
}

std::atomic<std::uint64_t> observancesMade{0};

} // namespace

Observance::Observance(Object& root, Key keyPath, unsigned options)
    : _number(observancesMade.fetch_add(1, std::memory_order_relaxed)), _root(&root),
      _keyPath(keyPath), _options(options) {}

// All memory is there before the first of the lists changes.
void Observance::enlist(Object* observer) {
    std::list<Ref<Observance>> here{Ref<Observance>(this)};
    auto& root = ObservationInfo::of(*_root);
    if (observer != nullptr) {
        std::list<Observance*> there{this};
        auto& observing = ObservationInfo::of(*observer).observing;
        _observer = observer;
        try {
            root._byObserver.emplace(ObservationInfo::listingOf(*this), this);
        } catch (...) {
            _observer = nullptr;
            throw;
        }
        _observerPosition = there.begin();
        observing.splice(observing.end(), there);
    }
    _rootPosition = here.begin();
    root.observances.splice(root.observances.end(), here);
}

void Observance::begin(Object* observer, Selector context,
                       detail::UniqueFunction<void(const ValueChange&)> call) {
    if (ObjectInternals::isEnding(*_root) ||
        (observer != nullptr && ObjectInternals::isEnding(*observer))) {
        _root = nullptr;
        return;
    }
    const Ref<Observance> kept(this);
    _call = std::move(call);
    _context = context;
    enlist(observer);
    try {
        walkPath();
        if (!hasEnded() && (_options & Observing::initial) != 0) {
            ValueChange change{.object = *_root};
            if ((_options & Observing::newValue) != 0)
                change.newValue = currentValue();
            // An initial telling holds no old value.
            const unsigned options = std::exchange(_options, _options & ~Observing::oldValue);
            tell(change);
            _options = options;
        }
    } catch (...) {
        end();
        throw;
    }
}

void Observance::end() noexcept {
    if (_root == nullptr)
        return;
    const Ref<Observance> kept(this);
    auto& root = *ObservationInfo::existing(*_root);
    if (_observer != nullptr) {
        root._byObserver.erase(ObservationInfo::listingOf(*this));
        ObservationInfo::existing(*_observer)->observing.erase(_observerPosition);
        _observer = nullptr;
    }
    root.observances.erase(_rootPosition);
    _root = nullptr;
    unlink(std::exchange(_links, {}));
}

void Observance::unlink(const std::vector<ObservationLink*>& links) noexcept {
    for (const ObservationLink* link : links)
        if (link != nullptr)
            ObservationInfo::existing(*link->object)->removeLink(*link);
}

// A change that a getter announces meanwhile makes the walk outdated: it is made once more, not for
// ever, since the getter may do so each time.
void Observance::walkPath() {
    if (std::exchange(_isWalking, true)) {
        _isOutdated = true;
        return;
    }
    const Ref<Observance> kept(this);
    try {
        bool isOutdated = true;
        for (int walks = 0; walks < 2 && isOutdated && !hasEnded(); ++walks) {
            _isOutdated = false;
            const std::vector<ObservedValue> values = valuesOnPath(*_root, _keyPath);
            isOutdated = _isOutdated;
            if (!hasEnded())
                link(values);
        }
    } catch (...) {
        _isOutdated = true;
        _isWalking = false;
        throw;
    }
    _isWalking = false;
}

void Observance::link(const std::vector<ObservedValue>& values) {
    std::vector<ObservationLink*> links;
    links.reserve(values.size());
    try {
        for (const ObservedValue& value : values) {
            if (ObjectInternals::isEnding(*value.object))
                continue;
            ObservationLink& link = ObservationInfo::of(*value.object).addLink(value.key);
            link.observance = this;
            link.place = links.size();
            link.endsPath = value.endsPath;
            link.leadsOn = value.leadsOn;
            link.next = objectLedTo(value.value);
            links.push_back(&link);
        }
    } catch (...) {
        unlink(links);
        throw;
    }
    unlink(std::exchange(_links, std::move(links)));
}

void Observance::loseLink(const ObservationLink& link) noexcept {
    _links[link.place] = nullptr;
    _isOutdated = true;
}

// An object that is ending may still be read by others, but not observed.
bool Observance::maySpeak() const noexcept {
    return !hasEnded() && !ObjectInternals::isEnding(*_root) &&
           (_observer == nullptr || !ObjectInternals::isEnding(*_observer));
}

Value Observance::currentValue() const { return valueOnPath(*_root, _keyPath.view()); }

void Observance::changeBegins(bool atEndOfPath, ChangeKind kind,
                              std::span<const std::size_t> indexes) {
    if (_changing++ != 0 || !maySpeak())
        return;
    const bool isIndexed = kind != ChangeKind::setting && atEndOfPath;
    _kind = isIndexed ? kind : ChangeKind::setting;
    _indexes.clear();
    if (isIndexed)
        _indexes.assign(indexes.begin(), indexes.end());
    _oldValue = {};
    if ((_options & Observing::oldValue) == 0 || _kind == ChangeKind::insertion)
        return;
    _oldValue = isIndexed ? itemsAt(currentValue(), _indexes) : currentValue();
}

std::optional<ValueChange> Observance::priorChange() const {
    if (!maySpeak() || (_options & Observing::prior) == 0 || _changing != 1)
        return {};
    return ValueChange{.object = *_root,
                       .kind = _kind,
                       .oldValue = _oldValue,
                       .newValue = {},
                       .indexes = _indexes,
                       .isPrior = true};
}

std::optional<ValueChange> Observance::finishedChange() {
    if (!maySpeak())
        return {};
    ValueChange change{.object = *_root,
                       .kind = _kind,
                       .oldValue = std::exchange(_oldValue, {}),
                       .newValue = {},
                       .indexes = std::exchange(_indexes, {})};
    if ((_options & Observing::newValue) != 0 && _kind != ChangeKind::removal)
        change.newValue =
            _kind == ChangeKind::setting ? currentValue() : itemsAt(currentValue(), change.indexes);
    return change;
}

void Observance::tell(const ValueChange& change) {
    if (!maySpeak())
        return;
    const Ref<Observance> kept(this);
    const Ref<Object> root(_root);
    if (_call)
        return _call(change);
    const Ref<Object> observer(_observer);
    observer->observeValueForKeyPath(_keyPath.string(), _root, *dictionaryOf(change, _options),
                                     _context);
}

} // namespace qx
