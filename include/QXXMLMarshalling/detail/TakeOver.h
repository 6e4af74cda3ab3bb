#pragma once

// How a member takes over what the same member of a newly read object holds. Objects and structs
// stay where they are and take over in their turn where both sides hold one of the same class;
// items of collections are matched by place. All else is moved. Afterwards the new object is of no
// use any more.
//
// Setters of a host may be called meanwhile, and let go of what is being read into. So the contents
// of a list, an optional and the like are taken out until they are done: what a setter puts in
// their place then gives way to them.

#include <QXXMLMarshalling/model/ValueTraits.h>

#include <algorithm>

namespace qx::detail {

// What goes on around: it knows which objects are of one class, and goes through their fields.
class QX_API TakeOver {
public:
    // What is to stand where `held` does: `held` again, after it took over `fresh`; an array that
    // keeps such items; else `fresh`.
    virtual Value merge(const Value& held, const Value& fresh) = 0;
    // False, and neither is touched, where the struct has to be replaced. A shared one may be held
    // somewhere else, too.
    virtual bool mergeStructs(StructObject& held, StructObject& fresh, bool isShared) = 0;
    bool mergeStructs(StructPlace held, StructPlace fresh, bool isShared);

protected:
    ~TakeOver() = default;
};

// The rules for a type of member.
template <class T>
struct MemberTakeOver {
    static void apply(T& held, T& fresh, TakeOver& way) {
        if constexpr (Struct<T>)
            if (way.mergeStructs(wholeOf(held), wholeOf(fresh), false))
                return;
        held = std::move(fresh);
    }
};

// Takes a value out of its place for a time.
template <class T>
class TakenOut {
public:
    explicit TakenOut(T& place) : _place(place), value(std::move(place)) {}
    ~TakenOut() { _place = std::move(value); }
    TakenOut(const TakenOut&) = delete;
    TakenOut& operator=(const TakenOut&) = delete;

private:
    T& _place;

public:
    T value;
};

// For a place where nothing is held yet.
template <class T>
T taken(T& fresh, TakeOver& way) {
    if constexpr (!Struct<T> && std::default_initializable<T>) {
        T held{};
        MemberTakeOver<T>::apply(held, fresh, way);
        return held;
    } else {
        return std::move(fresh);
    }
}

template <>
struct MemberTakeOver<Value> {
    static void apply(Value& held, Value& fresh, TakeOver& way) { held = way.merge(held, fresh); }
};

template <std::derived_from<Object> T>
struct MemberTakeOver<Ref<T>> {
    static void apply(Ref<T>& held, Ref<T>& fresh, TakeOver& way) {
        Ref<T> merged = way.merge(held, fresh).template as<T>();
        held = std::move(merged ? merged : fresh);
    }
};

template <class T>
struct MemberTakeOver<std::optional<T>> {
    static void apply(std::optional<T>& held, std::optional<T>& fresh, TakeOver& way) {
        if (!fresh)
            held.reset();
        else if (TakenOut<std::optional<T>> out(held); out.value)
            MemberTakeOver<T>::apply(*out.value, *fresh, way);
        else
            out.value.emplace(taken(*fresh, way));
    }
};

// A struct that several share is taken over for all of them.
template <class Pointer, bool isShared>
struct OwnerTakeOver {
    static void apply(Pointer& held, Pointer& fresh, TakeOver& way) {
        TakenOut<Pointer> out(held);
        if constexpr (Struct<typename Pointer::element_type>)
            if (out.value && fresh &&
                way.mergeStructs(wholeOf(*out.value), wholeOf(*fresh), isShared))
                return;
        out.value = std::move(fresh);
    }
};
template <class T>
struct MemberTakeOver<std::unique_ptr<T>> : OwnerTakeOver<std::unique_ptr<T>, false> {};
template <class T>
struct MemberTakeOver<std::shared_ptr<T>> : OwnerTakeOver<std::shared_ptr<T>, true> {};

template <class... T>
struct MemberTakeOver<std::variant<T...>> {
    using Variant = std::variant<T...>;
    static void apply(Variant& place, Variant& fresh, TakeOver& way) {
        TakenOut<Variant> out(place);
        Variant& held = out.value;
        [&]<std::size_t... I>(std::index_sequence<I...>) {
            ((fresh.index() == I ? applyOne<I>(held, fresh, way) : void()), ...);
        }
        (std::index_sequence_for<T...>{});
    }

private:
    template <std::size_t I>
    static void applyOne(Variant& held, Variant& fresh, TakeOver& way) {
        auto& taking = std::get<I>(fresh);
        if (held.index() == I)
            MemberTakeOver<std::remove_reference_t<decltype(taking)>>::apply(std::get<I>(held),
                                                                             taking, way);
        else
            held.template emplace<I>(taken(taking, way));
    }
};

template <class T>
requires(!std::is_trivially_copyable_v<T>) struct MemberTakeOver<std::vector<T>> {
    static void apply(std::vector<T>& place, std::vector<T>& fresh, TakeOver& way) {
        TakenOut<std::vector<T>> out(place);
        std::vector<T>& held = out.value;
        const std::size_t common = std::min(held.size(), fresh.size());
        for (std::size_t i = 0; i < common; ++i)
            MemberTakeOver<T>::apply(held[i], fresh[i], way);
        held.erase(held.begin() + static_cast<std::ptrdiff_t>(common), held.end());
        held.reserve(fresh.size());
        for (std::size_t i = common; i < fresh.size(); ++i)
            held.push_back(taken(fresh[i], way));
    }
};

template <class T, std::size_t N>
struct MemberTakeOver<std::array<T, N>> {
    static void apply(std::array<T, N>& held, std::array<T, N>& fresh, TakeOver& way) {
        for (std::size_t i = 0; i < N; ++i)
            MemberTakeOver<T>::apply(held[i], fresh[i], way);
    }
};

} // namespace qx::detail
