#include "qxxml/Commands.h"
#include "qxxml/Session.h"

namespace qxxml {

namespace {

// Takes the addresses out of a description. The nodes' headings, "<Name: 0x…>", are looked for in
// the order in which they are printed, so that nothing else that looks like one is changed.
class AddressRemover {
public:
    explicit AddressRemover(std::string text) : _text(std::move(text)) {}

    void pass(const QXXMLMapping& node) {
        const std::string heading = node.qx::Object::description().str();
        const std::size_t at = _text.find(heading, _position);
        if (at == std::string::npos)
            return;
        _result.append(_text, _position, at - _position);
        _result.append(heading, 0, heading.find(':'));
        _result += '>';
        _position = at + heading.size();
    }
    std::string result() {
        _result.append(_text, _position);
        return std::move(_result);
    }

private:
    std::string _text;
    std::string _result;
    std::size_t _position = 0;
};

} // namespace

std::string describe(const Options& options) {
    const auto marshaller = Session(options).makeMarshaller();
    const QXXMLDocumentMapping& document = *marshaller->mapping()->mapping();
    AddressRemover remover(document.description().str());
    remover.pass(document);
    for (const auto& mapping : document.classMappings()) {
        remover.pass(*mapping);
        for (const auto& field : mapping->fields()) {
            remover.pass(*field);
            for (const auto& binding : field->bindToMappings())
                remover.pass(*binding);
        }
    }
    return remover.result() + "\n";
}

} // namespace qxxml
