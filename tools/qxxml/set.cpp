#include <QXXMLMarshalling/QXGenericRecord.h>

#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Saving.h"
#include "qxxml/Session.h"

#include <charconv>

namespace qxxml {

namespace {

// One step of a key path: a key, and the number of an item where it has one.
struct Step {
    std::string key;
    std::size_t item = SIZE_MAX;
};

Step stepOf(const std::string& text, const std::string& path) {
    const std::size_t bracket = text.find('[');
    Step step{text.substr(0, bracket)};
    const char* const end = text.data() + text.size();
    bool isStep = !step.key.empty();
    if (bracket != std::string::npos) {
        const auto read = std::from_chars(text.data() + bracket + 1, end, step.item);
        isStep = isStep && read.ec == std::errc() && read.ptr == end - 1 && *read.ptr == ']';
    }
    if (!isStep)
        throw Failure(message("Not a key path: %@", path));
    return step;
}

bool hasField(const QXXMLMarshaller& marshaller, const qx::Value& object, const std::string& key) {
    const QXXMLMarshallingMapping& mapping = *marshaller.mapping();
    const auto* type = mapping.mappingForClassName(object.classNameForMarshalling());
    for (std::size_t depth = 0; type != nullptr && depth < 64; ++depth) {
        for (const auto& field : type->fields())
            if (field->name() == key)
                return true;
        type = type->extends().isEmpty() ? nullptr : mapping.mappingForClassName(type->extends());
    }
    return false;
}

// Sets the value that a key path leads to; only what is there already has something inside.
class Assignment {
public:
    Assignment(const QXXMLMarshaller& marshaller, const std::string& text)
        : _marshaller(marshaller), _path(text.substr(0, text.find('='))),
          _value(text.substr(_path.size() + 1)) {}

    void perform(const qx::Value& root) const {
        qx::Value holder = root;
        std::size_t begin = 0;
        for (std::size_t dot = 0; dot != std::string::npos; begin = dot + 1) {
            dot = _path.find('.', begin);
            const Step step = stepOf(_path.substr(begin, dot - begin), _path);
            if (!holder.isObject() || !hasField(_marshaller, holder, step.key))
                throw Failure(message("The mapping has no such field: %@", _path));
            if (dot == std::string::npos)
                return set(*holder.object(), step);
            holder = item(holder.object()->valueForKey(step.key), step);
        }
    }

private:
    qx::Value item(const qx::Value& value, const Step& step) const {
        if (step.item == SIZE_MAX)
            return value;
        const auto array = value.as<qx::Array>();
        if (!array || step.item >= array->count())
            throw Failure(message("There is no such item: %@", _path));
        return array->at(step.item);
    }
    void set(qx::Object& object, const Step& step) const {
        const qx::Value held = object.valueForKey(step.key);
        if (item(held, step).isObject())
            throw Failure(message("It holds an object, and no text: %@", _path));
        if (step.item != SIZE_MAX)
            held.as<qx::Array>()->replace(step.item, _value);
        else
            object.setValueForKey(_value, step.key);
    }

    const QXXMLMarshaller& _marshaller;
    const std::string _path;
    const std::string _value;
};

} // namespace

std::string set(const Options& options) {
    const Session session(options);
    const auto marshaller = session.makeMarshaller();
    const std::string original = session.readBytes(*marshaller);
    qx::Ref<qx::Error> error;
    const auto object = marshaller->readString(original, &error);
    if (!object || error)
        throw Failure(error, session.file());
    for (const std::string& text : options.assignments)
        Assignment(*marshaller, text).perform(object);
    return saved(session, *marshaller, original, object);
}

} // namespace qxxml
