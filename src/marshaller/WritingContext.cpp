#include "marshaller/WritingContext.h"

#include "mapping/MappingSource.h"
#include "marshaller/TakenNames.h"
#include "model/Errors.h"

namespace qx::detail {

namespace {

// Objects nest deeper than anybody reads: the nearest steps count.
constexpr std::size_t mostSteps = 32;

} // namespace

void WritingContext::tell(const Ref<Error>& error, const QXXMLMarshallingMapping* mapping,
                          const QXXMLFieldMapping* field, const QXXMLClassMapping* type) {
    if (!error || ErrorDetails::hasContext(*error))
        return;
    auto context = std::make_unique<WritingContext>();
    context->_code = error->code();
    context->_mapping = Ref(mapping);
    context->_field = Ref(field);
    context->_class = Ref(type);
    ErrorDetails::setContext(*error, std::move(context));
}

// An error that a host's accessor brought along has a context of its own.
void WritingContext::addStep(const Ref<Error>& error, std::string_view step) {
    const auto* const before =
        error ? dynamic_cast<const WritingContext*>(&ErrorDetails::contextOf(*error)) : nullptr;
    if (before == nullptr || before->_steps > mostSteps)
        return;
    const std::string_view path = before->_path.isNull() ? "" : before->_path.view();
    const bool isCut = before->_steps == mostSteps;
    const std::string_view point = path.empty() || path.front() == '[' || isCut ? "" : ".";
    auto context = std::make_unique<WritingContext>();
    context->_code = before->_code;
    context->_path = String::concat({isCut ? "..." : step, point, path});
    context->_steps = before->_steps + 1;
    context->_mapping = before->_mapping;
    context->_field = before->_field;
    context->_class = before->_class;
    ErrorDetails::setContext(*error, std::move(context));
}

void WritingContext::tellKey(const Ref<Error>& error, std::string_view key) { addStep(error, key); }

void WritingContext::tellItem(const Ref<Error>& error, std::size_t number) {
    addStep(error, "[" + std::to_string(number) + "]");
}

SourcePlace WritingContext::source() const {
    SourcePlace source;
    source.path = _path;
    return source;
}

MappingNote WritingContext::mapping() const {
    return MappingSource::noteOf(_field.get(), _class.get());
}

String WritingContext::suggestion() const {
    const bool isTypeMissing = _code == errors::noMappingForClass.code && _field;
    return isTypeMissing && _mapping ? suggestedClass(*_mapping, _field->type()) : String();
}

} // namespace qx::detail
