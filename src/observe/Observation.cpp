#include <QXXMLMarshalling/observe/Observation.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include "observe/ObservationInfo.h"

namespace qx {

void Object::addObserver(Object* observer, Key keyPath, unsigned options, Selector context) {
    if (observer == nullptr)
        throw Exception(Exception::invalidArgument,
                        String::concat({"no observer was given for ", keyPath.view()}));
    make<Observance>(*this, keyPath, options)->begin(observer, context, nullptr);
}

ObservationToken Object::observe(Key keyPath, detail::UniqueFunction<void(const ValueChange&)> call,
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

} // namespace qx
