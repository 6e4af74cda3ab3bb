#pragma once

// One update of a document's text: planned, carried out, read again and compared. What does not
// come back as it should is written anew, with as little around it as will do.

#include <QXXMLMarshalling/QXXMLUpdate.h>

#include "saving/ShownComparison.h"
#include "saving/SourceEncoding.h"
#include "saving/TracedObject.h"
#include "saving/UpdatePlan.h"

namespace qx::detail {

class DocumentUpdate {
public:
    DocumentUpdate(QXXMLMarshaller& marshaller, XMLBytes original, const Value& object);

    Result<QXXMLUpdate> run();

private:
    using Shown = WritingTrace::Number;

    bool prepare(Ref<Error>* error);
    void prepareWriter();
    QXXMLUpdate unchanged() const;
    // The object or field in the way of a change, and an error that says why.
    struct Obstacle {
        Shown shown = 0;
        Ref<Error> why;
    };
    // Carries out the plan. False with an error, or with an obstacle.
    bool carry(UpdatePlan& plan, QXXMLUpdate& update, Obstacle& obstacle, Ref<Error>* error);
    // The same without the unknown XML that the plan adds, if it does.
    bool carryLess(const UpdatePlan& plan, QXXMLUpdate& update, Ref<Error>* error);
    bool arrange(UpdatePlan& plan, Obstacle& obstacle) const;
    // Has the smallest objects around what could not be carried written anew next time. False where
    // one has none around it.
    bool writeAnew(const UpdatePlan& plan, Shown culprit);
    // Whether the update's bytes say, read again, what the object says. False with an error where
    // that was cancelled.
    bool isRight(const UpdatePlan& plan, QXXMLUpdate& update, Obstacle& obstacle,
                 Ref<Error>* error);
    // Whether the reading says what the object says.
    bool check(TracedReading& reading, const UpdatePlan& plan, QXXMLUpdate& update,
               Obstacle& obstacle) const;
    // The key path; of the root its class.
    String nameOf(Shown shown) const;
    void listUnshown(const ShownComparison& comparison, QXXMLUpdate& update) const;
    void listEdits(const UpdatePlan& plan, const EditList& edits, QXXMLUpdate& update) const;

    const Ref<QXXMLMarshaller> _marshaller;
    const Ref<Data> _original;
    const Value _object;
    std::unique_ptr<TracedReading> _source;
    TracedWriting _after;
    std::unique_ptr<SourceEncoding> _encoding;
    std::unique_ptr<SourceMarkup> _markup;
    std::unique_ptr<SourceLayout> _layout;
    std::unique_ptr<NewXML> _writer;
    std::unique_ptr<UpdateSource> _basis; // of all plans
    std::set<Shown> _anew;
};

} // namespace qx::detail
