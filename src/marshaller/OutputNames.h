#pragma once

// The names that elements and attributes are written under where a mapping's names are matched by
// namespace. A name of the mapping stands for a namespace (NamespaceTable.h) and a local name; in
// the document it has a prefix that is declared for that namespace around it, whatever the mapping
// has. Where there is none the element declares one.
//
// What is in force is known from the elements that are open: a writing enters them from the outside
// in. Each operation takes logarithmic time, however much is declared.

#include <QXXMLMarshalling/base/String.h>

#include "xml/NamespaceTable.h"

#include <map>
#include <memory>
#include <optional>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

namespace qx::detail {

class OutputNames {
public:
    struct Declaration {
        String prefix;
        String URI;
    };
    // A name, good as long as this object, and what the element that has it must declare.
    struct Name {
        const String& text;
        std::optional<Declaration> declaration;
    };

    explicit OutputNames(std::shared_ptr<const NamespaceTable> table) : _table(std::move(table)) {}

    // Opens an element that declares this; leave() closes it.
    void enter(const std::vector<Declaration>& declarations);
    void leave();
    // Declares it on the element that was opened last, too.
    void declare(const Declaration& declaration);
    // What was declared by declare() there.
    const std::vector<Declaration>& added() const { return _open.back().added; }

    // The same text, good as long as this object.
    const String& lasting(const String& text) { return *_texts.insert(text).first; }
    Name elementName(const String& name) { return nameFor(name, false); }
    Name attributeName(const String& name) { return nameFor(name, true); }

private:
    // A prefix that is in force: since which declaration, and for what.
    struct Binding {
        String URI; // empty: none
        std::size_t since = 0;
    };
    struct Undo {
        String prefix;
        Binding binding;
    };
    struct Open {
        std::size_t declared; // how long the list of what is to be undone was
        std::vector<Declaration> added;
    };

    Name nameFor(const String& name, bool isAttribute);
    // Null where no declaration in force has it. An attribute's is not empty.
    const String* prefixOf(const String& URI, bool isAttribute) const;
    const String& boundTo(const String& prefix) const;
    void bind(const String& prefix, const Binding& binding);
    String newPrefix(const String& URI, const String& wanted, bool isAttribute);
    const String& kept(std::string_view prefix, std::string_view local);

    const std::shared_ptr<const NamespaceTable> _table;
    std::unordered_map<String, Binding> _inForce;                        // by prefix
    std::unordered_map<String, std::map<std::size_t, String>> _prefixes; // by URI, latest last
    std::vector<Undo> _undo;
    std::vector<Open> _open{Open{0, {}}};
    std::size_t _count = 0; // of declarations
    std::unordered_set<String> _texts;
    std::unordered_map<String, std::size_t> _made; // numbers of URIs in prefixes of our own
};

} // namespace qx::detail
