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
    if (_source->hash() == _after.hash())
        return unchanged();
    prepareWriter();
    const UpdateSource source{
        _source->index(),
        _source->document(),
        *_markup,
        *_layout,
        _source->read(),
        _source->written(),
        _after.trace(),
        *_writer,
        _marshaller->isUsingNamespaceURIs() ? NamespaceMatching::keptOf(*_marshaller) : nullptr};
    Shown firstCulprit = WritingTrace::none;
    for (int attempt = 0; attempt < mostAttempts; ++attempt) {
        QXXMLUpdate update;
        UpdatePlan plan(source, _anew);
        Shown culprit = 0;
        if (carry(plan, update, culprit, &error))
            return update;
        if (error)
            return error;
        firstCulprit = attempt == 0 ? culprit : firstCulprit;
        if (!writeAnew(plan, culprit))
            break;
    }
    fail(&error, errors::changeCannotBeSaved, _after.trace().keyPath(firstCulprit));
    return error;
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
}

bool DocumentUpdate::carry(UpdatePlan& plan, QXXMLUpdate& update, Shown& culprit,
                           Ref<Error>* error) {
    try {
        plan.run();
    } catch (const Exception& exception) {
        return fail(error, errors::textCannotBeWritten, exception.reason());
    }
    EditList& edits = plan.edits();
    const SourceEdit* const clash = edits.arrange();
    if (clash != nullptr || !plan.failures().empty()) {
        culprit = clash != nullptr ? clash->shown : plan.failures().front();
        return false;
    }
    plan.joinRemovals();
    if (edits.isEmpty()) {
        update._bytes = _original;
        return check(*_source, update, culprit);
    }
    const std::string_view text = _markup->text();
    const auto size = static_cast<EditList::Offset>(text.size());
    update._bytes = _encoding->encoded(edits.applied(text, 0, size), text, error);
    if (!update._bytes)
        return false;
    culprit = edits.edits().front().shown;
    if (!isRight(update, culprit, error))
        return false;
    listEdits(plan, edits, update);
    return true;
}

// Mostly hashes tell. What a field took and an object keeps, too, is in them, and may be older
// there than the field's value.
bool DocumentUpdate::isRight(QXXMLUpdate& update, Shown& culprit, Ref<Error>* error) {
    using Extent = WritingTrace::Extent;
    Ref<Error> problem; // of what was written: the edits are to blame
    const auto read = [&](Extent extent) {
        auto reading = TracedReading::of(*_marshaller, update._bytes, &problem, extent);
        if (problem && problem->code() == errors::readingCancelled.code)
            *error = std::move(problem);
        return reading;
    };
    if (!_writer->hasTaken()) {
        const auto again = read(Extent::hash);
        if (!again)
            return false;
        if (again->hash() == _after.hash() &&
            again->written().hiddenHash() == _after.trace().hiddenHash())
            return true;
    }
    const auto again = read(Extent::all);
    return again && check(*again, update, culprit);
}

bool DocumentUpdate::check(TracedReading& reading, QXXMLUpdate& update, Shown& culprit) const {
    if (reading.index().entries().empty() || reading.written().size() == 0)
        return false;
    std::unordered_set<std::string> doubles;
    const auto keyOf = [](const ClassPlan* plan, const std::string& text) {
        return std::to_string(plan->index) + " " + text;
    };
    reading.forEachDouble(
        [&](const ClassPlan* plan, const std::string& text) { doubles.insert(keyOf(plan, text)); });
    ShownComparison comparison(
        _after.trace(), reading.written(), [&](const ClassPlan* plan, const std::string& text) {
            return _writer->isTaken(plan, text) || doubles.contains(keyOf(plan, text));
        });
    const Shown different = comparison.firstDifference();
    if (different != WritingTrace::none) {
        culprit = different;
        return false;
    }
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
