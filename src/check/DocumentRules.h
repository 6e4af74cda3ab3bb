#pragma once

// What is looked for in a document that was read, and in what writing gives of it.

#include "check/TakenEntries.h"
#include "check/Tally.h"
#include "plan/MappingPlan.h"
#include "xml/DocumentPlaces.h"

#include <unordered_map>
#include <unordered_set>

namespace qx::detail {

// Elements, attributes and texts in the root that no field took.
void checkUntaken(const TakenEntries& taken, const DocumentPlaces& places, XMLIndex::Number root,
                  Tally& tally);

// Which fields were asked for in objects, and which found something in any.
class FoundFields {
public:
    void add(const ReadingTrace& trace);
    // A finding for each field that was asked for in vain.
    void addFindings(const MappingPlan& plan, const QXXMLDocumentMapping& mapping,
                     std::vector<QXXMLFinding>& all) const;

private:
    std::unordered_map<const FieldPlan*, std::size_t> _asked; // in how many objects
    std::unordered_set<const FieldPlan*> _found;
};

// What became of the node of that path, in a few lines; null where there is none.
String reasonFor(std::string_view path, const TakenEntries& taken, const DocumentPlaces& places,
                 XMLIndex::Number root, bool keepsUnknown);

// What of the document that was read is lost, changed or moved in what was written. `original` is
// the tree of the root.
void compareTrees(const TakenEntries& taken, const DocumentPlaces& places, XMLIndex::Number root,
                  const XMLElement& original, const XMLElement& written, Tally& tally);

} // namespace qx::detail
