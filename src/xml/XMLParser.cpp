#include "xml/XMLParser.h"

#include "xml/SAXSession.h"
#include "xml/XMLInput.h"
#include "xml/XMLScanner.h"

namespace qx {

namespace {

// Hands an index to the builder, which does not see where a document comes from.
class IndexReader {
public:
    IndexReader(const XMLIndex& index, XMLTreeBuilder& builder)
        : _index(index), _builder(builder), _position(index.text()) {}

    void run() {
        const auto count = static_cast<XMLIndex::Number>(_index.entries().size());
        for (XMLIndex::Number number = 0; number < count;) {
            number = read(number);
            for (; !_open.empty() && _open.back() == number; _open.pop_back())
                _builder.endElement();
        }
    }

private:
    // The entry, of an element its attributes too; the number of the next one.
    XMLIndex::Number read(XMLIndex::Number number) {
        const XMLIndexEntry& entry = _index[number];
        switch (entry.nodeKind()) {
        case XMLNodeKind::element:
            return readElement(number);
        case XMLNodeKind::comment:
            _builder.addComment(_index.value(entry, _room));
            break;
        case XMLNodeKind::processingInstruction:
            _builder.addProcessingInstruction(_index.name(entry), _index.value(entry, _room));
            break;
        default:
            _builder.addText(_index.value(entry, _room), entry.isBlank != 0, entry.needsWork == 0);
        }
        return number + 1;
    }

    XMLIndex::Number readElement(XMLIndex::Number number) {
        const XMLIndexEntry& element = _index[number];
        XMLIndex::Number end = number + 1;
        std::size_t attributes = 0;
        for (; end < element.next && _index[end].isAttributeOrNamespace(); ++end)
            attributes += _index[end].nodeKind() == XMLNodeKind::attribute;
        _position.moveTo(element.begin);
        _builder.startElement(_index.name(element), attributes, _position.line(),
                              _position.column());
        for (++number; number < end; ++number) {
            const XMLIndexEntry& entry = _index[number];
            const String& name = _index.name(entry);
            const std::string_view value = _index.value(entry, _room);
            if (entry.nodeKind() == XMLNodeKind::namespaceDeclaration) {
                _builder.addNamespace(name, value);
                continue;
            }
            if (name == "xml:space")
                _builder.setPreservesSpace(value == "preserve");
            _builder.addAttribute(name, value);
        }
        _open.push_back(element.next);
        return end;
    }

    const XMLIndex& _index;
    XMLTreeBuilder& _builder;
    TextPosition _position;
    std::string _room;
    std::vector<XMLIndex::Number> _open; // of each open element the entry behind it
};

} // namespace

Ref<XMLDocument> XMLParser::parse(XMLBytes bytes, const XMLParseOptions& options, Ref<Error>* error,
                                  Way way) {
    XMLInput input;
    try {
        input.read(bytes);
        auto document = Ref<XMLDocument>::adopt(new XMLDocument);
        const auto index = way == Way::fastest ? XMLScanner::scan(input.text(), options)
                                               : std::optional<XMLIndex>();
        if (index)
            build(*index, *document, options);
        else
            SAXSession(input.text(), *document, options).run();
        document->setCharacterEncoding(input.declaredEncoding());
        return document;
    } catch (const ParseFailure& failure) {
        if (error == nullptr)
            return nullptr;
        TextPosition place(input.text());
        place.moveTo(failure.offset);
        *error = make<Error>(Error::parserDomain, *failure.text, failure.code, failure.arguments,
                             place.line(), place.column());
        return nullptr;
    }
}

void XMLParser::build(const XMLIndex& index, XMLDocument& document,
                      const XMLParseOptions& options) {
    XMLTreeBuilder builder(document, options);
    IndexReader(index, builder).run();
    if (!index.hasDeclaration())
        return;
    document.setVersion("1.0");
    if (!index.standalone().empty())
        document.setStandalone(index.standalone());
}

} // namespace qx
