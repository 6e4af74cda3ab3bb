#include "xml/ScannedNames.h"

#include "base/KnownName.h"
#include "xml/XMLCharacters.h"

#include <utility>

namespace qx {

namespace {

void require(bool condition) {
    if (!condition)
        throw ScannedNames::Refused();
}

} // namespace

ScannedNames::ScannedNames(std::size_t longest)
    : _longest(longest), _seed(String::hashOf("names of a document")), _slots(256) {
    constexpr std::size_t usualCount = 32;
    _names.reserve(usualCount);
    _texts.reserve(usualCount);
}

ScannedNames ScannedNames::take(Kept& kept, std::size_t longest) {
    auto known = std::exchange(kept, std::nullopt);
    if (!known || known->_longest != longest)
        return ScannedNames(longest);
    known->_URIs = 0;
    return std::move(*known);
}

std::vector<String> ScannedNames::finish(std::uint32_t element, Kept& kept) {
    constexpr std::size_t mostKept = 100;
    constexpr std::size_t mostText = 2'000;
    constexpr std::uint32_t mostElements =
        UINT32_MAX / 4; // the next document has no more than that
    if (_texts.size() > mostKept || _textSize > mostText || element > mostElements)
        return std::move(_texts);
    _element = element;
    auto texts = _texts;
    kept = std::move(*this);
    return texts;
}

ScannedNames::Name& ScannedNames::findLong(std::string_view text) {
    const std::uint32_t hash = String::hashOf(text);
    const std::size_t mask = _slots.size() - 1;
    for (std::size_t slot = hash & mask; _slots[slot] != 0; slot = (slot + 1) & mask) {
        Name& name = _names[_slots[slot] - 1];
        if (this->text(name) == text)
            return name;
    }
    return add(text, {UINT64_MAX, UINT64_MAX}, hash);
}

ScannedNames::Name& ScannedNames::add(std::string_view text, const ShortName& bytes,
                                      std::uint32_t hash) {
    require(text.size() <= _longest && _URIs + _names.size() < xmlLimits::names);
    Name name{bytes, static_cast<std::uint32_t>(text.size()), hash, 0, 0, none, 0, 0};
    if (!text.empty())
        takeApart(name, text);
    if ((_names.size() + 1) * 2 > _slots.size())
        grow();
    _texts.push_back(knownName(text));
    _textSize += text.size();
    name.number = static_cast<Number>(_names.size());
    name.follower = name.number;
    _names.push_back(name);
    fill(name.number);
    return _names.back();
}

// What stands behind its colon is a name of its own.
void ScannedNames::takeApart(Name& name, std::string_view text) {
    require(isXMLName(text));
    if (text == "xmlns")
        name.meaning = Meaning::defaultNamespace;
    else if (text == "xml:space")
        name.meaning = Meaning::space;
    const std::size_t colon = text.find(':');
    if (colon == std::string_view::npos)
        return;
    const std::string_view local = text.substr(colon + 1);
    require(colon != 0 && isXMLName(local) && local.find(':') == std::string_view::npos);
    if (text.substr(0, colon) == "xmlns") {
        require(local != "xml" && local != "xmlns");
        name.meaning = Meaning::prefixNamespace;
    }
    name.local = find(local.data(), local.size()).number;
}

void ScannedNames::countURI() { require(++_URIs + _names.size() <= xmlLimits::names); }

void ScannedNames::fill(Number number) {
    const std::size_t mask = _slots.size() - 1;
    std::size_t slot = _names[number].hash & mask;
    while (_slots[slot] != 0)
        slot = (slot + 1) & mask;
    _slots[slot] = number + 1;
}

void ScannedNames::grow() {
    _slots.assign(_slots.size() * 2, 0);
    for (Number number = 0; number < _names.size(); ++number)
        fill(number);
}

} // namespace qx
