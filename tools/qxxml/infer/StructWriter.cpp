#include "qxxml/infer/Names.h"
#include "qxxml/infer/Writers.h"

#include <map>

namespace qxxml {

namespace {

// Compilers bound the classes of a variant, some at 256; far below, nobody wants to write a
// visitor. An array of any objects takes its place.
constexpr std::size_t largestVariant = 64;

class StructWriter {
public:
    explicit StructWriter(const std::vector<InferredClass>& classes) : _classes(classes) {
        for (std::size_t i = 0; i < classes.size(); ++i)
            _indexes[classes[i].name] = i;
        _states.resize(classes.size());
        _members.resize(classes.size());
    }

    std::string text(std::size_t documentCount);

private:
    enum class State { waiting, begun, done };
    struct Visit {
        std::size_t index;
        std::size_t nextField = 0;
    };

    void order(std::size_t first);
    void declareAhead();
    std::string memberType(const InferredField& field) const;
    std::string definition(std::size_t index);
    std::string registration(std::size_t index) const;

    const std::vector<InferredClass>& _classes;
    std::map<std::string, std::size_t> _indexes;
    std::vector<State> _states;
    std::vector<std::size_t> _order;
    std::set<const InferredField*> _pointers; // fields whose class is not complete before theirs
    std::set<std::string> _declared;          // classes that are used before they are complete
    std::vector<std::vector<std::string>> _members; // their names, by class and field
};

// Depth first over what is held by value, without recursion: such chains may be as long as there
// are classes.
void StructWriter::order(std::size_t first) {
    if (_states[first] != State::waiting)
        return;
    std::vector<Visit> visits{{first}};
    _states[first] = State::begun;
    while (!visits.empty()) {
        Visit& visit = visits.back();
        const auto& fields = _classes[visit.index].fields;
        if (visit.nextField == fields.size()) {
            _states[visit.index] = State::done;
            _order.push_back(visit.index);
            visits.pop_back();
            continue;
        }
        const InferredField& field = fields[visit.nextField++];
        if (field.kind != InferredKind::element || field.type != InferredType::object)
            continue;
        const std::size_t inner = _indexes.at(field.className);
        if (_states[inner] == State::begun)
            _pointers.insert(&field);
        if (_states[inner] != State::waiting)
            continue;
        _states[inner] = State::begun;
        visits.push_back({inner});
    }
}

// What pointers and collections hold may be defined later, but not be unheard of.
void StructWriter::declareAhead() {
    std::set<std::string> known;
    for (const std::size_t index : _order) {
        known.insert(_classes[index].name);
        for (const InferredField& field : _classes[index].fields) {
            if (!field.className.empty() && !known.contains(field.className))
                _declared.insert(field.className);
            for (const std::string& item : field.itemClasses)
                if (!known.contains(item))
                    _declared.insert(item);
        }
    }
}

std::string joined(const std::vector<std::string>& parts) {
    std::string text;
    for (const std::string& part : parts)
        text += (text.empty() ? "" : ", ") + part;
    return text;
}

std::string StructWriter::memberType(const InferredField& field) const {
    if (field.kind == InferredKind::mixedCollection)
        return field.itemClasses.size() > largestVariant
                   ? "qx::Value"
                   : "std::vector<std::variant<" +
                         (field.itemClasses.empty() ? "std::monostate"
                                                    : joined(field.itemClasses)) +
                         ">>";
    std::string type = field.type == InferredType::object    ? field.className
                       : field.type == InferredType::boolean ? "bool"
                       : field.isWholeNumber                 ? "std::int64_t"
                                                             : "std::string";
    if (field.kind == InferredKind::collection)
        return "std::vector<" + type + ">";
    if (_pointers.contains(&field))
        return "std::unique_ptr<" + type + ">";
    return field.isRequired ? type : "std::optional<" + type + ">";
}

std::string StructWriter::definition(std::size_t index) {
    const InferredClass& made = _classes[index];
    std::string text = "// <" + made.xmlName + ">\nstruct " + made.name + " {\n";
    UniqueNames names;
    std::vector<std::string>& members = _members[index];
    for (const InferredField& field : made.fields) {
        std::string name = memberNameOf(field.key);
        if (_indexes.contains(name))
            name += '_';
        members.push_back(names.add(name));
        const bool isNumber = field.type != InferredType::object && field.isWholeNumber;
        const std::string type = memberType(field);
        text += "    " + type + " " + members.back() +
                (type == "bool"                       ? " = false"
                 : isNumber && type == "std::int64_t" ? " = 0"
                                                      : "") +
                ";\n";
    }
    if (made.keepsXML) {
        members.push_back(names.add("unknownXML"));
        text += "    QXUnknownXML " + members.back() + ";\n";
    }
    return text + "};\n\n";
}

std::string StructWriter::registration(std::size_t index) const {
    const InferredClass& made = _classes[index];
    const std::vector<std::string>& members = _members[index];
    std::string text = "    qx::Class::define<" + made.name + ">(\"" + made.name + "\")";
    for (std::size_t i = 0; i < members.size(); ++i) {
        const std::string key = i < made.fields.size() ? made.fields[i].key : members[i];
        text += "\n        .member<&" + made.name + "::" + members[i] + ">(\"" + key + "\")";
    }
    return text + ";\n";
}

std::string StructWriter::text(std::size_t documentCount) {
    for (std::size_t i = 0; i < _classes.size(); ++i)
        order(i);
    declareAhead();
    std::string text = "// Inferred; documents: " + std::to_string(documentCount) +
                       "\n\n#include <QXXMLMarshalling/QXUnknownXML.h>\n"
                       "#include <QXXMLMarshalling/model/Class.h>\n\n"
                       "#include <cstdint>\n#include <memory>\n#include <optional>\n"
                       "#include <string>\n#include <variant>\n#include <vector>\n\n";
    for (const std::string& name : _declared)
        text += "struct " + name + ";\n";
    text += _declared.empty() ? "" : "\n";
    for (const std::size_t index : _order)
        text += definition(index);
    text +=
        "// Call it once, before the first document is read.\ninline void describeClasses() {\n";
    for (const std::size_t index : _order)
        text += registration(index);
    return text + "}\n";
}

} // namespace

std::string structsText(const std::vector<InferredClass>& classes, std::size_t documentCount) {
    return StructWriter(classes).text(documentCount);
}

} // namespace qxxml
