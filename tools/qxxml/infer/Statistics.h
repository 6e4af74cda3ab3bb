#pragma once

// What documents hold, counted by element name: the one walk over them that a mapping is inferred
// from. Takes time in proportion to the documents, and memory in proportion to their different
// names.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <deque>
#include <map>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

namespace qxxml {

// The texts of one attribute, or of the elements of one name that hold no elements.
struct TextStatistics {
    std::size_t count = 0;
    std::size_t empty = 0;
    std::size_t integers = 0; // that a whole number is written as: no "007", no "+7"
    std::size_t booleans = 0; // "true" and "false"
    std::size_t zeros = 0; // "0" and "false", which optional attributes lose where they have a type

    void see(std::string_view text);
    bool areIntegers() const { return count > 0 && integers == count; }
    bool areBooleans() const { return count > 0 && booleans == count; }
};

struct AttributeStatistics {
    std::string name;
    TextStatistics values;
};

// The children of one name in the elements of another.
struct ChildStatistics {
    std::size_t element;     // index of its name
    std::size_t parents = 0; // elements that hold one or more
    std::size_t count = 0;
    bool isRepeated = false;           // several stand in one element
    std::set<std::size_t> followers{}; // indexes of the parent's children that were seen next to it

    std::size_t lastParent = 0; // of the element that is being looked at
    std::size_t inLastParent = 0;
};

struct ElementStatistics {
    using Declaration = std::pair<std::string, std::string>; // prefix and URI

    std::string name;
    std::size_t count = 0;
    std::size_t roots = 0;
    std::size_t withChildren = 0;
    std::size_t withText = 0; // more than white space, and no elements
    std::size_t textAmongChildren = 0;
    std::size_t instructions = 0; // processing instructions, which no field has
    bool isInterleaved = false;   // <a/><b/><a/>: the order of the children carries meaning
    TextStatistics texts;         // of those without child elements
    std::vector<AttributeStatistics> attributes; // here and below in the order of the documents
    std::vector<ChildStatistics> children;
    std::map<Declaration, std::size_t> declarations;
    std::vector<std::size_t> parents;

    std::unordered_map<std::string, std::size_t> attributeIndexes;
    std::unordered_map<std::size_t, std::size_t> childIndexes;
};

class Statistics {
public:
    // Nothing of the document is kept.
    void add(const qx::XMLDocument& document);

    std::size_t documentCount() const { return _documentCount; }
    const std::deque<ElementStatistics>& elements() const { return _elements; }

private:
    std::size_t indexOf(const std::string& name);
    void see(const qx::XMLElement& element, std::size_t index);
    void seeAttributes(const qx::XMLElement& element, ElementStatistics& statistics);
    void seeChildren(const qx::XMLElement& element, std::size_t index);
    void seeChild(std::size_t parent, std::size_t child, std::size_t& previous);

    std::deque<ElementStatistics> _elements;
    std::unordered_map<std::string, std::size_t> _indexes;
    std::size_t _documentCount = 0;
    std::size_t _seen = 0; // numbers the elements whose children are looked at
};

} // namespace qxxml
