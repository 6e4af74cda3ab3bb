// A document beside what writing gives of the object that was read from it. The elements of one
// name are matched in their order, level by level.

#include "base/WhiteSpace.h"
#include "check/DocumentRules.h"
#include "marshaller/TakenNames.h"

#include <unordered_map>
#include <utility>

namespace qx::detail {

namespace {

using Number = XMLIndex::Number;

class TreeComparison {
public:
    TreeComparison(const TakenEntries& taken, const DocumentPlaces& places, Tally& tally)
        : _taken(taken), _index(taken.index()), _places(places), _tally(tally) {}

    void run(Number root, const XMLElement& original, const XMLElement& written) {
        _open.push_back({root, &original, &written});
        while (!_open.empty()) {
            const Pair pair = _open.back();
            _open.pop_back();
            compareAttributes(pair);
            compareNamespaces(pair);
            compareContent(pair);
        }
    }

private:
    struct Pair {
        Number number; // of the entry that `before` is
        const XMLElement* before;
        const XMLElement* after;
    };

    void compareAttributes(const Pair& pair);
    void compareNamespaces(const Pair& pair);
    void compareContent(const Pair& pair);
    void compareChildren(const Pair& pair);
    Number attribute(Number element, const String& name) const;
    // What is told of an entry, or of what is missing in it.
    void add(const FindingText& text, std::string_view what, const XMLElement& inside, Number entry,
             const std::function<String()>& suggestion = {}) {
        _tally.add(
            text, {String::concat({inside.name(), "/", what})}, _taken.concernedBy(entry),
            [&] { return _places.placeOf(entry).place; }, suggestion);
    }

    const TakenEntries& _taken;
    const XMLIndex& _index;
    const DocumentPlaces& _places;
    Tally& _tally;
    std::vector<Pair> _open;
};

Number TreeComparison::attribute(Number element, const String& name) const {
    const Number end = _index.firstChild(element);
    for (Number at = _index.content(element); at < end; ++at)
        if (_index[at].nodeKind() == XMLNodeKind::attribute && _index.name(_index[at]) == name)
            return at;
    return element;
}

String becomes(const String& before, const String& now) {
    return quoted(before) + " becomes " + quoted(now);
}

void TreeComparison::compareAttributes(const Pair& pair) {
    const Number number = pair.number;
    const XMLElement* const before = pair.before;
    const XMLElement* const after = pair.after;
    before->forEachAttribute([&](const String& name, const String& value) {
        const String now = after->attributeValue(name);
        if (!now.isNull() && now == value)
            return;
        const std::string what = "@" + name.str();
        const Number entry = attribute(number, name);
        if (now.isNull())
            add(findings::lostInWriting, what, *before, entry,
                [&] { return String("it says " + quoted(value)); });
        else
            add(findings::changedInWriting, what, *before, entry,
                [&] { return becomes(value, now); });
    });
    after->forEachAttribute([&](const String& name, const String&) {
        if (before->attributeValue(name).isNull())
            add(findings::addedInWriting, "@" + name.str(), *before, number);
    });
}

void TreeComparison::compareNamespaces(const Pair& pair) {
    const Number number = pair.number;
    const XMLElement* const before = pair.before;
    const XMLElement* const after = pair.after;
    std::unordered_map<String, String> now;
    for (const XMLNode& declaration : after->namespaces())
        now.emplace(declaration.name(), declaration.stringValue());
    for (const XMLNode& declaration : before->namespaces()) {
        const auto found = now.find(declaration.name());
        if (found == now.end() || found->second != declaration.stringValue())
            add(findings::lostInWriting,
                "@xmlns" + (declaration.name().isEmpty() ? "" : ":" + declaration.name().str()),
                *before, number);
    }
}

struct Content {
    std::string text;
    std::size_t remarks = 0; // comments and instructions
};

Content contentOf(const XMLElement& element) {
    Content content;
    for (const XMLNode& child : element.children()) {
        if (child.kind() == XMLNodeKind::text)
            content.text += child.stringValue().view();
        else if (!child.isElement())
            ++content.remarks;
    }
    if (isWhite(content.text))
        content.text.clear();
    return content;
}

void TreeComparison::compareContent(const Pair& pair) {
    const Number number = pair.number;
    const XMLElement* const before = pair.before;
    const XMLElement* const after = pair.after;
    const Content original = contentOf(*before);
    const Content written = contentOf(*after);
    if (original.text != written.text) {
        const bool isLost = written.text.empty();
        const FindingText& text = isLost                  ? findings::lostInWriting
                                  : original.text.empty() ? findings::addedInWriting
                                                          : findings::changedInWriting;
        add(text, "text()", *before, number, [&] {
            const auto was = trimmed(original.text);
            return isLost                  ? String("it says " + quoted(was))
                   : original.text.empty() ? String()
                                           : becomes(was, trimmed(written.text));
        });
    }
    if (written.remarks < original.remarks)
        add(findings::remarksLost, "comment()", *before, number);
    compareChildren(pair);
}

// Children that stand before one that they followed have moved; one of them is told.
void TreeComparison::compareChildren(const Pair& pair) {
    struct Written {
        const XMLElement* element;
        std::size_t position;
    };
    const Number number = pair.number;
    const XMLElement* const before = pair.before;
    const XMLElement* const after = pair.after;
    std::unordered_map<String, std::vector<Written>> written;
    std::size_t count = 0;
    for (const XMLNode& child : after->children())
        if (const XMLElement* const element = child.asElement())
            written[element->name()].push_back({element, ++count});
    std::unordered_map<String, std::size_t> matched;
    std::size_t last = 0;
    bool isMoved = false;
    Number entry = _index.firstChild(number);
    for (const XMLNode& child : before->children()) {
        const XMLElement* const element = child.asElement();
        if (element == nullptr)
            continue;
        while (_index[entry].nodeKind() != XMLNodeKind::element)
            entry = _index.siblingOf(entry);
        const Number its = std::exchange(entry, _index.siblingOf(entry));
        const auto& list = written[element->name()];
        std::size_t& next = matched[element->name()];
        if (next == list.size()) {
            add(findings::lostInWriting, element->name(), *before, its);
            continue;
        }
        const Written& found = list[next++];
        _open.push_back({its, element, found.element});
        if (found.position < last && !isMoved)
            add(findings::movedInWriting, element->name(), *before, its);
        isMoved = isMoved || found.position < last;
        last = found.position;
    }
    for (const XMLNode& child : after->children())
        if (child.isElement() && matched[child.name()]-- == 0) {
            matched[child.name()] = 0;
            add(findings::addedInWriting, child.name(), *before, number);
        }
}

} // namespace

void compareTrees(const TakenEntries& taken, const DocumentPlaces& places, Number root,
                  const XMLElement& original, const XMLElement& written, Tally& tally) {
    TreeComparison(taken, places, tally).run(root, original, written);
}

} // namespace qx::detail
