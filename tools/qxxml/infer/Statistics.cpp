#include "qxxml/infer/Statistics.h"

#include <charconv>
#include <cstdint>

namespace qxxml {

namespace {

constexpr std::size_t none = static_cast<std::size_t>(-1);

// Whether the number that is read from the text is written as the same text.
bool isInteger(std::string_view text) {
    std::int64_t number = 0;
    const auto [end, problem] = std::from_chars(text.data(), text.data() + text.size(), number);
    return problem == std::errc() && end == text.data() + text.size() &&
           std::to_string(number) == text;
}

bool isWhiteSpace(std::string_view text) {
    return text.find_first_not_of(" \t\r\n") == std::string_view::npos;
}

} // namespace

void TextStatistics::see(std::string_view text) {
    ++count;
    empty += text.empty() ? 1 : 0;
    integers += isInteger(text) ? 1 : 0;
    booleans += text == "true" || text == "false" ? 1 : 0;
    zeros += text == "0" || text == "false" ? 1 : 0;
}

void Statistics::add(const qx::XMLDocument& document) {
    ++_documentCount;
    const qx::XMLElement* const root = document.rootElement();
    if (root == nullptr)
        return;
    const std::size_t index = indexOf(root->name().str());
    ++_elements[index].roots;
    see(*root, index);
}

std::size_t Statistics::indexOf(const std::string& name) {
    const auto [entry, isNew] = _indexes.try_emplace(name, _elements.size());
    if (isNew)
        _elements.emplace_back().name = name;
    return entry->second;
}

// The parser bounds the depth.
void Statistics::see(const qx::XMLElement& element, std::size_t index) {
    ++_elements[index].count;
    seeAttributes(element, _elements[index]);
    // All children are counted before the first one's own are: those may be of this name, too.
    seeChildren(element, index);
    for (const qx::XMLNode& child : element.children())
        if (const qx::XMLElement* const inner = child.asElement())
            see(*inner, indexOf(inner->name().str()));
}

void Statistics::seeAttributes(const qx::XMLElement& element, ElementStatistics& statistics) {
    element.forEachAttribute([&](const qx::String& name, const qx::String& value) {
        const auto [entry, isNew] =
            statistics.attributeIndexes.try_emplace(name.str(), statistics.attributes.size());
        if (isNew)
            statistics.attributes.push_back({name.str(), {}});
        statistics.attributes[entry->second].values.see(value.view());
    });
    for (const qx::XMLNode& declaration : element.namespaces())
        ++statistics.declarations[{declaration.name().str(), declaration.stringValue().str()}];
}

void Statistics::seeChildren(const qx::XMLElement& element, std::size_t index) {
    ++_seen;
    std::string text;
    bool isParent = false;
    std::size_t previous = none;
    std::size_t instructions = 0;
    for (const qx::XMLNode& child : element.children()) {
        if (child.kind() == qx::XMLNodeKind::text)
            text += child.stringValue().view();
        instructions += child.kind() == qx::XMLNodeKind::processingInstruction ? 1 : 0;
        if (!child.isElement())
            continue;
        isParent = true;
        seeChild(index, indexOf(child.name().str()), previous);
    }
    ElementStatistics& statistics = _elements[index];
    statistics.instructions += instructions;
    if (!isWhiteSpace(text))
        ++(isParent ? statistics.textAmongChildren : statistics.withText);
    if (isParent)
        ++statistics.withChildren;
    else
        statistics.texts.see(text);
}

void Statistics::seeChild(std::size_t parent, std::size_t child, std::size_t& previous) {
    ElementStatistics& statistics = _elements[parent];
    const auto [entry, isNew] =
        statistics.childIndexes.try_emplace(child, statistics.children.size());
    const std::size_t index = entry->second;
    if (isNew) {
        statistics.children.push_back({.element = child});
        _elements[child].parents.push_back(parent);
    }
    ChildStatistics& seen = statistics.children[index];
    ++seen.count;
    if (seen.lastParent != _seen) {
        seen.lastParent = _seen;
        seen.inLastParent = 0;
        ++seen.parents;
    } else if (previous != index) {
        statistics.isInterleaved = true;
    }
    seen.isRepeated = seen.isRepeated || ++seen.inLastParent > 1;
    if (previous != none && previous != index)
        statistics.children[previous].followers.insert(index);
    previous = index;
}

} // namespace qxxml
