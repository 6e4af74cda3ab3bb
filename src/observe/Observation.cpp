#include <QXXMLMarshalling/observe/Observation.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/Warning.h"
#include "observe/ObservationInfo.h"

#include <exception>

namespace qx {

void Object::willChangeValueForKey(Key key) {
    if (ObservationInfo* info = ObservationInfo::existing(*this))
        info->willChange(key, ChangeKind::setting, {});
}

void Object::didChangeValueForKey(Key key) {
    if (ObservationInfo* info = ObservationInfo::existing(*this))
        info->didChange(key);
}

void Object::willChange(ChangeKind kind, std::span<const std::size_t> indexes, Key key) {
    if (ObservationInfo* info = ObservationInfo::existing(*this))
        info->willChange(key, kind, indexes);
}

void Object::didChange(ChangeKind, std::span<const std::size_t>, Key key) {
    if (ObservationInfo* info = ObservationInfo::existing(*this))
        info->didChange(key);
}

void Object::addObserver(Object* observer, Key keyPath, unsigned options, Selector context) {
    if (observer == nullptr)
        throw Exception(Exception::invalidArgument,
                        String::concat({"no observer was given for ", keyPath.view()}));
    make<Observance>(*this, keyPath, options)->begin(observer, context, nullptr);
}

ObservationToken Object::observe(Key keyPath, std::function<void(const ValueChange&)> call,
                                 unsigned options) {
    if (!call)
        throw Exception(Exception::invalidArgument,
                        String::concat({"no callable was given for ", keyPath.view()}));
    auto observance = make<Observance>(*this, keyPath, options);
    observance->begin(nullptr, {}, std::move(call));
    return ObservationToken(std::move(observance));
}

namespace {

// The latest such observance ends. A destructor may remove its object once more: all that the
// object had to do with has ended by then.
void removeLatest(Object& object, const Object* observer, Key keyPath, const Selector* context) {
    if (ObservationInfo* info = ObservationInfo::existing(object))
        if (Observance* latest =
                observer != nullptr ? info->latest(observer, keyPath, context) : nullptr)
            return latest->end();
    if (ObjectInternals::isEnding(object) ||
        (observer != nullptr && ObjectInternals::isEnding(*observer)))
        return;
    throw Exception(Exception::range,
                    String::concat({"an observer to be removed does not observe ", keyPath.view(),
                                    " of an object of class ", object.isa().name()}));
}

} // namespace

void Object::removeObserver(Object* observer, Key keyPath) {
    removeLatest(*this, observer, keyPath, nullptr);
}

void Object::removeObserver(Object* observer, Key keyPath, Selector context) {
    removeLatest(*this, observer, keyPath, &context);
}

void Object::observeValueForKeyPath(const String& keyPath, Object*, const Dictionary&, Selector) {
    throw Exception(Exception::internalInconsistency,
                    String::concat({"class ", isa().name(), " observes ", keyPath.view(),
                                    " but does not take the change"}));
}

ObservationToken::ObservationToken() noexcept = default;

ObservationToken::ObservationToken(Ref<Observance> observance) noexcept
    : _observance(std::move(observance)) {}

ObservationToken::ObservationToken(ObservationToken&& other) noexcept
    : _observance(std::move(other._observance)) {}

ObservationToken& ObservationToken::operator=(ObservationToken&& other) noexcept {
    if (this != &other) {
        end();
        _observance = std::move(other._observance);
    }
    return *this;
}

ObservationToken::~ObservationToken() { end(); }

void ObservationToken::end() noexcept {
    if (_observance)
        _observance->end();
    _observance.reset();
}

ChangeScope::ChangeScope(Object& object, Key key)
    : _object(object), _key(key), _exceptions(std::uncaught_exceptions()) {
    object.willChangeValueForKey(key);
}

ChangeScope::ChangeScope(Object& object, Key key, ChangeKind kind, std::vector<std::size_t> indexes)
    : _object(object), _key(key), _kind(kind), _indexes(std::move(indexes)),
      _exceptions(std::uncaught_exceptions()) {
    if (kind == ChangeKind::setting)
        object.willChangeValueForKey(key);
    else
        object.willChange(kind, _indexes, key);
}

namespace {

void reportThrown(Key key, const char* what) noexcept {
    try {
        reportWarning(String::concat(
            {"An observer of ", key.view(), " threw while the change failed: ", what}));
    } catch (...) { // NOLINT(bugprone-empty-catch): there is no memory left to say it
    }
}

} // namespace

ChangeScope::~ChangeScope() noexcept(false) {
    if (std::uncaught_exceptions() == _exceptions) {
        announceEnd();
        return;
    }
    try {
        announceEnd();
    } catch (const std::exception& exception) {
        reportThrown(_key, exception.what());
    } catch (...) {
        reportThrown(_key, "an exception of its own");
    }
}

void ChangeScope::announceEnd() {
    if (_kind == ChangeKind::setting)
        _object.didChangeValueForKey(_key);
    else
        _object.didChange(_kind, _indexes, _key);
}

} // namespace qx
