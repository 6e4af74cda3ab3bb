#include "Task.h"

#include <QXXMLMarshalling/observe/Observation.h>

namespace {

std::vector<qx::String> keysThatSummaryFollows() { return {"title", "days", "done"}; }

} // namespace

std::string Task::summary() const {
    if (done)
        return title + ", done";
    return title + ", " + std::to_string(days) + (days == 1 ? " day" : " days");
}

void Task::finish() {
    const qx::ChangeScope doneScope(*this, "done");
    const qx::ChangeScope daysScope(*this, "days");
    done = true;
    days = 0;
}

void registerTask() {
    qx::Class::define<Task, qx::UndoableObject>("Task")
        .property<&Task::title>("title")
        .property<&Task::days>("days")
        .property<&Task::done>("done")
        .property<&Task::summary>("summary")
        .property<&Task::unboundChildren>("unboundChildren")
        .property<&Task::unboundAttributes>("unboundAttributes")
        .property<&Task::namespaces>("__namespaces")
        .operation<&Task::finish>("finish")
        .operation<&Task::isRemovable>("isRemovable")
        .classOperation<&keysThatSummaryFollows>("keyPathsForValuesAffectingSummary");
}
