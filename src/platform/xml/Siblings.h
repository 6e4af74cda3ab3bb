#pragma once

// The doubly linked list that an element or a document keeps of its children, its attributes and
// its namespaces: the parent holds the ends and one count for each node.

#include <QXXMLMarshalling/platform/XMLNode.h>

namespace qx {

struct XMLSiblings {
    // Takes over the caller's count.
    static void append(XMLNode& parent, XMLNode*& first, XMLNode*& last, XMLNode* node) noexcept {
        node->_parent = &parent;
        node->_previous = last;
        (last != nullptr ? last->_next : first) = node;
        last = node;
    }

    static void insert(XMLNode& parent, XMLNode*& first, XMLNode*& last, XMLNode* node,
                       XMLNode* before) noexcept {
        if (before == nullptr)
            return append(parent, first, last, node);
        node->_parent = &parent;
        node->_next = before;
        node->_previous = before->_previous;
        (before->_previous != nullptr ? before->_previous->_next : first) = node;
        before->_previous = node;
    }

    // Leaves the parent's count to the caller.
    static void remove(XMLNode*& first, XMLNode*& last, XMLNode& node) noexcept {
        (node._previous != nullptr ? node._previous->_next : first) = node._next;
        (node._next != nullptr ? node._next->_previous : last) = node._previous;
        node._parent = node._next = node._previous = nullptr;
    }

    // Empties the list; nodes that someone else keeps stand alone from then on.
    static void releaseAll(XMLNode*& first, XMLNode*& last) noexcept {
        XMLNode* node = first;
        first = last = nullptr;
        while (node != nullptr) {
            XMLNode* next = node->_next;
            node->_parent = node->_next = node->_previous = nullptr;
            node->release();
            node = next;
        }
    }
};

} // namespace qx
