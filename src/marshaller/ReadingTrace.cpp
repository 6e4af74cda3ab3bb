#include "marshaller/ReadingTrace.h"

#include <algorithm>

namespace qx::detail {

namespace {

template <class All>
std::uint32_t lastOf(const All& all) {
    return all.empty() ? ReadingTrace::none : static_cast<std::uint32_t>(all.size() - 1);
}

} // namespace

void ReadingTrace::enter(const ClassPlan& plan, Number element, const Object& object) {
    const std::uint32_t use = _open.empty() ? none : lastOf(_uses);
    _owners.push_back({element, &plan, &object, use, static_cast<std::uint32_t>(_uses.size()), 0});
    _open.push_back(lastOf(_owners));
    if (use != none)
        _uses[use].made = _open.back();
}

void ReadingTrace::leave() {
    _owners[_open.back()].usesEnd = static_cast<std::uint32_t>(_uses.size());
    _open.pop_back();
}

void ReadingTrace::leaveAndForget() {
    const std::uint32_t owner = current();
    _open.pop_back();
    if (_owners[owner].use != none)
        _uses[_owners[owner].use].made = none;
    _uses.resize(_owners[owner].firstUse);
    _owners.resize(owner);
}

void ReadingTrace::take(Form form, const FieldPlan& field, Number entry, std::size_t binding,
                        std::size_t item) {
    _uses.push_back({entry, form, static_cast<std::uint32_t>(binding),
                     static_cast<std::uint32_t>(item), _open.empty() ? none : _open.back(), none,
                     &field});
}

void ReadingTrace::keep(Form form, Number entry) {
    _uses.push_back({entry, form, 0, 0, _open.empty() ? none : _open.back(), none, nullptr});
}

// Objects that were made of them go, too.
void ReadingTrace::forget(std::size_t uses) {
    _uses.resize(std::min(uses, _uses.size()));
    while (!_owners.empty() && _owners.back().use != none && _owners.back().use >= uses)
        _owners.resize(_owners.size() - 1);
}

String ReadingTrace::keyPath(std::uint32_t owner, const FieldPlan* field) const {
    std::vector<std::string> parts;
    if (field != nullptr)
        parts.emplace_back(field->key.string().view());
    while (owner != none && _owners[owner].use != none) {
        const Use& use = _uses[_owners[owner].use];
        std::string part(use.field->key.string().view());
        if (use.form == Form::item)
            part += "[" + std::to_string(use.item) + "]";
        parts.push_back(std::move(part));
        owner = use.owner;
    }
    std::string path;
    for (auto part = parts.rbegin(); part != parts.rend(); ++part)
        path += (path.empty() ? "" : ".") + *part;
    return String(path);
}

} // namespace qx::detail
