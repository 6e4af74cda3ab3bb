#pragma once

// The doubly linked list that an element or a document keeps of its children, its attributes and
// its namespaces. The parent holds the first node and one count for each. The first node's
// "previous" is the last one, which saves each element three pointers.

#include <QXXMLMarshalling/xml/XMLNode.h>

namespace qx {

struct XMLSiblings {
    // Takes over the caller's count.
    static void append(XMLNode& parent, XMLNode*& first, XMLNode* node) noexcept {
        node->_parent = &parent;
        if (first == nullptr) {
            first = node->_previous = node;
            return;
        }
        node->_previous = first->_previous;
        first->_previous->_next = node;
        first->_previous = node;
    }

    static void insert(XMLNode& parent, XMLNode*& first, XMLNode* node, XMLNode* before) noexcept {
        if (before == nullptr)
            return append(parent, first, node);
        node->_parent = &parent;
        node->_next = before;
        node->_previous = before->_previous;
        if (before == first)
            first = node;
        else
            before->_previous->_next = node;
        before->_previous = node;
    }

    // Leaves the parent's count to the caller.
    static void remove(XMLNode*& first, XMLNode& node) noexcept {
        if (node._next != nullptr)
            node._next->_previous = node._previous;
        else
            first->_previous = node._previous;
        if (&node == first)
            first = node._next;
        else
            node._previous->_next = node._next;
        node._parent = node._next = node._previous = nullptr;
    }

    // Empties the list; nodes that someone else keeps stand alone from then on.
    static void releaseAll(XMLNode*& first) noexcept {
        XMLNode* node = first;
        first = nullptr;
        while (node != nullptr) {
            XMLNode* next = node->_next;
            node->_parent = node->_next = node->_previous = nullptr;
            node->release();
            node = next;
        }
    }
};

} // namespace qx
