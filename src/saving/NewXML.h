#pragma once

// What is new in a document, as text in its habits: values escaped for their place, elements of a
// draft printed with its indentation, quotes and line ends. What the document's encoding lacks
// becomes a reference.

#include "marshaller/OutputNames.h"
#include "marshaller/WritingTrace.h"
#include "saving/SourceLayout.h"

#include <functional>
#include <unordered_map>
#include <unordered_set>

namespace qx {
class TextEncoder;
}

namespace qx::detail {

class NewXML {
public:
    // All must outlive this. The encoder is null for UTF-8.
    NewXML(const SourceLayout& layout, const WritingTrace& shown, TextEncoder* encoder);

    // Raise NSInvalidArgumentException for what XML has no place for. Line ends of a text are the
    // document's.
    std::string text(std::string_view value) const;
    std::string attributeValue(std::string_view value, char quote) const;
    std::string attribute(std::string_view name, std::string_view value) const;

    // Whether the text may stand in a CDATA section; and as it stands there.
    bool mayBeCDATA(std::string_view value) const;
    std::string lines(std::string_view value) const;
    // Markup that is kept, as the document's encoding has it.
    std::string markup(std::string_view text) const { return escaped(text, {}, 0); }

    // What stands around a new element: its line's start, null for one without lines, the names
    // of the mapping as they are in force there, null where they are written as they are, whether
    // a namespace is declared there, and which unknown XML of an object is printed with it.
    struct Around {
        std::optional<std::string> line;
        OutputNames* names = nullptr;
        std::function<bool(const String& prefix, std::string_view URI)> isDeclared;
        std::function<bool(WritingTrace::Number object, const WritingTrace::Kept& kept)> mayKeep;
        bool isOnOneLine = false; // all that is inside the element
    };
    // `name` takes the place of the element's own, where it is given.
    std::string element(const XMLDraft::Element& element, const String* name, const Around& around);
    std::string element(const String& name, std::string_view text, const Around& around);
    // An element with nothing but an attribute.
    std::string elementWithAttribute(const String& name, const String& attributeName,
                                     std::string_view value, const Around& around);
    // An attribute's name as it is written there; a declaration that it needs is appended.
    std::string attributeName(const String& name, const Around& around,
                              std::string& declarations) const;
    // An element around others, which are printed already.
    std::string wrapper(const String& name, const std::string& inside, const Around& around);
    // The name as it is written there; a declaration that it needs is appended.
    std::string elementName(const String& name, const Around& around,
                            std::string& declarations) const;

    // Whether a kept node with that text, of an object of that class, is none of the unknown, but
    // was taken by a field, too.
    void countAsTaken(const ClassPlan* plan, const std::string& text) {
        _taken.insert(keyOf(plan, text));
    }
    bool hasTaken() const noexcept { return !_taken.empty(); }
    bool isTaken(const ClassPlan* plan, const std::string& text) const {
        return hasTaken() && _taken.contains(keyOf(plan, text));
    }

private:
    static std::string keyOf(const ClassPlan* plan, const std::string& text) {
        return std::to_string(plan->index) + " " + text;
    }
    void append(const XMLDraft::Node& node, const String* name, const Around& around,
                std::string& output);
    bool mayPrint(WritingTrace::Number object, const WritingTrace::Kept& kept,
                  const Around& around) const;
    void appendAttributes(const XMLDraft::Element& element, const Around& around,
                          std::string& output);
    bool appendContent(const XMLDraft::Element& element, const Around& around, std::string& output);
    std::string escaped(std::string_view value, std::string_view special, char quote) const;

    const SourceLayout& _layout;
    const WritingTrace& _shown;
    TextEncoder* const _encoder;
    // The objects whose fields stand in an element of the draft.
    std::unordered_map<const XMLDraft::Node*, std::vector<WritingTrace::Number>> _objects;
    std::unordered_set<std::string> _taken;
};

} // namespace qx::detail
