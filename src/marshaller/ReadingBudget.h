#pragma once

// What one reading may still make and go over: the limits of the marshaller, counted down. The
// document is measured once, when more is made than the limits give without it.
//
// Spent once, a budget stays spent: a reading whose steps pass over failures ends all the same.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <optional>

class ReadingBudget {
public:
    using ErrorSlot = qx::Ref<qx::Error>*;

    // `root` is the element that is read, null for none; both must outlive the budget.
    ReadingBudget(const QXXMLMarshaller& marshaller, const qx::XMLElement* root) noexcept
        : _marshaller(marshaller), _root(root) {}

    // False with -224, when the limit is passed. An object of that class:
    bool takeObject(const qx::String& className, ErrorSlot error) {
        return ++_objects <= _marshaller.maximumObjects().base || mayMake(className, error);
    }
    // Nodes that are kept or copied of the element:
    bool takeKept(std::size_t nodes, const qx::XMLElement& element, ErrorSlot error) {
        _kept += nodes;
        return _kept <= _marshaller.maximumKeptNodes().base || mayKeep(element, error);
    }
    // Nodes of the element that are gone over:
    bool takeVisits(std::size_t nodes, const qx::XMLElement& element, ErrorSlot error) {
        _visits += nodes;
        return _visits / visitsPerObject <= _marshaller.maximumObjects().base ||
               mayVisit(element, error);
    }
    // The element's text, put together of what stands inside:
    bool takeText(const qx::XMLElement& element, ErrorSlot error) {
        return element.holdsText() || element.childCount() == 0 || mayJoin(element, error);
    }
    bool isSpent() const noexcept { return _isSpent; }

private:
    static constexpr std::size_t visitsPerObject = 16;

    const qx::XMLExtent& whole();
    std::size_t among(QXXMLMarshaller::Limit limit);
    bool mayMake(const qx::String& className, ErrorSlot error);
    bool mayKeep(const qx::XMLElement& element, ErrorSlot error);
    bool mayVisit(const qx::XMLElement& element, ErrorSlot error);
    bool mayJoin(const qx::XMLElement& element, ErrorSlot error);

    const QXXMLMarshaller& _marshaller;
    const qx::XMLElement* _root;
    std::size_t _objects = 0;
    std::size_t _kept = 0;
    std::size_t _visits = 0;
    std::optional<qx::XMLExtent> _whole;
    bool _isSpent = false;
};
