#pragma once

// What one reading may still make and go over: the limits of the marshaller. The document is only
// measured when more is made than they give without it, and then no more of it than needed.
//
// Spent once, a budget stays spent: a reading whose steps pass over failures ends all the same.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "xml/IndexedXML.h"

namespace qx::detail {

class ReadingBudget {
public:
    using ErrorSlot = Ref<Error>*;

    using Number = IndexedXML::Number;

    // Both must outlive the budget.
    ReadingBudget(const QXXMLMarshaller& marshaller, IndexedXML& document) noexcept;

    // False with -224, when the limit is passed. An object of that class:
    bool takeObject(const String& className, ErrorSlot error) {
        return ++_objects.taken <= _objects.limit || mayMake(className, error);
    }
    // Nodes that are kept or copied of the element:
    bool takeKept(std::size_t nodes, Number element, ErrorSlot error) {
        return (_kept.taken += nodes) <= _kept.limit || mayKeep(element, error);
    }
    // Nodes of the element that are gone over:
    bool takeVisits(std::size_t nodes, Number element, ErrorSlot error) {
        return (_visits.taken += nodes) <= _visits.limit || mayVisit(element, error);
    }
    // The element's text, put together of what stands inside:
    bool takeText(Number element, ErrorSlot error) {
        return _document.hasPlainText(element) || mayJoin(element, error);
    }
    bool isSpent() const noexcept { return _isSpent; }

private:
    // `limit` grows with what has been measured of the document.
    struct Count {
        std::size_t taken = 0;
        std::size_t limit = 0;
    };

    void setLimits() noexcept;
    bool isWithin(const Count& count);
    bool mayMake(const String& className, ErrorSlot error);
    bool mayKeep(Number element, ErrorSlot error);
    bool mayVisit(Number element, ErrorSlot error);
    bool mayJoin(Number element, ErrorSlot error);

    const QXXMLMarshaller& _marshaller;
    IndexedXML& _document;
    Count _objects;
    Count _kept;
    Count _visits;
    IndexedXML::Extent _measured;
    std::size_t _enough = 0; // nodes up to which the document was measured
    bool _isSpent = false;
};

} // namespace qx::detail
