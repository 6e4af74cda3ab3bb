// Documents are parsed, and a marshaller reads and writes, structs, too, while memory fails
// (Trials.h).

#include "Trials.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <optional>
#include <sstream>
#include <streambuf>

namespace {

using qx::Ref;
using M = QXXMLMarshaller;

std::string contentOf(const std::filesystem::path& path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
}

std::string repeated(std::string_view text, int times) {
    std::string all;
    while (times-- > 0)
        all += text;
    return all;
}

void parsing() {
    // Texts that outgrow their first memory, and the first inputs of the fuzz program, without the
    // digit for its options.
    std::vector<std::string> documents{
        "<p:a xmlns:p='u' q:b='1' xmlns='v'><c xmlns:q='w' q:b='" + repeated("&lt;&#10;", 400) +
            "'/><![CDATA[<>]]><!--c--><?p d?><r:s/></p:a>",
        "<\xC3\xA9 \xC3\xA8='" + repeated("\xC3\xA9", 700) + "'>" + repeated("\xE2\x82\xAC", 700) +
            "<" + repeated("n", 5000) + "/></\xC3\xA9>",
        "<!--" + repeated("\xC3\xA9 - ", 900) + "--><a><![CDATA[" + repeated("\xC3\xA9]", 900) +
            "]]><?p " + repeated("\xC3\xA9?", 900) + "?></a>",
        repeated("<a xmlns:p='u' b='c'>", 60) + repeated("</a>", 60)};
    for (const auto& seed : std::filesystem::directory_iterator(QX_SOURCE_DIR "/fuzz/seeds/parse"))
        documents.push_back(contentOf(seed.path()).substr(1));
    struct Stage {
        Ref<qx::XMLDocument> document;
        Ref<qx::Error> error;
    };
    for (const std::string& text : documents)
        tryEach("parsing " + text.substr(0, 300), [&text] {
            const auto stage = std::make_shared<Stage>();
            Trial trial;
            trial.operation = [&text, stage] {
                stage->document = qx::XMLDocument::initWithData(text, {}, &stage->error);
            };
            trial.outcome = [stage] {
                return stage->document ? stage->document->description().str()
                       : stage->error  ? std::to_string(stage->error->line()) + ":" +
                                            std::to_string(stage->error->column()) + " " +
                                            stage->error->description().str()
                                      : "neither a document nor an error";
            };
            return trial;
        });
}

// Of a first input of the fuzz program: the mapping, and behind a line the document.
const std::string pairText = contentOf(QX_SOURCE_DIR "/fuzz/seeds/pair/every-kind.xml");
const std::string separator = "<?document?>\n";
const std::string mappingText = pairText.substr(0, pairText.find(separator));
const std::string documentText = pairText.substr(mappingText.size() + separator.size());

// What an operation of a marshaller works on, and what it gives.
struct Stage {
    Ref<M> marshaller = M::initWithMappingXML(qx::XMLDocument::initWithData(mappingText).get());
    M& m = *marshaller;
    Ref<qx::XMLDocument> document = qx::XMLDocument::initWithData(documentText);
    Ref<qx::XMLElement> root{document->rootElement()};
    Ref<qx::XMLDocument> withoutNodes = qx::XMLDocument::initWithData(documentText);
    Ref<qx::Object> order = marshaller->readString(documentText);
    Ref<QXGenericRecord> target = qx::make<QXGenericRecord>();
    Ref<qx::XMLElement> written = qx::XMLElement::initWithName("order");
    Ref<qx::CountedSet> fields = qx::make<qx::CountedSet>();
    Ref<qx::CountedSet> attributes = qx::make<qx::CountedSet>();
    Ref<qx::Error> error;
    Ref<qx::Object> made;
    bool result = false;
    std::string text;

    Stage() { target->setClassNameForMarshalling("Order"); }
    const QXXMLClassMapping& type() const {
        return *marshaller->mapping()->mappingForClassName("Order");
    }
    const QXXMLFieldMapping& field(std::size_t i) const { return *type().fields()[i]; }
    // As XML. Moves kept XML, as writing does.
    std::string shown(const Ref<qx::Object>& object) {
        auto element = object.as<qx::XMLElement>();
        if (object && !element)
            element = marshaller->marshallObject(object, error ? nullptr : &error);
        return element ? element->XMLString().str() : "none";
    }
    std::string outcome() {
        return text + (result ? " true " : " false ") + shown(made) + shown(target) +
               shown(written) + fields->description().str() + attributes->description().str() +
               (error ? error->description().str() : " no error");
    }
    // What a flattened object took out of its element before memory failed stays out, and what was
    // written stays in.
    void startAgain() {
        document = qx::XMLDocument::initWithData(documentText);
        root = Ref<qx::XMLElement>(document->rootElement());
        written = qx::XMLElement::initWithName("order");
        fields->removeAll();
        attributes->removeAll();
    }
};

// A stream's memory: what failed here would be the stream's failure, which it keeps to itself.
class Buffer : public std::streambuf {
public:
    Buffer() { setp(_room.data(), _room.data() + _room.size()); }
    std::string_view text() const { return {pbase(), pptr()}; }

private:
    std::array<char, 4096> _room;
};

void tryMarshaller(const std::string& name, bool changesArguments,
                   const std::function<void(Stage&)>& operation) {
    tryEach(name, [&] {
        const auto stage = std::make_shared<Stage>();
        Trial trial;
        trial.operation = [stage, &operation] { operation(*stage); };
        trial.outcome = [stage] { return stage->outcome(); };
        trial.restore = [stage, changesArguments] {
            stage->error = nullptr;
            if (changesArguments)
                stage->startAgain();
        };
        return trial;
    });
}

void marshalling() {
    const auto tryMaking = [](const char* name, auto make) { tryMarshaller(name, false, make); };
    tryMaking("initWithMappingXML", [](Stage& s) {
        const auto made = M::initWithMappingXML(s.m.mapping()->document(), &s.error);
        s.text = made ? std::to_string(made->mapping()->mapping()->classMappings().size()) : "";
    });
    tryMaking("unmarshall", [](Stage& s) { s.made = s.m.unmarshall(s.document, &s.error); });
    tryMaking("unmarshall without nodes", [](Stage& s) {
        s.made = s.m.unmarshall(s.withoutNodes, &s.error);
        s.text = s.withoutNodes->description().str();
    });
    tryMaking("rootElement",
              [](Stage& s) { s.made = Ref<qx::Object>(s.withoutNodes->rootElement()); });
    tryMaking("unmarshallElement",
              [](Stage& s) { s.made = s.m.unmarshallElement(s.root.get(), &s.error); });
    tryMaking("buildClassWithMapping", [](Stage& s) {
        s.made = s.m.buildClassWithMapping(s.type(), s.root.get(), false, &s.error);
    });
    tryMaking("allocateClassWithMapping", [](Stage& s) {
        s.made = s.m.allocateClassWithMapping(s.type(), &s.error);
        s.made->setValueForKey("n", "number");
        s.made->setValueForKey(s.order, "flat");
    });
    tryMaking("readString", [](Stage& s) { s.made = s.m.readString(documentText, &s.error); });
    tryMaking("marshallObject", [](Stage& s) { s.made = s.m.marshallObject(s.order, &s.error); });
    tryMaking("elementWithMapping",
              [](Stage& s) { s.made = s.m.elementWithMapping(s.type(), *s.order, &s.error); });
    tryMaking("marshall", [](Stage& s) {
        const auto document = s.m.marshall(s.order, &s.error);
        s.made = Ref<qx::Object>(document ? document->rootElement() : nullptr);
    });
    tryMaking("writeString", [](Stage& s) { s.text = s.m.writeString(s.order, &s.error).str(); });
    tryMaking("writeStream", [](Stage& s) {
        Buffer buffer;
        std::ostream out(&buffer);
        s.result = s.m.writeStream(s.order, out, &s.error);
        s.text = buffer.text();
    });

    tryMaking("updatedText", [](Stage& s) {
        const auto lines = s.order->valueForKey("lines").as<qx::Array>();
        if (lines->count() > 1)
            lines->remove(0);
        const auto update = QXXMLUpdate::updatedText(s.m, documentText, s.order);
        s.error = update.error();
        s.text = update ? update->bytes()->view() : std::string_view();
    });
    tryMaking("updatedText, keeping exactly", [](Stage& s) {
        s.m.setKeepsExactly(true);
        const auto order = s.m.readString(documentText);
        const auto update = QXXMLUpdate::updatedText(s.m, documentText, order);
        s.text = update ? update->bytes()->view() : std::string_view();
        s.m.setKeepsExactly(false);
    });

    const auto tryBinding = [](const std::string& name, auto bind) {
        tryMarshaller(name, true, [bind](Stage& s) { s.result = bind(s); });
    };
    tryBinding("bindFieldsWithMapping", [](Stage& s) {
        return s.m.bindFieldsWithMapping(s.type(), *s.target, *s.root, *s.fields, *s.attributes,
                                         false, &s.error);
    });
    tryBinding("validateBoundFields", [](Stage& s) {
        return s.m.validateBoundFields(*s.fields, *s.attributes, *s.root, *s.target, &s.error);
    });
    tryBinding("TakeValueForKey", [](Stage& s) {
        return TakeValueForKey(*s.target, "text", "a text of some length", s.field(2), &s.error);
    });
    tryBinding("bindFieldMappings", [](Stage& s) {
        return s.m.bindFieldMappings(s.type(), *s.written, *s.order, &s.error);
    });
    tryBinding("mapArray", [](Stage& s) {
        const auto lines = s.order->valueForKey("lines").as<qx::Array>();
        return s.m.mapArray(*lines, *s.written, s.field(5), &s.error);
    });

    // Steps for one field come with an index and a flag, with an index, or with neither.
    using Bind = std::function<bool(Stage&, const QXXMLFieldMapping&)>;
    const auto flagged = [](auto step) {
        return [step](Stage& s, const QXXMLFieldMapping& field) {
            return (s.m.*step)(field, *s.target, 0, *s.root, *s.fields, *s.attributes, false,
                               &s.error);
        };
    };
    const auto indexed = [](auto step) {
        return [step](Stage& s, const QXXMLFieldMapping& field) {
            return (s.m.*step)(field, *s.target, 0, *s.root, *s.fields, *s.attributes, &s.error);
        };
    };
    const auto plain = [](auto step) {
        return [step](Stage& s, const QXXMLFieldMapping& field) {
            return (s.m.*step)(field, *s.target, *s.root, *s.fields, *s.attributes, &s.error);
        };
    };
    const std::pair<const char*, Bind> eachField[] = {
        {"bindField", flagged(&M::bindField)},
        {"bindFieldAsElement", flagged(&M::bindFieldAsElement)},
        {"bindFieldAsAttribute", indexed(&M::bindFieldAsAttribute)},
        {"bindFieldAsText", indexed(&M::bindFieldAsText)},
        {"bindCollectionField", plain(&M::bindCollectionField)},
        {"bindArrayFieldByType", plain(&M::bindArrayFieldByType)},
        {"mapField", [](Stage& s, const QXXMLFieldMapping& field) {
             return s.m.mapField(field, *s.written, *s.order, &s.error);
         }}};
    const std::size_t count = Stage().type().fields().size();
    for (const auto& [name, bind] : eachField)
        for (std::size_t i = 0; i < count; ++i)
            tryBinding(name + (" " + std::to_string(i)),
                       [bind = bind, i](Stage& s) { return bind(s, s.field(i)); });
}

// Errors of reading and of writing, with all that they know beside their texts.
void failures() {
    const auto marshaller = M::initWithMappingXML(
        qx::XMLDocument::initWithData(
            "<mapping><class name='Order'><map-to xml='order'/>"
            "<field name='lines' type='Line' collection='array'><bind-xml name='line'/></field>"
            "</class><class name='Line'><map-to xml='line'/><field name='count' type='int' "
            "required='true'><bind-xml name='count' node='attribute'/></field><field name='part' "
            "type='Prat'><bind-xml name='part' node='element'/></field></class></mapping>")
            .get());
    marshaller->setMaximumErrors(10);
    const auto order = marshaller->readString("<order><line count='1'/><line count='2'/></order>");
    order->valueForKey("lines").as<qx::Array>()->at(1).object()->setValueForKey("p", "part");
    const auto reported = [](Stage& s) {
        s.text.clear();
        if (s.error)
            for (const auto& each : s.error->all())
                s.text.append(each->path().view()).append(each->report().view());
    };
    tryMarshaller("errors of reading", false, [&](Stage& s) {
        marshaller->readString("<order><line count='a'/><line cuont='2'/></order>", &s.error);
        reported(s);
    });
    tryMarshaller("errors of writing", false, [&](Stage& s) {
        marshaller->writeString(order, &s.error);
        reported(s);
    });
    tryMarshaller("errors of parsing", false, [&](Stage& s) {
        marshaller->readString("<order>&nbsp;</order>", &s.error);
        reported(s);
    });
}

struct Part {
    std::string name;
    int count = 0;
};
struct Crate {
    std::string label;
    Part lid;
    std::optional<Part> spare;
    std::vector<Part> parts;
};

// Structs are made in the members that hold them.
void readingStructs() {
    const auto part =
        qx::Class::define<Part>("Part").members<&Part::name, &Part::count>().registration();
    const auto crate = qx::Class::define<Crate>("Crate")
                           .members<&Crate::label, &Crate::lid, &Crate::spare, &Crate::parts>()
                           .registration();
    const auto mapping = qx::XMLDocument::initWithData(
        "<mapping><class name='Crate'><map-to xml='crate'/>"
        "<field name='label'><bind-xml name='label' node='attribute'/></field>"
        "<field name='lid' type='Part'><bind-xml name='lid' node='element'/></field>"
        "<field name='spare' type='Part'><bind-xml name='spare' node='element'/></field>"
        "<field name='parts' type='Part' collection='array'><bind-xml name='part'/></field>"
        "</class><class name='Part'>"
        "<field name='name'><bind-xml name='name' node='attribute'/></field>"
        "<field name='count' type='int'><bind-xml name='count' node='attribute'/></field>"
        "</class></mapping>");
    const std::string text = "<crate label='a label that takes memory'><lid name='an oaken lid, "
                             "polished' count='1'/><spare count='2'/><part count='3'/><part "
                             "name='a part with a long name' count='4'/></crate>";
    const auto marshaller = M::initWithMappingXML(mapping.get());
    tryEach("structs", [&] {
        const auto read = std::make_shared<Crate>();
        Trial trial;
        trial.operation = [&, read] { *read = marshaller->readString<Crate>(text).value(); };
        trial.outcome = [&, read] { return marshaller->writeString(*read).str(); };
        trial.kept = [read] { return read->label; };
        return trial;
    });
}

} // namespace

extern "C" void QXLogWarning(std::string_view, std::span<const qx::Value>) {}
extern "C" void QXLogDebug(std::string_view, std::span<const qx::Value>) {}

int main() {
    failing::replaceParserMemory();
    parsing();
    marshalling();
    failures();
    readingStructs();
    std::cout << faults << " faults\n";
    return faults == 0 ? 0 : 1;
}
