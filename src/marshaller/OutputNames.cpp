#include "marshaller/OutputNames.h"

namespace qx::detail {

namespace {

const String nothing("");

} // namespace

void OutputNames::enter(const std::vector<Declaration>& declarations) {
    _open.push_back({_undo.size(), {}});
    // Of equal prefixes the first holds, of those of one namespace the first is taken.
    for (auto last = declarations.rbegin(); last != declarations.rend(); ++last)
        bind(last->prefix, {last->URI, ++_count});
}

void OutputNames::leave() {
    for (; _undo.size() > _open.back().declared; _undo.pop_back()) {
        const Undo undo = std::move(_undo.back());
        bind(undo.prefix, undo.binding);
        _undo.pop_back(); // what bind() has noted
    }
    _open.pop_back();
}

void OutputNames::declare(const Declaration& declaration) {
    bind(declaration.prefix, {declaration.URI, ++_count});
    _open.back().added.push_back(declaration);
}

void OutputNames::bind(const String& prefix, const Binding& binding) {
    Binding& inForce = _inForce[prefix];
    if (!inForce.URI.isEmpty())
        _prefixes[inForce.URI].erase(inForce.since);
    _undo.push_back({prefix, std::exchange(inForce, binding)});
    if (!binding.URI.isEmpty())
        _prefixes[binding.URI].emplace(binding.since, prefix);
}

const String& OutputNames::boundTo(const String& prefix) const {
    const auto found = _inForce.find(prefix);
    return found != _inForce.end() ? found->second.URI : nothing;
}

// Where the default namespace is this one, elements mostly have no prefix: it was declared for
// them.
const String* OutputNames::prefixOf(const String& URI, bool isAttribute) const {
    if (!isAttribute && boundTo(nothing) == URI)
        return &nothing;
    const auto prefixes = _prefixes.find(URI);
    if (prefixes == _prefixes.end())
        return nullptr;
    for (auto latest = prefixes->second.rbegin(); latest != prefixes->second.rend(); ++latest)
        if (!latest->second.isEmpty())
            return &latest->second;
    return nullptr;
}

// That of the table, unless something else is declared for it: what is inside may use that. Others
// tell the URI, so that on one element no prefix is made for two.
String OutputNames::newPrefix(const String& URI, const String& wanted, bool isAttribute) {
    const auto isFree = [&](const String& prefix) {
        const String& other = boundTo(prefix);
        return other.isEmpty() || other == URI;
    };
    if (isFree(wanted) && !(isAttribute && wanted.isEmpty()))
        return wanted;
    const std::size_t number = _made.try_emplace(URI, _made.size() + 1).first->second;
    String prefix = String::concat({"ns", std::to_string(number)});
    while (!isFree(prefix) || _table->URIOf(prefix) != nullptr)
        prefix = prefix + "_";
    return prefix;
}

const String& OutputNames::kept(std::string_view prefix, std::string_view local) {
    return *_texts.insert(prefix.empty() ? String(local) : String::concat({prefix, ":", local}))
                .first;
}

OutputNames::Name OutputNames::nameFor(const String& name, bool isAttribute) {
    const std::size_t colon = name.view().find(':');
    const bool hasPrefix = colon != std::string_view::npos && colon != 0;
    if (isAttribute && !hasPrefix)
        return {name, {}};
    const String prefix = hasPrefix ? String(name.view().substr(0, colon)) : nothing;
    const String* const URI = _table->URIOf(prefix);
    if (URI == nullptr) {
        // What has no prefix in the mapping is in no namespace of the table.
        const bool isTaken = !hasPrefix && _table->prefixOf(boundTo(nothing)) != nullptr;
        return {name, isTaken ? std::optional<Declaration>({nothing, nothing}) : std::nullopt};
    }
    if (*URI == NamespaceTable::xmlURI)
        return {name, {}};
    const std::string_view local = name.view().substr(hasPrefix ? colon + 1 : 0);
    if (const String* const known = prefixOf(*URI, isAttribute))
        return {kept(known->view(), local), {}};
    String made = newPrefix(*URI, prefix, isAttribute);
    const String& text = kept(made.view(), local);
    return {text, Declaration{std::move(made), *URI}};
}

} // namespace qx::detail
