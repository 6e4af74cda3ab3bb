#pragma once

// Tells the host's handler what reading and writing pass over. It keeps the handler, which may set
// another meanwhile.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "plan/MappingPlan.h"
#include "xml/IndexedXML.h"

namespace qx::detail {

class Reporting {
public:
    using Kind = QXXMLReport::Kind;
    using Number = IndexedXML::Number;

    explicit Reporting(const QXXMLMarshaller& marshaller) noexcept
        : _handler(marshaller._reportHandler) {}
    // To nobody.
    Reporting() noexcept = default;
    // Whether anybody listens: ask before anything is looked for.
    bool isOn() const noexcept { return _handler != nullptr; }

    // Of what is read: a node in the element.
    void tell(Kind kind, IndexedXML& document, Number element, Number node, Object* object,
              std::size_t count = 1, bool isKept = false) const;
    // The attributes and child elements of an element of which nothing but its text is read.
    void tellInside(IndexedXML& document, Number element, Object* object) const;
    // The texts in an element that are no layout.
    void tellTexts(IndexedXML& document, Number element, Object* object) const;
    // What none of the class's fields takes of the wrapper around a collection's items.
    // `field` is the one that found it: the first of them tells.
    void tellWrapper(IndexedXML& document, Number wrapper, const ClassPlan& plan,
                     const FieldPlan& field, Object* object) const;
    // Of what is written.
    void tellOmitted(const FieldPlan& field) const;

private:
    const std::shared_ptr<QXXMLReport::Handler> _handler;
};

} // namespace qx::detail
