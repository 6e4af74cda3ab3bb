#include "saving/DocumentUpdate.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "marshaller/NamespaceMatching.h"
#include "model/Errors.h"
#include "xml/TextPosition.h"

namespace qx::detail {

namespace {

// How often more around what stands in the way is tried, before all is given up. Each takes a
// reading.
constexpr int mostAttempts = 6;

} // namespace

DocumentUpdate::DocumentUpdate(QXXMLMarshaller& marshaller, XMLBytes original, const Value& object)
    : _marshaller(&marshaller), _original(make<Data>(original.view())), _object(object),
      _after(marshaller) {}

Result<QXXMLUpdate> DocumentUpdate::run() {
    Ref<Error> error;
    if (!prepare(&error))
        return error;
    if (_source->hash() == _after.hash() && !_after.trace().declaresOtherThan(_source->written()))
        return unchanged();
    prepareWriter();
    Ref<Error> why;
    bool mayMoveAcross = true;
    for (int attempt = 0; attempt < mostAttempts; ++attempt) {
        QXXMLUpdate update;
        UpdatePlan plan(*_basis, _anew, {.addKept = true, .moveAcross = mayMoveAcross});
        Obstacle obstacle;
        if (carry(plan, update, obstacle, &error))
            return update;
        if (error)
            return error;
        if (plan.hasMovedAcross()) {
            mayMoveAcross = false;
            continue;
        }
        if (carryLess(plan, update, &error))
            return update;
        if (error)
            return error;
        why = !why ? std::move(obstacle.why) : why;
        if (!writeAnew(plan, obstacle.shown))
            break;
    }
    return why;
}

// What is kept exactly is nothing that a field took, so what is new there was added on purpose.
bool DocumentUpdate::carryLess(const UpdatePlan& plan, QXXMLUpdate& update, Ref<Error>* error) {
    if (plan.newKept().empty() || _marshaller->keepsExactly())
        return false;
    update = {};
    UpdatePlan less(*_basis, _anew, {.addKept = false, .moveAcross = false});
    Obstacle obstacle;
    if (!carry(less, update, obstacle, error))
        return false;
    for (const auto& [object, text] : less.newKept())
        update._unshown.push_back({_after.trace().keyPath(object), String(text)});
    return true;
}

// All that could not be carried at once: each attempt takes a reading.
bool DocumentUpdate::writeAnew(const UpdatePlan& plan, Shown culprit) {
    std::set<Shown> around{plan.objectAround(culprit)};
    for (const Shown failed : plan.failures())
        around.insert(plan.objectAround(failed));
    if (around.contains(WritingTrace::none))
        return false;
    _anew.merge(around);
    return true;
}

bool DocumentUpdate::prepare(Ref<Error>* error) {
    _source = TracedReading::of(*_marshaller, _original, error);
    if (!_source)
        return false;
    const TracedWriting::Size size{_source->written().size(), _source->written().textSize()};
    if (!_after.write(*_marshaller, _object, size, XMLDraft::Values::copied, error))
        return false;
    const ClassPlan& was = *_source->written().plan(0);
    const ClassPlan& is = *_after.trace().plan(0);
    if (&was != &is)
        return fail(error, errors::rootOfOtherClass, was.className.string(), is.className.string());
    return true;
}

QXXMLUpdate DocumentUpdate::unchanged() const {
    QXXMLUpdate update;
    update._bytes = _original;
    listUnshown(ShownComparison(_after.trace(), _source->written()), update);
    return update;
}

void DocumentUpdate::prepareWriter() {
    _encoding = std::make_unique<SourceEncoding>(_original->view());
    _markup = std::make_unique<SourceMarkup>(_source->index());
    _layout = std::make_unique<SourceLayout>(_source->index(), *_markup);
    _writer = std::make_unique<NewXML>(*_layout, _after.trace(), _encoding->encoder());
    _source->forEachDouble(
        [&](const ClassPlan* plan, const std::string& text) { _writer->countAsTaken(plan, text); });
    _basis = std::make_unique<UpdateSource>(UpdateSource{
        _source->index(), _source->document(), *_markup, *_layout, _source->read(),
        _source->written(), _after.trace(), *_writer,
        _marshaller->isUsingNamespaceURIs() ? NamespaceMatching::keptOf(*_marshaller) : nullptr});
}

String DocumentUpdate::nameOf(Shown shown) const {
    const String path = _after.trace().keyPath(shown);
    return !path.isEmpty() ? path : _after.trace().plan(0)->className.string();
}

bool DocumentUpdate::carry(UpdatePlan& plan, QXXMLUpdate& update, Obstacle& obstacle,
                           Ref<Error>* error) {
    try {
        plan.run();
    } catch (const Exception& exception) {
        return fail(error, errors::textCannotBeWritten, exception.reason());
    }
    if (!arrange(plan, obstacle))
        return false;
    plan.joinRemovals();
    const EditList& edits = plan.edits();
    if (edits.isEmpty()) {
        update._bytes = _original;
        return check(*_source, plan, update, obstacle);
    }
    const std::string_view text = _markup->text();
    const auto size = static_cast<EditList::Offset>(text.size());
    update._bytes = _encoding->encoded(edits.applied(text, 0, size), text, error);
    if (!update._bytes || !isRight(plan, update, obstacle, error))
        return false;
    listEdits(plan, edits, update);
    return true;
}

bool DocumentUpdate::arrange(UpdatePlan& plan, Obstacle& obstacle) const {
    const SourceEdit* const clash = plan.edits().arrange();
    if (clash != nullptr) {
        obstacle.shown = clash->shown;
        return fail(&obstacle.why, errors::changesMeet, clash->keyPath, (clash + 1)->keyPath);
    }
    if (plan.failures().empty())
        return true;
    obstacle.shown = plan.failures().front();
    return fail(&obstacle.why, errors::changeHasNoPlace, nameOf(obstacle.shown));
}

// Mostly hashes tell. What a field took and an object keeps, too, is in them, and may be older
// there than the field's value.
bool DocumentUpdate::isRight(const UpdatePlan& plan, QXXMLUpdate& update, Obstacle& obstacle,
                             Ref<Error>* error) {
    using Extent = WritingTrace::Extent;
    const auto read = [&](Extent extent) {
        Ref<Error> problem;
        auto reading = TracedReading::of(*_marshaller, update._bytes, &problem, extent);
        if (problem && problem->code() == errors::readingCancelled.code)
            *error = std::move(problem);
        else if (!reading) { // the edits are to blame
            obstacle.shown = plan.edits().edits().front().shown;
            fail(&obstacle.why, errors::changeCannotBeRead, nameOf(obstacle.shown),
                 problem->localizedDescription());
        }
        return reading;
    };
    if (!_writer->hasTaken()) {
        const auto again = read(Extent::hash);
        if (!again)
            return false;
        if (again->hash() == _after.hash() &&
            again->written().hiddenHash() == _after.trace().hiddenHash() &&
            !_after.trace().declaresOtherThan(again->written()))
            return true;
    }
    const auto again = read(Extent::all);
    return again && check(*again, plan, update, obstacle);
}

bool DocumentUpdate::check(TracedReading& reading, const UpdatePlan& plan, QXXMLUpdate& update,
                           Obstacle& obstacle) const {
    std::unordered_set<std::string> doubles;
    const auto keyOf = [](const ClassPlan* of, const std::string& text) {
        return std::to_string(of->index) + " " + text;
    };
    reading.forEachDouble(
        [&](const ClassPlan* of, const std::string& text) { doubles.insert(keyOf(of, text)); });
    ShownComparison comparison(
        _after.trace(), reading.written(),
        [&](const ClassPlan* of, const std::string& text) {
            return _writer->isTaken(of, text) || doubles.contains(keyOf(of, text));
        },
        plan.addsKept() ? UpdatePlan::NewKept() : plan.newKept());
    obstacle.shown = comparison.firstDifference();
    if (obstacle.shown != WritingTrace::none)
        return fail(&obstacle.why, errors::changeReadsOtherwise, nameOf(obstacle.shown),
                    comparison.foundInstead());
    listUnshown(comparison, update);
    return true;
}

void DocumentUpdate::listUnshown(const ShownComparison& comparison, QXXMLUpdate& update) const {
    comparison.forEachUnshown([&](Shown value) {
        update._unshown.push_back(
            {_after.trace().keyPath(value), _after.trace()[value].kind == WritingTrace::Kind::text
                                                ? String(_after.trace().text(value))
                                                : String()});
    });
}

void DocumentUpdate::listEdits(const UpdatePlan& plan, const EditList& edits,
                               QXXMLUpdate& update) const {
    TextPosition place(_markup->text());
    for (const SourceEdit& edit : edits.edits()) {
        place.moveTo(edit.begin);
        update._edits.push_back({edit.begin, place.line(), place.column(), edit.keyPath,
                                 String(_markup->text().substr(edit.begin, edit.end - edit.begin)),
                                 String(edit.text)});
    }
    Shown end = 0; // of the one before: what stands inside went with it
    for (const Shown shown : _anew) {
        if (shown < end)
            continue;
        update._writtenAnew.push_back(_after.trace().keyPath(shown));
        end = _after.trace()[shown].next;
    }
    for (const Shown shown : plan.rewritten())
        update._writtenAnew.push_back(_after.trace().keyPath(shown));
}

} // namespace qx::detail
