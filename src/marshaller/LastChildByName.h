#pragma once

// The last child element of each name, for an element that is being written and has many children
// by now. Children that are appended meanwhile are found when somebody asks; a host that takes
// others out has them forgotten.

#include <QXXMLMarshalling/xml/XMLElement.h>

#include <unordered_map>

namespace qx::detail {

class LastChildByName {
public:
    // Null when no child has that name.
    XMLElement* named(const XMLElement& parent, const String& name) {
        catchUp(parent);
        const auto found = _last.find(name);
        const bool isThere = found != _last.end() && found->second->parent() == &parent;
        return isThere ? found->second->asElement() : nullptr;
    }

    // Looks at the children behind the last one that was looked at.
    void catchUp(const XMLElement& parent) {
        const bool goesOn = _seen && _seen->parent() == &parent;
        if (!goesOn)
            _last.clear();
        XMLNode* child = goesOn ? _seen->nextSibling() : parent.firstChild();
        for (; child != nullptr; child = child->nextSibling())
            see(*child);
    }

    // The child was appended, after all others had been looked at.
    void see(XMLNode& child) {
        if (child.isElement())
            _last.insert_or_assign(child.name(), Ref<XMLNode>(&child));
        _seen = Ref<XMLNode>(&child);
    }

private:
    Ref<XMLNode> _seen;
    std::unordered_map<String, Ref<XMLNode>> _last;
};

} // namespace qx::detail
