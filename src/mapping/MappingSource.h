#pragma once

// The mapping document that nodes were read from: its name, and the include that led there. One is
// shared by all nodes of a document; it keeps those of the documents around it. It is set up while
// the mapping is made, and only read then.

#include <QXXMLMarshalling/QXXMLMapping.h>

namespace qx::detail {

class MappingSource final : public Object {
public:
    // Of a node; of an element that is to be read, by its document's name.
    static MappingSource& of(const QXXMLMapping& node) { return *node._source; }
    static Ref<MappingSource> of(const XMLElement* element);

    const String& name() const noexcept { return _name; }
    void setName(String name) { _name = std::move(name); }
    // The document was included by the other one, at that place in it.
    void setIncluder(Ref<MappingSource> includer, const QXXMLMappingPlace& place);
    // The places of the includes, the nearest first.
    std::vector<QXXMLMappingPlace> chain() const;

protected:
    const Class& describedClass() const override;

private:
    String _name;
    Ref<MappingSource> _includer; // null for the outermost document
    QXXMLMappingPlace _place;
};

} // namespace qx::detail
