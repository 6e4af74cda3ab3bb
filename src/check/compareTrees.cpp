// A document beside what writing gives of the object that was read from it. The elements of one
// name are matched in their order, level by level.

#include "base/WhiteSpace.h"
#include "check/DocumentRules.h"

#include <unordered_map>

namespace qx::detail {

namespace {

class TreeComparison {
public:
    TreeComparison(const String& documentName, Tally& tally)
        : _documentName(documentName), _tally(tally) {}

    void run(const XMLElement& original, const XMLElement& written) {
        _open.emplace_back(&original, &written);
        while (!_open.empty()) {
            const auto [before, after] = _open.back();
            _open.pop_back();
            compareAttributes(*before, *after);
            compareNamespaces(*before, *after);
            compareContent(*before, *after);
        }
    }

private:
    void compareAttributes(const XMLElement& before, const XMLElement& after);
    void compareNamespaces(const XMLElement& before, const XMLElement& after);
    void compareContent(const XMLElement& before, const XMLElement& after);
    void comparePairs(const XMLElement& before, const XMLElement& after);
    void add(const FindingText& text, std::string_view what, const XMLElement& inside,
             const XMLElement& at) {
        _tally.add(text, {String::concat({inside.name(), "/", what})}, nullptr, [&] {
            return QXXMLMappingPlace{_documentName, at.line(), at.column()};
        });
    }

    const String& _documentName;
    Tally& _tally;
    std::vector<std::pair<const XMLElement*, const XMLElement*>> _open;
};

void TreeComparison::compareAttributes(const XMLElement& before, const XMLElement& after) {
    before.forEachAttribute([&](const String& name, const String& value) {
        const String now = after.attributeValue(name);
        const std::string what = "@" + name.str();
        if (now.isNull())
            add(findings::lostInWriting, what, before, before);
        else if (now != value)
            add(findings::changedInWriting, what, before, before);
    });
    after.forEachAttribute([&](const String& name, const String&) {
        if (before.attributeValue(name).isNull())
            add(findings::addedInWriting, "@" + name.str(), before, before);
    });
}

void TreeComparison::compareNamespaces(const XMLElement& before, const XMLElement& after) {
    std::unordered_map<String, String> now;
    for (const XMLNode& declaration : after.namespaces())
        now.emplace(declaration.name(), declaration.stringValue());
    for (const XMLNode& declaration : before.namespaces()) {
        const auto found = now.find(declaration.name());
        if (found == now.end() || found->second != declaration.stringValue())
            add(findings::lostInWriting,
                "@xmlns" + (declaration.name().isEmpty() ? "" : ":" + declaration.name().str()),
                before, before);
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

void TreeComparison::compareContent(const XMLElement& before, const XMLElement& after) {
    const Content original = contentOf(before);
    const Content written = contentOf(after);
    if (original.text != written.text) {
        const FindingText& text = written.text.empty()    ? findings::lostInWriting
                                  : original.text.empty() ? findings::addedInWriting
                                                          : findings::changedInWriting;
        add(text, "text()", before, before);
    }
    if (written.remarks < original.remarks)
        add(findings::remarksLost, "comment()", before, before);
    comparePairs(before, after);
}

// Children that stand before one that they followed have moved; one of them is told.
void TreeComparison::comparePairs(const XMLElement& before, const XMLElement& after) {
    struct Pair {
        const XMLElement* element;
        std::size_t position;
    };
    std::unordered_map<String, std::vector<Pair>> written;
    std::size_t count = 0;
    for (const XMLNode& child : after.children())
        if (const XMLElement* const element = child.asElement())
            written[element->name()].push_back({element, ++count});
    std::unordered_map<String, std::size_t> matched;
    std::size_t last = 0;
    bool isMoved = false;
    for (const XMLNode& child : before.children()) {
        const XMLElement* const element = child.asElement();
        if (element == nullptr)
            continue;
        const auto& list = written[element->name()];
        std::size_t& number = matched[element->name()];
        if (number == list.size()) {
            add(findings::lostInWriting, element->name(), before, *element);
            continue;
        }
        const Pair& pair = list[number++];
        _open.emplace_back(element, pair.element);
        if (pair.position < last && !isMoved)
            add(findings::movedInWriting, element->name(), before, *element);
        isMoved = isMoved || pair.position < last;
        last = pair.position;
    }
    for (const XMLNode& child : after.children())
        if (child.isElement() && matched[child.name()]-- == 0) {
            matched[child.name()] = 0;
            add(findings::addedInWriting, child.name(), before, before);
        }
}

} // namespace

void compareTrees(const XMLElement& original, const XMLElement& written, const String& documentName,
                  Tally& tally) {
    TreeComparison(documentName, tally).run(original, written);
}

} // namespace qx::detail
