// The mapping language: which elements stand where, and what attributes they have. The nodes of a
// mapping read what they know and pass over the rest; here the rest is told.

#include "base/WhiteSpace.h"
#include "check/Rules.h"
#include "xml/XMLCharacters.h"

#include <algorithm>
#include <span>

namespace qx::detail {

namespace {

using Words = std::span<const std::string_view>;

constexpr std::string_view ofRoot[] = {"description", "include", "class"};
constexpr std::string_view ofInclude[] = {"href"};
constexpr std::string_view inClass[] = {"description", "map-to", "field"};
constexpr std::string_view ofClass[] = {"name", "type", "extends", "self-first", "auto-complete"};
constexpr std::string_view ofMapTo[] = {"xml", "ns-uri", "ns-prefix"};
constexpr std::string_view inField[] = {"description", "bind-xml", "alt-xml"};
constexpr std::string_view ofField[] = {"name",          "type",    "required",   "collection",
                                        "container",     "handler", "get-method", "set-method",
                                        "create-method", "direct",  "lazy",       "transient"};
constexpr std::string_view inBinding[] = {"description", "class"};
constexpr std::string_view ofBinding[] = {"name",       "node",    "location",     "type",
                                          "references", "matches", "QName-prefix", "auto-naming"};
constexpr std::string_view inAlternative[] = {"description"};
constexpr std::string_view ofAlternative[] = {"name", "location"};
constexpr std::string_view keptOnly[] = {"auto-complete", "handler", "get-method",   "set-method",
                                         "create-method", "direct",  "lazy",         "transient",
                                         "references",    "matches", "QName-prefix", "auto-naming"};

struct ElementRule {
    std::string_view name; // empty for the root, whatever its name
    Words children;
    Words attributes;
    std::string_view naming = {}; // the attribute that says what it is about
};

constexpr std::string_view rootName = "mapping";
// A description is for people: nothing in it is looked at.
constexpr ElementRule elementRules[] = {
    {"", ofRoot, {}},
    {"include", {}, ofInclude, "href"},
    {"class", inClass, ofClass, "name"},
    {"map-to", {}, ofMapTo, "xml"},
    {"field", inField, ofField, "name"},
    {"bind-xml", inBinding, ofBinding, "name"},
    {"alt-xml", inAlternative, ofAlternative, "name"},
};

// Words of other languages, and what stands for them here.
constexpr std::pair<std::string_view, std::string_view> foreignAttributes[] = {
    {"inherits", "extends"}, {"base", "extends"},
    {"super", "extends"},    {"parent", "extends"},
    {"class", "type"},       {"kind", "type"},
    {"of", "type"},          {"mandatory", "required"},
    {"list", "collection"},  {"multiple", "collection"},
    {"wrapper", "location"},
};

// Words that people write for the attribute that names.
constexpr std::string_view namingWords[] = {
    "name", "xml", "href",  "element", "attribute", "tag", "path", "xpath",    "id",
    "key",  "ref", "class", "file",    "src",       "url", "uri",  "document", "schemaLocation"};

bool has(Words words, std::string_view word) {
    return std::find(words.begin(), words.end(), word) != words.end();
}

const ElementRule* ruleOf(std::string_view name) {
    const auto found = std::find_if(std::begin(elementRules) + 1, std::end(elementRules),
                                    [&](const ElementRule& rule) { return rule.name == name; });
    return found != std::end(elementRules) ? found : nullptr;
}

std::string_view shownName(const ElementRule& rule) {
    return rule.name.empty() ? rootName : rule.name;
}

bool hasPrefix(std::string_view name) { return name.find(':') != std::string_view::npos; }

class GrammarCheck {
public:
    GrammarCheck(MappingCheck& check, const MappingSource& source)
        : _check(check), _source(source) {}

    void checkDocument(const XMLElement& root) {
        if (root.name() != rootName && !root.name().isEmpty())
            _check.add(ruleOf(root.name()) != nullptr ? findings::wordAsRoot : findings::otherRoot,
                       at(root), root.name());
        checkElement(root, elementRules[0]);
    }

private:
    void checkElement(const XMLElement& element, const ElementRule& rule);
    void checkChild(const XMLElement& child, const ElementRule& rule);
    void checkUnknownChild(const XMLElement& child, const ElementRule& rule);
    void checkAttribute(const String& name, const XMLElement& element, const ElementRule& rule);
    static String namingMeantBy(const String& name, const XMLElement& element,
                                const ElementRule& rule);
    void checkText(const XMLNode& text, const XMLElement& element, const ElementRule& rule);

    // Of an element that belongs to the class and the field that are open.
    Subject at(const XMLElement& element) const {
        return {&_source, element.line(), element.column(), _className, _fieldName};
    }

    MappingCheck& _check;
    const MappingSource& _source;
    String _className;
    String _fieldName;
};

// The language nests a few elements deep: what it does not know is not gone into.
void GrammarCheck::checkElement(const XMLElement& element, const ElementRule& rule) {
    if (rule.name == "class")
        _className = element.attributeValue("name");
    if (rule.name == "field")
        _fieldName = element.attributeValue("name");
    element.forEachAttribute(
        [&](const String& name, const String&) { checkAttribute(name, element, rule); });
    if (const String name = element.attributeValue("name");
        (rule.name == "class" || rule.name == "field") && !name.isNull() && name.isEmpty())
        _check.add(findings::emptyName, at(element), rule.name);
    if (rule.name == "include" && element.attributeValue("href").isNull())
        _check.add(findings::includeWithoutName, at(element));
    if (rule.name == "map-to" && element.attributeValue("ns-uri").isEmpty() &&
        !element.attributeValue("ns-prefix").isEmpty())
        _check.add(findings::prefixWithoutEffect, at(element));
    for (const XMLNode& child : element.children()) {
        if (child.isElement())
            checkChild(*child.asElement(), rule);
        else if (child.kind() == XMLNodeKind::text)
            checkText(child, element, rule);
    }
    if (rule.name == "class")
        _className = nullptr;
    if (rule.name == "field")
        _fieldName = nullptr;
}

void GrammarCheck::checkChild(const XMLElement& child, const ElementRule& rule) {
    if (!has(rule.children, child.name()))
        return checkUnknownChild(child, rule);
    if (child.name() == "description")
        return;
    if (rule.name == "bind-xml")
        return _check.add(findings::classWithoutEffect, at(child));
    checkElement(child, *ruleOf(child.name()));
}

// A prefix stands for somebody else's words, unless one of ours follows.
void GrammarCheck::checkUnknownChild(const XMLElement& child, const ElementRule& rule) {
    const String& name = child.name();
    const bool isElsewhere = ruleOf(name) != nullptr;
    const String near = isElsewhere ? String() : _check.nearest(name, rule.children);
    if (hasPrefix(name) && near.isNull())
        return;
    if (!isElsewhere)
        return _check.suggest(near, findings::unknownElement, at(child), name, shownName(rule));
    const auto* const place =
        std::find_if(std::begin(elementRules), std::end(elementRules),
                     [&](const ElementRule& other) { return has(other.children, name); });
    _check.add(findings::misplacedElement, at(child), name, shownName(rule), shownName(*place));
}

void GrammarCheck::checkAttribute(const String& name, const XMLElement& element,
                                  const ElementRule& rule) {
    const Subject subject = at(element);
    if (has(rule.attributes, name)) {
        if (has(keptOnly, name) || (rule.name == "bind-xml" && name == "type"))
            _check.add(findings::attributeWithoutEffect, subject, name, element.name());
        return;
    }
    String near = _check.nearest(name, rule.attributes);
    if (hasPrefix(name) && near.isNull())
        return;
    for (const auto& [foreign, ours] : foreignAttributes)
        if (near.isNull() && name == foreign && has(rule.attributes, ours))
            near = ours;
    if (near.isNull())
        near = namingMeantBy(name, element, rule);
    const auto* const place =
        std::find_if(std::begin(elementRules), std::end(elementRules),
                     [&](const ElementRule& other) { return has(other.attributes, name); });
    if (place == std::end(elementRules))
        return _check.suggest(near, findings::unknownAttribute, subject, name, shownName(rule));
    _check.suggest(near, findings::misplacedAttribute, subject, name, shownName(rule), place->name);
}

// An element that lacks its naming attribute may have it under another word.
String GrammarCheck::namingMeantBy(const String& name, const XMLElement& element,
                                   const ElementRule& rule) {
    if (rule.naming.empty() || !has(namingWords, name) ||
        !element.attributeValue(rule.naming).isNull())
        return nullptr;
    if (rule.name != "bind-xml" || (name != "attribute" && name != "element"))
        return String(rule.naming);
    const std::string value = element.attributeValue(name).str();
    return "name=\"" + value + "\" node=\"" + name.str() + "\"";
}

// A name may stand as text where it ought to be an attribute.
void GrammarCheck::checkText(const XMLNode& text, const XMLElement& element,
                             const ElementRule& rule) {
    constexpr std::size_t longest = 40;
    const String value = text.stringValue();
    const std::string_view shown = trimmed(value);
    if (shown.empty())
        return;
    if (!rule.naming.empty() && element.attributeValue(rule.naming).isNull() && isXMLName(shown))
        return _check.suggest(String::concat({rule.naming, "=\"", shown, "\""}),
                              findings::strayContent, at(element), shownName(rule), shown);
    std::size_t end = std::min(longest, shown.size());
    while (end < shown.size() && end > 0 && (shown[end] & 0xC0) == 0x80) // inside of a character
        --end;
    _check.add(findings::strayText, at(element), element.name(),
               std::string(shown.substr(0, end)) + (end < shown.size() ? "..." : ""));
}

} // namespace

void checkGrammar(MappingCheck& check) {
    for (const QXXMLDocumentMapping* document : check.documents())
        GrammarCheck(check, MappingSource::of(*document))
            .checkDocument(MappingSource::elementOf(*document));
    if (check.classes().empty() && !check.hasFaults())
        check.add(findings::noClasses, Subject::of(*check.documents().front(),
                                                   MappingSource::of(*check.documents().front())));
}

} // namespace qx::detail
