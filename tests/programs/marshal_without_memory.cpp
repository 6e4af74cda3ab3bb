// Has each allocation of each operation of a marshaller fail, one run after the other: once alone,
// once with all that follow. The operation then gives std::bad_alloc or what it gives otherwise,
// and does its work on the same objects when it is called again.

#include "FailingMemory.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <array>
#include <fstream>
#include <iostream>
#include <sstream>
#include <streambuf>

namespace {

using qx::Error;
using qx::Ref;
using M = QXXMLMarshaller;

// Of a first input of the fuzz program: the mapping, and behind a line the document.
std::string part(bool isDocument) {
    std::ostringstream text;
    text << std::ifstream(QX_SOURCE_DIR "/fuzz/seeds/pair/every-kind.xml").rdbuf();
    const std::string both = text.str(), line = "<?document?>\n";
    const std::size_t at = both.find(line);
    return isDocument ? both.substr(at + line.size()) : both.substr(0, at);
}
const std::string mappingText = part(false);
const std::string documentText = part(true);

// What one operation works on; made anew for each run, without failures.
struct Stage {
    Ref<QXXMLMarshaller> marshaller =
        QXXMLMarshaller::initWithMappingXML(qx::XMLDocument::initWithData(mappingText).get());
    Ref<qx::XMLDocument> document = qx::XMLDocument::initWithData(documentText);
    Ref<qx::XMLElement> root{document->rootElement()};
    Ref<qx::Object> order = marshaller->readString(documentText);
    Ref<QXGenericRecord> target = qx::make<QXGenericRecord>();
    Ref<qx::XMLElement> written = qx::XMLElement::initWithName("order");
    Ref<qx::CountedSet> fields = qx::make<qx::CountedSet>();
    Ref<qx::CountedSet> attributes = qx::make<qx::CountedSet>();
    Ref<Error> error;

    Stage() { target->setClassNameForMarshalling("Order"); }
    const QXXMLClassMapping& type() const {
        return *marshaller->mapping()->mappingForClassName("Order");
    }
    const QXXMLFieldMapping& field(std::size_t i) const { return *type().fields()[i]; }
    // What the operation gave or changed. Moves kept XML, as writing does.
    template <class T>
    std::string shown(const Ref<T>& made) {
        Ref<qx::XMLElement> element;
        if constexpr (std::is_same_v<T, qx::XMLElement>)
            element = made;
        else
            element = marshaller->marshallObject(made, error ? nullptr : &error);
        return element ? element->XMLString().str()
                       : "none: " + (error ? error->description().str() : "no error");
    }
    std::string bound(bool result) {
        return (result ? "true " : "false ") + shown(target) + fields->description().str() +
               attributes->description().str();
    }
};

// A stream's memory: what failed here would be the stream's failure, which it keeps to itself.
class Buffer : public std::streambuf {
public:
    Buffer() { setp(_room.data(), _room.data() + _room.size()); }
    std::string text() const { return {pbase(), pptr()}; }

private:
    std::array<char, 4096> _room;
};

// Does its work on the stage; what it returns then shows the outcome.
using Operation = std::function<std::function<std::string()>(Stage&)>;

struct Named {
    std::string name;
    Operation run;
    // What a run that failed may leave in place, which a second one then adds to.
    std::function<void(Stage&)> restore = [](Stage&) {};
};

// What a flattened object took out of its element before memory failed stays out.
void startAgain(Stage& stage) {
    stage.document = qx::XMLDocument::initWithData(documentText);
    stage.root = Ref<qx::XMLElement>(stage.document->rootElement());
    stage.fields->removeAll();
    stage.attributes->removeAll();
}

template <class Make>
Named making(const char* name, Make make) {
    return {name, [make](Stage& stage) {
                const auto made = make(*stage.marshaller, stage);
                return [&stage, made] { return stage.shown(made); };
            }};
}

template <class Bind>
Named binding(const std::string& name, Bind bind) {
    return {name,
            [bind](Stage& stage) {
                const bool result = bind(*stage.marshaller, stage);
                return [&stage, result] { return stage.bound(result); };
            },
            startAgain};
}

template <class Write>
Named writing(const std::string& name, Write write) {
    return {name,
            [write](Stage& stage) {
                const bool result = write(*stage.marshaller, stage);
                return [&stage, result] {
                    return (result ? "true " : "false ") + stage.shown(stage.written);
                };
            },
            [](Stage& stage) { stage.written = qx::XMLElement::initWithName("order"); }};
}

std::vector<Named> readingOperations() {
    std::vector<Named> all{
        {"initWithMappingXML",
         [](Stage& s) {
             const auto made =
                 QXXMLMarshaller::initWithMappingXML(s.marshaller->mapping()->document(), &s.error);
             return [made] {
                 return std::to_string(made ? made->mapping()->mapping()->classMappings().size()
                                            : 0);
             };
         }},
        making("unmarshall", [](M& m, Stage& s) { return m.unmarshall(s.document, &s.error); }),
        making("unmarshallElement",
               [](M& m, Stage& s) { return m.unmarshallElement(s.root.get(), &s.error); }),
        making("buildClassWithMapping",
               [](M& m, Stage& s) {
                   return m.buildClassWithMapping(s.type(), s.root.get(), false, &s.error);
               }),
        making("allocateClassWithMapping",
               [](M& m, Stage& s) {
                   auto made = m.allocateClassWithMapping(s.type(), &s.error);
                   made->setValueForKey("n", "number");
                   made->setValueForKey(s.order, "flat");
                   return made;
               }),
        making("readString", [](M& m, Stage& s) { return m.readString(documentText, &s.error); }),
        binding("bindFieldsWithMapping",
                [](M& m, Stage& s) {
                    return m.bindFieldsWithMapping(s.type(), *s.target, *s.root, *s.fields,
                                                   *s.attributes, false, &s.error);
                }),
        binding("validateBoundFields",
                [](M& m, Stage& s) {
                    return m.validateBoundFields(*s.fields, *s.attributes, *s.root, *s.target,
                                                 &s.error);
                }),
        binding("TakeValueForKey", [](M&, Stage& s) {
            return TakeValueForKey(*s.target, "text", "a text of some length", s.field(2),
                                   &s.error);
        })};
    const std::size_t count = Stage().type().fields().size();
    for (std::size_t i = 0; i < count; ++i) {
        const std::string number = " " + std::to_string(i);
        for (const auto& [name, bind] : {std::pair{"bindField", &M::bindField},
                                         std::pair{"bindFieldAsElement", &M::bindFieldAsElement}})
            all.push_back(binding(name + number, [i, step = bind](M& m, Stage& s) {
                return (m.*step)(s.field(i), *s.target, 0, *s.root, *s.fields, *s.attributes, false,
                                 &s.error);
            }));
        for (const auto& [name, bind] :
             {std::pair{"bindFieldAsAttribute", &M::bindFieldAsAttribute},
              std::pair{"bindFieldAsText", &M::bindFieldAsText}})
            all.push_back(binding(name + number, [i, step = bind](M& m, Stage& s) {
                return (m.*step)(s.field(i), *s.target, 0, *s.root, *s.fields, *s.attributes,
                                 &s.error);
            }));
        for (const auto& [name, bind] :
             {std::pair{"bindCollectionField", &M::bindCollectionField},
              std::pair{"bindArrayFieldByType", &M::bindArrayFieldByType}})
            all.push_back(binding(name + number, [i, step = bind](M& m, Stage& s) {
                return (m.*step)(s.field(i), *s.target, *s.root, *s.fields, *s.attributes,
                                 &s.error);
            }));
    }
    return all;
}

std::vector<Named> writingOperations() {
    std::vector<Named> all{
        making("marshallObject",
               [](M& m, Stage& s) { return m.marshallObject(s.order, &s.error); }),
        making("elementWithMapping",
               [](M& m, Stage& s) { return m.elementWithMapping(s.type(), *s.order, &s.error); }),
        making("marshall",
               [](M& m, Stage& s) {
                   const auto document = m.marshall(s.order, &s.error);
                   return Ref<qx::XMLElement>(document ? document->rootElement() : nullptr);
               }),
        {"writeString",
         [](Stage& s) {
             const qx::String text = s.marshaller->writeString(s.order, &s.error);
             return [text] { return text.str(); };
         }},
        {"writeStream",
         [](Stage& s) {
             auto buffer = std::make_shared<Buffer>();
             std::ostream out(buffer.get());
             const bool result = s.marshaller->writeStream(s.order, out, &s.error);
             return [buffer, result] { return (result ? "true " : "false ") + buffer->text(); };
         }},
        writing("bindFieldMappings", [](M& m, Stage& s) {
            return m.bindFieldMappings(s.type(), *s.written, *s.order, &s.error);
        })};
    const std::size_t count = Stage().type().fields().size();
    for (std::size_t i = 0; i < count; ++i) {
        const std::string number = " " + std::to_string(i);
        all.push_back(writing("mapField" + number, [i](M& m, Stage& s) {
            return m.mapField(s.field(i), *s.written, *s.order, &s.error);
        }));
    }
    all.push_back(writing("mapArray", [](M& m, Stage& s) {
        const auto lines = s.order->valueForKey("lines").as<qx::Array>();
        return m.mapArray(*lines, *s.written, s.field(5), &s.error);
    }));
    return all;
}

std::string outcome(const Named& operation, Stage& stage) {
    const auto show = operation.run(stage);
    failing::countdown = failing::never;
    return show();
}

bool survives(const Named& operation) {
    bool good = true;
    const auto compare = [&](const char* when, long n, const std::string& got,
                             const std::string& expected) {
        if (got == expected)
            return;
        good = false;
        std::cout << operation.name << when << ", allocation " << n << ":\n  " << got
                  << "\ninstead of\n  " << expected << '\n';
    };
    Stage untouched;
    const std::string expected = outcome(operation, untouched);
    failing::eachAllocation([&](long n) {
        Stage stage;
        std::string got;
        const auto end = failing::run(n, [&] { got = outcome(operation, stage); });
        if (end != failing::Outcome::failed) {
            compare("", n, got, expected);
            return end;
        }
        operation.restore(stage);
        stage.error = nullptr;
        compare(" called again", n, outcome(operation, stage), expected);
        return end;
    });
    return good;
}

} // namespace

extern "C" void QXLogWarning(std::string_view, std::span<const qx::Value>) {}
extern "C" void QXLogDebug(std::string_view, std::span<const qx::Value>) {}

int main() {
    bool good = true;
    for (const auto& operations : {readingOperations(), writingOperations()})
        for (const Named& operation : operations)
            good = survives(operation) && good;
    return good ? 0 : 1;
}
