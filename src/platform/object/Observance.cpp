#include <QXXMLMarshalling/platform/Array.h>
#include <QXXMLMarshalling/platform/Class.h>
#include <QXXMLMarshalling/platform/CountedSet.h>
#include <QXXMLMarshalling/platform/Dictionary.h>
#include <QXXMLMarshalling/platform/Exception.h>
#include <QXXMLMarshalling/platform/Null.h>

#include "platform/object/ObservationInfo.h"

namespace qx {

namespace {

using Path = std::shared_ptr<const std::vector<Key>>;

// Links further than this from the observed object are left out, so that a value that depends on
// the same value of the next object, and so on, needs a bounded stack.
constexpr std::size_t deepestLink = 256;

Path componentsOf(std::string_view keyPath) {
    auto path = std::make_shared<std::vector<Key>>();
    for (;;) {
        const std::size_t dot = keyPath.find('.');
        path->emplace_back(keyPath.substr(0, dot));
        if (dot == std::string_view::npos)
            return path;
        keyPath.remove_prefix(dot + 1);
    }
}

void addPaths(const Value& paths, std::vector<String>& result) {
    if (const auto array = paths.as<Array>()) {
        for (const Value& path : *array)
            result.push_back(path.string());
    } else if (const auto set = paths.as<CountedSet>()) {
        for (const String& path : set->names())
            result.push_back(path);
    }
}

std::vector<String> pathsThatAffect(const Object& object, Key key) {
    static const Selector general("keyPathsForValuesAffectingValueForKey:");
    const Class& type = object.isa();
    std::vector<String> result;
    if (type.classOperation(general) != nullptr)
        addPaths(type.perform(general, key.string()), result);
    if (key.view().empty())
        return result;
    std::string name("keyPathsForValuesAffecting");
    name += key.view();
    char& first = name[name.size() - key.view().size()];
    if (first >= 'a' && first <= 'z')
        first = static_cast<char>(first - 'a' + 'A');
    // A class that has such an operation has interned its name.
    if (Key::existing(name).isNull())
        return result;
    const Selector selector{std::string_view(name)};
    if (type.classOperation(selector) != nullptr)
        addPaths(type.perform(selector), result);
    return result;
}

Value valueOf(const Object& object, std::string_view keyPath) {
    try {
        return object.valueForKeyPath(keyPath);
    } catch (const UndefinedKeyException&) {
        // A key that is announced by hand need not be readable.
        return {};
    }
}

// False where the link would close a ring of dependencies, or hang too deep.
bool mayLink(const ObservationLink* parent, const Object& object, Key key, const Path& path) {
    std::size_t depth = 0;
    for (const ObservationLink* above = parent; above != nullptr; above = above->parent) {
        if (++depth == deepestLink)
            return false;
        if (above->object == &object && above->key == key && above->path != path)
            return false;
    }
    return true;
}

std::shared_ptr<ObservationLink> makeLink(Observance& observance, ObservationLink* parent,
                                          Object& object, const Path& path, std::size_t index,
                                          bool onMainPath);

void addDependencies(ObservationLink& link, Object& object) {
    for (const String& affecting : pathsThatAffect(object, link.key)) {
        if (affecting.isNull() || affecting == link.key.view())
            continue;
        auto dependency =
            makeLink(*link.observance, &link, object, componentsOf(affecting), 0, false);
        if (dependency && link.object == nullptr)
            dependency->end();
        else if (dependency)
            link.dependencies.push_back(std::move(dependency));
    }
}

// Null where there may be none. Asking the objects runs foreign code, which may end the link.
std::shared_ptr<ObservationLink> makeLink(Observance& observance, ObservationLink* parent,
                                          Object& object, const Path& path, std::size_t index,
                                          bool onMainPath) {
    const Key key = (*path)[index];
    if (!mayLink(parent, object, key, path))
        return nullptr;
    auto link = std::make_shared<ObservationLink>();
    link->observance = &observance;
    link->parent = parent;
    link->key = key;
    link->path = path;
    link->index = index;
    link->onMainPath = onMainPath;
    auto& links = ObservationInfo::of(object).links[key];
    link->position = links.insert(links.end(), link);
    link->object = &object;
    try {
        addDependencies(*link, object);
        link->rebuildNext();
    } catch (...) {
        link->end();
        throw;
    }
    return link;
}

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

} // namespace

void ObservationLink::rebuildNext() {
    if (next)
        std::exchange(next, nullptr)->end();
    if (object == nullptr || isLast())
        return;
    // What this runs may end this very link.
    const auto kept = shared_from_this();
    const Value value = valueOf(*object, key.view());
    if (object == nullptr || value.object() == nullptr)
        return;
    auto following = makeLink(*observance, this, *value.object(), path, index + 1, onMainPath);
    if (object != nullptr)
        next = std::move(following);
    else if (following)
        following->end();
}

void ObservationLink::end() noexcept {
    if (object == nullptr)
        return;
    const auto kept = shared_from_this();
    auto& links = ObservationInfo::existing(*object)->links;
    const auto list = links.find(key);
    list->second.erase(position);
    if (list->second.empty())
        links.erase(list);
    object = nullptr;
    parent = nullptr;
    if (next)
        std::exchange(next, nullptr)->end();
    for (const auto& dependency : std::exchange(dependencies, {}))
        dependency->end();
}

namespace {

std::atomic<std::uint64_t> observancesMade{0};

} // namespace

Observance::Observance(Object& root, Key keyPath, unsigned options)
    : _number(observancesMade.fetch_add(1, std::memory_order_relaxed)), _root(&root),
      _keyPath(keyPath), _options(options) {}

void Observance::begin(Object* observer, Selector context,
                       std::function<void(const ValueChange&)> call) {
    auto& observances = ObservationInfo::of(*_root).observances;
    _call = std::move(call);
    _context = context;
    if (observer != nullptr) {
        auto& observing = ObservationInfo::of(*observer).observing;
        _observerPosition = observing.insert(observing.end(), this);
        _observer = observer;
    }
    const Ref<Observance> kept(this);
    _rootPosition = observances.insert(observances.end(), kept);
    try {
        _first = makeLink(*this, nullptr, *_root, componentsOf(_keyPath.view()), 0, true);
        if (hasEnded() && _first)
            _first->end();
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
    ObservationInfo::existing(*_root)->observances.erase(_rootPosition);
    _root = nullptr;
    if (_observer != nullptr) {
        ObservationInfo::existing(*_observer)->observing.erase(_observerPosition);
        _observer = nullptr;
    }
    if (_first)
        _first->end();
}

Value Observance::currentValue() const { return valueOf(*_root, _keyPath.view()); }

void Observance::changeBegins(const ObservationLink& link, ChangeKind kind,
                              std::span<const std::size_t> indexes) {
    if (_changing++ != 0 || hasEnded())
        return;
    const bool isIndexed = kind != ChangeKind::setting && link.onMainPath && link.isLast();
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
    if (hasEnded() || (_options & Observing::prior) == 0 || _changing != 1)
        return {};
    return ValueChange{.object = *_root,
                       .kind = _kind,
                       .oldValue = _oldValue,
                       .newValue = {},
                       .indexes = _indexes,
                       .isPrior = true};
}

std::optional<ValueChange> Observance::finishedChange() {
    if (hasEnded())
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
    if (hasEnded())
        return;
    const Ref<Observance> kept(this);
    const Ref<Object> root(_root);
    if (_call)
        return _call(change);
    if (ObjectInternals::isEnding(*_observer))
        return;
    const Ref<Object> observer(_observer);
    observer->observeValueForKeyPath(_keyPath.string(), _root, *dictionaryOf(change, _options),
                                     _context);
}

} // namespace qx
