// A mapping as a graph for Graphviz: a table for each class, with a row for each field, and edges
// to the classes that fields hold and that classes extend. A mapping with includes is drawn by its
// documents.

#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Session.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <set>

#include <sys/wait.h>

namespace qxxml {

namespace {

std::string escaped(std::string_view text) {
    std::string result;
    for (const char c : text) {
        switch (c) {
        case '&':
            result += "&amp;";
            break;
        case '<':
            result += "&lt;";
            break;
        case '>':
            result += "&gt;";
            break;
        case '"':
            result += "&quot;";
            break;
        default:
            result += c;
        }
    }
    return result;
}

// A word of Graphviz's own text, where a backslash has a meaning.
std::string quoted(std::string_view text) {
    std::string result = "\"";
    for (const char c : text) {
        if (c == '\\' || c == '"')
            result += '\\';
        result += c;
    }
    return result + '"';
}

// "@number", "customer", "items/item*", "text()": where the value of a field is looked for. What
// kind of node it is, the field says for all its bindings.
std::string placeOf(const QXXMLFieldMapping& field, const QXXMLBindToMapping& binding) {
    const bool isCollection = !field.collection().isEmpty();
    const bool isText = field.nodeType() == QXXMLNodeTypeText;
    std::string name = binding.bindTo().str();
    if (binding.bindTo().isEmpty() && !isText && (!isCollection || !field.type().isEmpty()))
        name = field.name().str();
    if (!isCollection && field.nodeType() == QXXMLNodeTypeAttribute)
        name = "@" + name;
    if (isText)
        name += name.empty() ? "text()" : "/text()";
    if (isCollection)
        name += "*";
    return binding.location().isEmpty() ? name : binding.location().str() + "/" + name;
}

std::string placesOf(const QXXMLFieldMapping& field) {
    if (field.bindToMappings().empty())
        return field.collection().isEmpty() ? "" : "*";
    if (!field.isContainer())
        return ".";
    std::string places;
    for (const auto& binding : field.bindToMappings())
        places += (places.empty() ? "" : " | ") + placeOf(field, *binding);
    return places;
}

// A document of the mapping: its classes, and the documents that it includes.
struct Document {
    std::string name;
    std::vector<const QXXMLClassMapping*> classes;
    std::set<std::size_t> includes;
};

class Graph {
public:
    explicit Graph(const QXXMLMarshallingMapping& mapping) : _mapping(mapping) {
        for (const auto& node : mapping.mapping()->classMappings()) {
            _numbers.emplace(node->className().str(), _numbers.size());
            addToDocument(*node);
        }
    }

    std::string text() const {
        std::string text = "digraph mapping {\n"
                           "    graph [rankdir=LR, fontname=\"sans-serif\"];\n"
                           "    node [shape=plaintext, fontname=\"sans-serif\", fontsize=11];\n"
                           "    edge [fontname=\"sans-serif\", fontsize=10];\n";
        for (std::size_t i = 0; i < _documents.size(); ++i)
            text += documentText(i);
        for (const auto& node : _mapping.mapping()->classMappings())
            text += edgesOf(*node);
        for (std::size_t i = 0; i < _documents.size(); ++i)
            for (const std::size_t included : _documents[i].includes)
                text += "    document_" + std::to_string(i) + " -> document_" +
                        std::to_string(included) + " [label=\"includes\", style=dotted];\n";
        return text + "}\n";
    }

private:
    std::size_t documentNamed(const qx::String& name) {
        const auto known =
            std::find_if(_documents.begin(), _documents.end(),
                         [&](const auto& other) { return name == std::string_view(other.name); });
        if (known == _documents.end())
            return _documents.push_back({name.str(), {}, {}}), _documents.size() - 1;
        return static_cast<std::size_t>(known - _documents.begin());
    }

    // A document without classes is there where one that has some is reached over it.
    void addToDocument(const QXXMLClassMapping& node) {
        std::size_t inner = documentNamed(node.place().documentName);
        _documents[inner].classes.push_back(&node);
        for (const QXXMLMappingPlace& place : node.includedFrom()) {
            const std::size_t outer = documentNamed(place.documentName);
            _documents[outer].includes.insert(inner);
            inner = outer;
        }
    }

    std::string documentText(std::size_t index) const {
        const Document& document = _documents[index];
        std::string tables;
        for (const auto* node : document.classes)
            tables += tableOf(*node);
        if (_documents.size() == 1)
            return tables;
        const std::string number = std::to_string(index);
        return "    subgraph cluster_" + number + " {\n    document_" + number +
               " [shape=note, label=" + quoted(document.name.substr(document.name.rfind('/') + 1)) +
               "];\n" + tables + "    }\n";
    }

    std::string nodeOf(const QXXMLClassMapping& node) const {
        return "class_" + std::to_string(_numbers.at(node.className().str()));
    }

    std::string tableOf(const QXXMLClassMapping& node) const {
        std::string name = "<b>" + escaped(node.className().view()) + "</b>";
        if (!node.type().isEmpty())
            name += " (" + escaped(node.type().view()) + ")";
        const std::string element =
            node.mapTo().isEmpty() ? "" : escaped("<" + node.mapTo().str() + ">");
        std::string text = "    " + nodeOf(node) +
                           " [label=<<table border=\"0\" cellborder=\"1\" cellspacing=\"0\">\n" +
                           row(name, element, " bgcolor=\"lightgrey\"");
        std::size_t number = 0;
        for (const auto& field : node.fields()) {
            std::string label = escaped(field->name().view());
            if (field->isRequired())
                label = "<b>" + label + "</b>";
            if (!field->type().isEmpty())
                label += ": " + escaped(field->type().view());
            text += row(label, escaped(placesOf(*field)),
                        " port=\"f" + std::to_string(number++) + "\"");
        }
        return text + "    </table>>];\n";
    }

    static std::string row(const std::string& left, const std::string& right,
                           const std::string& attributes) {
        const bool isPort = attributes.starts_with(" port");
        return "        <tr><td align=\"left\"" + (isPort ? "" : attributes) + ">" + left +
               "</td><td align=\"left\"" + attributes + ">" + right + "</td></tr>\n";
    }

    std::string edgesOf(const QXXMLClassMapping& node) const {
        std::string text;
        std::size_t number = 0;
        for (const auto& field : node.fields()) {
            const std::string port = nodeOf(node) + ":f" + std::to_string(number++);
            const auto* target = targetOf(*field);
            if (target == nullptr)
                continue;
            text += "    " + port + " -> " + nodeOf(*target);
            if (!field->collection().isEmpty())
                text += " [label=\"*\"]";
            else if (!field->isContainer())
                text += " [style=bold]";
            text += ";\n";
        }
        if (const auto* base = _mapping.mappingForClassName(node.extends()))
            text += "    " + nodeOf(node) + " -> " + nodeOf(*base) +
                    " [arrowhead=empty, style=dashed, label=\"extends\"];\n";
        return text;
    }

    // The class of a field's objects; null where values are texts, or of whatever class comes.
    const QXXMLClassMapping* targetOf(const QXXMLFieldMapping& field) const {
        if (!field.type().isEmpty())
            return _mapping.mappingForClassName(field.type());
        const auto* binding = field.bindToMapping();
        if (binding == nullptr || binding->nodeType() == QXXMLNodeTypeAttribute ||
            binding->nodeType() == QXXMLNodeTypeText)
            return nullptr;
        if (binding->bindTo().isEmpty() && !field.collection().isEmpty())
            return nullptr;
        return _mapping.mappingForElementName(binding->bindTo().isEmpty() ? field.name()
                                                                          : binding->bindTo());
    }

    const QXXMLMarshallingMapping& _mapping;
    std::map<std::string, std::size_t> _numbers;
    std::vector<Document> _documents;
};

// Has Graphviz draw the picture on standard output.
void draw(const std::string& text) {
    constexpr int notFound = 127;
    std::FILE* const program =
        ::popen("command -v dot >/dev/null || exit 127; exec dot -Tsvg", "w");
    bool isWritten =
        program != nullptr && std::fwrite(text.data(), 1, text.size(), program) == text.size();
    const int status = program != nullptr ? ::pclose(program) : -1;
    if (status != -1 && WIFEXITED(status) && WEXITSTATUS(status) == notFound)
        throw Failure("260: " + message("There is no program of the name: %@", "dot (Graphviz)"));
    if (!isWritten || status != 0)
        throw Failure("512: " + message("The program failed: %@", "dot -Tsvg"));
}

} // namespace

std::string graph(const Options& options) {
    const auto marshaller = Session(options).makeMarshaller();
    std::string text = Graph(*marshaller->mapping()).text();
    if (!options.svg)
        return text;
    draw(text);
    return {};
}

} // namespace qxxml
