// Random mappings, documents and edits: what is saved is well-formed, reads back as the edited
// object, keeps what the mapping does not know, and changes no more bytes than the edits ask for.
// QX_SAVING_ROUNDS says how many, and
// QX_SAVING_SEED from which on.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLUpdate.h>

#include <cstdlib>
#include <map>
#include <random>

namespace {

class Rounds {
public:
    explicit Rounds(unsigned seed) : _random(seed) {}

    // One field of a class.
    struct Field {
        enum Kind { attribute, element, text, object, items, texts } kind;
        std::string name, type, location;
        std::size_t ofClass = 0;
    };

    void run() {
        for (std::size_t i = 0; i < 4; ++i)
            _classes.push_back(fields(i));
        const std::string mapping = mappingText();
        const std::string document = documentText();
        SCOPED_TRACE(mapping + "\n" + document);
        const auto marshaller = scenario::marshaller(mapping);
        qx::Ref<qx::Error> error;
        const auto object = marshaller->readString(document, &error);
        ASSERT_TRUE(object && !error) << support::told(error);
        const auto unedited = QXXMLUpdate::updatedText(*marshaller, document, object);
        ASSERT_TRUE(unedited) << support::told(unedited.error());
        EXPECT_EQ(unedited->bytes()->view(), document);
        edit(object, 0);
        moveAcross(object);
        SCOPED_TRACE(_edits);
        const auto update = QXXMLUpdate::updatedText(*marshaller, document, object);
        ASSERT_TRUE(update) << support::told(update.error());
        const std::string saved(update->bytes()->view());
        SCOPED_TRACE(saved);
        compare(*marshaller, saved, object);
        if (_isKept) {
            EXPECT_EQ(unknownIn(saved), unknownIn(document));
        }
        EXPECT_TRUE(update->writtenAnew().empty());
        std::size_t changed = 0;
        for (const QXXMLUpdate::Edit& one : update->edits())
            changed += one.oldText.size() + one.newText.size();
        EXPECT_LE(changed, _most);
        edit(object, 0);
        moveAcross(object);
        const auto later = QXXMLUpdate::updatedText(*marshaller, saved, object);
        ASSERT_TRUE(later) << support::told(later.error()) << _edits;
        compare(*marshaller, later->bytes()->view(), object);
    }

private:
    static void compare(QXXMLMarshaller& marshaller, std::string_view saved,
                        const qx::Ref<qx::Object>& object) {
        qx::Ref<qx::Error> error;
        const auto again = marshaller.readString(saved, &error);
        ASSERT_TRUE(again && !error) << support::told(error);
        marshaller.setSaveUnknownXML(false);
        EXPECT_EQ(marshaller.writeString(again), marshaller.writeString(object));
        marshaller.setSaveUnknownXML(true);
    }

    std::size_t below(std::size_t n) { return _random() % n; }
    bool isLikely(std::size_t percent) { return below(100) < percent; }

    std::vector<Field> fields(std::size_t ofClass) {
        std::vector<Field> fields;
        const std::size_t count = 1 + below(5);
        for (std::size_t i = 0; i < count; ++i) {
            Field field;
            field.kind = static_cast<Field::Kind>(below(ofClass == 3 ? 2 : 6));
            // Text beside children is read with theirs.
            if (field.kind == Field::text && count != 1)
                field.kind = Field::attribute;
            field.name = "f" + std::to_string(ofClass) + std::to_string(i);
            if (field.kind == Field::attribute || field.kind == Field::element)
                field.type = isLikely(30) ? "int" : "";
            if (field.kind == Field::attribute && isLikely(20))
                field.location = "w" + field.name;
            if (field.kind == Field::object || field.kind == Field::items)
                field.ofClass = ofClass + 1 + below(3 - ofClass);
            if ((field.kind == Field::items || field.kind == Field::texts) && isLikely(50))
                field.location = "w" + field.name;
            fields.push_back(field);
        }
        return fields;
    }

    std::string mappingText() {
        static constexpr const char* nodes[] = {"attribute", "element", "text",
                                                "element",   "element", "element"};
        std::string text;
        for (std::size_t i = 0; i < _classes.size(); ++i) {
            text += "<class name='C" + std::to_string(i) + "'><map-to xml='c" + std::to_string(i) +
                    "'/>";
            for (const Field& field : _classes[i]) {
                text += "<field name='" + field.name + "'";
                if (field.kind == Field::object || field.kind == Field::items)
                    text += " type='C" + std::to_string(field.ofClass) + "'";
                else if (field.kind == Field::texts)
                    text += " type='string'";
                else if (!field.type.empty())
                    text += " type='" + field.type + "'";
                if (field.kind == Field::items || field.kind == Field::texts)
                    text += " collection='array'";
                text += "><bind-xml node='" + std::string(nodes[field.kind]) + "'";
                if (field.kind != Field::text)
                    text += " name='" + field.name + "'";
                text += field.location.empty() ? "/></field>"
                                               : " location='" + field.location + "'/></field>";
            }
            text += "</class>";
        }
        return text;
    }

    std::string valueOf(const Field& field) {
        static constexpr const char* words[] = {"tea",      "a b", "x<y", "R&D",
                                                "\xC3\xA9", "]]>", "\"'"};
        return !field.type.empty() ? std::to_string(1 + below(90))
                                   : words[below(std::size(words))] + std::to_string(below(10));
    }

    static std::string escaped(const std::string& value) {
        std::string text;
        for (const char c : value)
            text += c == '<'   ? "&lt;"
                    : c == '&' ? "&#38;"
                    : c == '"' ? "&quot;"
                    : c == '>' ? "&gt;"
                               : std::string(1, c);
        return text;
    }
    std::string textOf(const Field& field) {
        const std::string value = valueOf(field);
        const bool isSection = isLikely(20) && value.find(']') == std::string::npos;
        return isSection ? "<![CDATA[" + value + "]]>" : escaped(value);
    }

    std::string documentText() {
        _lineEnd = isLikely(20) ? "\r\n" : isLikely(20) ? "" : "\n";
        _indent = isLikely(30) ? "\t" : "  ";
        return "<?xml version='1.0'?>" + _lineEnd + elementText("c0", 0, _lineEnd) + _lineEnd;
    }

    // Unknown XML and comments, which are counted.
    std::string noise(const std::string& line) {
        std::string text;
        while (isLikely(25)) {
            const std::string number = std::to_string(++_noise);
            text += line + (isLikely(50) ? "<!-- c" + number + " -->" : "<u" + number + " a='1'/>");
        }
        return text;
    }
    std::string elementText(const std::string& name, std::size_t ofClass, const std::string& line) {
        const std::string inside = line + (line.empty() ? "" : _indent);
        std::string tag = "<" + name, content;
        bool isText = false;
        for (std::size_t i : shuffled(_classes[ofClass].size())) {
            const Field& field = _classes[ofClass][i];
            const std::string quote = isLikely(50) ? "'" : "\"";
            if (isLikely(30))
                continue;
            const std::string attribute = " " + field.name + "=\"" + escaped(valueOf(field)) + "\"";
            switch (field.kind) {
            case Field::attribute:
                if (field.location.empty())
                    tag += (isLikely(20) ? inside : "") + attribute;
                else
                    content += inside + "<" + field.location + attribute + "/>";
                break;
            case Field::element:
                content += inside + leaf(field);
                break;
            case Field::text:
                isText = true;
                content = textOf(field) + (isLikely(30) ? "<!-- in -->" : "");
                break;
            case Field::object:
                content += inside + elementText(field.name, field.ofClass, inside);
                break;
            default:
                content += listText(field, inside);
            }
            content += isText ? "" : noise(inside);
        }
        if (content.empty())
            return tag + (isLikely(50) ? "/>" : "></" + name + ">");
        return tag + ">" + content + (isText ? "" : line) + "</" + name + ">";
    }
    std::string leaf(const Field& field) {
        return "<" + field.name + ">" + textOf(field) + "</" + field.name + ">";
    }
    std::string listText(const Field& field, const std::string& line) {
        const bool isWrapped = !field.location.empty();
        const std::string inside = line + (isWrapped && !line.empty() ? _indent : "");
        std::string items;
        for (std::size_t i = 1 + below(4); i-- > 0;)
            items += noise(inside) + inside +
                     (field.kind == Field::texts ? leaf(field)
                                                 : elementText(field.name, field.ofClass, inside));
        return isWrapped
                   ? line + "<" + field.location + ">" + items + line + "</" + field.location + ">"
                   : items;
    }
    std::vector<std::size_t> shuffled(std::size_t count) {
        std::vector<std::size_t> numbers(count);
        for (std::size_t i = 0; i < count; ++i)
            numbers[i] = i;
        for (std::size_t i = count; i > 1; --i)
            std::swap(numbers[i - 1], numbers[below(i)]);
        return numbers;
    }

    qx::Value newObject(std::size_t ofClass) {
        auto record = qx::make<QXGenericRecord>();
        record->setClassNameForMarshalling("C" + std::to_string(ofClass));
        for (const Field& field : _classes[ofClass])
            if (isLikely(60))
                record->setValueForKey(newValue(field), field.name);
        return record;
    }
    qx::Value newValue(const Field& field) {
        if (field.kind == Field::object)
            return newObject(field.ofClass);
        if (field.kind != Field::items && field.kind != Field::texts)
            return field.type.empty() ? qx::Value(valueOf(field))
                                      : qx::Value(static_cast<int>(1 + below(90)));
        auto array = qx::make<qx::Array>();
        for (std::size_t i = 1 + below(3); i-- > 0;)
            array->add(newItem(field));
        return array;
    }
    qx::Value newItem(const Field& field) {
        return field.kind == Field::items ? newObject(field.ofClass) : qx::Value(valueOf(field));
    }

    void edit(const qx::Value& object, std::size_t ofClass) {
        for (const Field& field : _classes[ofClass]) {
            const qx::Value held = object.object()->valueForKey(field.name);
            if (const auto array = held.as<qx::Array>())
                editList(field, *array);
            else if (held.isObject() && isLikely(60))
                edit(held, field.ofClass);
            else if (isLikely(25))
                change(object, field, isLikely(70) ? newValue(field) : qx::Value());
        }
    }
    // Bytes that may change with the value: those of its text and tags, and of what it holds
    // beside.
    void allow(const qx::Value& value) { _most += 150 + 25 * support::show(value).size(); }
    void change(const qx::Value& object, const Field& field, const qx::Value& value) {
        allow(object.object()->valueForKey(field.name));
        allow(value);
        _isKept = _isKept && !object.object()->valueForKey(field.name).isObject() &&
                  field.location.empty();
        object.object()->setValueForKey(value, field.name);
        _edits += field.name + " = " + support::show(value) + "\n";
    }
    void editList(const Field& field, qx::Array& array) {
        for (std::size_t i = 0; field.kind == Field::items && i < array.count(); ++i)
            if (isLikely(30))
                edit(array.at(i), field.ofClass);
        while (isLikely(30)) {
            const std::size_t at = below(array.count() + 1);
            const std::size_t what = below(3);
            _edits += field.name + "[" + std::to_string(at) + "] " + std::to_string(what) + "\n";
            if (what == 0) {
                array.insert(at, newItem(field));
                allow(array.at(at));
            } else if (at < array.count()) {
                const qx::Value item = array.at(at);
                array.remove(at);
                allow(item);
                allow(item);
                _isKept = false;
                if (what == 1)
                    array.insert(below(array.count() + 1), item);
            }
        }
    }

    using Lists = std::map<std::string, std::vector<qx::Array*>>; // of objects, by their field
    void collectLists(const qx::Value& object, std::size_t ofClass, Lists& lists) {
        for (const Field& field : _classes[ofClass]) {
            const qx::Value held = object.object()->valueForKey(field.name);
            if (const auto array = held.as<qx::Array>(); array && field.kind == Field::items) {
                lists[field.name].push_back(array.get());
                for (const qx::Value& item : *array)
                    collectLists(item, field.ofClass, lists);
            } else if (held.isObject() && field.kind == Field::object) {
                collectLists(held, field.ofClass, lists);
            }
        }
    }
    void moveAcross(const qx::Value& object) {
        Lists lists;
        collectLists(object, 0, lists);
        for (auto& [name, arrays] : lists) {
            qx::Array& from = *arrays[below(arrays.size())];
            qx::Array& to = *arrays[below(arrays.size())];
            if (&from == &to || from.isEmpty() || !isLikely(70))
                continue;
            const std::size_t at = below(from.count());
            const qx::Value item = from.at(at);
            from.remove(at);
            to.insert(below(to.count() + 1), item);
            allow(item);
            allow(item);
            _isKept = false;
            _edits += name + "[" + std::to_string(at) + "] elsewhere\n";
        }
    }

    static std::string unknownIn(const std::string& text) {
        std::string all;
        for (std::size_t at = 0; (at = text.find('<', at)) != std::string::npos; ++at)
            if (text.compare(at, 4, "<!--") == 0 || text.compare(at, 2, "<u") == 0)
                all += text.substr(at, text.find('>', at) - at + 1);
        return all;
    }

    std::mt19937 _random;
    std::vector<std::vector<Field>> _classes;
    std::string _lineEnd, _indent, _edits;
    std::size_t _noise = 0;
    std::size_t _most = 0; // bytes that the edits may change
    bool _isKept = true;   // nothing was taken away that may hold unknown XML
};

unsigned numberOf(const char* variable, unsigned usual) {
    const char* const text = std::getenv(variable);
    return text != nullptr ? static_cast<unsigned>(std::atoi(text)) : usual;
}

} // namespace

TEST(RandomSaving, ReadsBackAndKeepsWhatIsUnknown) {
    testing::internal::CaptureStderr(); // the log of unknown XML
    const unsigned first = numberOf("QX_SAVING_SEED", 1);
    const unsigned count = numberOf("QX_SAVING_ROUNDS", 300);
    for (unsigned seed = first; seed < first + count && !HasFailure(); ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        Rounds(seed).run();
    }
    testing::internal::GetCapturedStderr();
}
