// What hostile documents cost at most, counted by what the library and the C parser allocate:
// parsing one takes 64 MiB and eight times its size, and binding one is bounded by what a reading
// may make and keep. And how often memory is taken for plain structs, and for saving many items.

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <libxml/parser.h>
#include <malloc.h>
#include <new>
#include <string>
#include <vector>

namespace {

using qx::Ref;

std::size_t inUse = 0;
std::size_t peak = 0;
std::size_t pieces = 0; // ever taken
bool isFailed = false;

void* counted(void* memory) {
    if (memory == nullptr)
        throw std::bad_alloc();
    ++pieces;
    inUse += ::malloc_usable_size(memory);
    peak = std::max(peak, inUse);
    return memory;
}

void release(void* memory) noexcept {
    inUse -= ::malloc_usable_size(memory);
    std::free(memory);
}

// The memory of the C parser.
void countParserMemory() {
    const auto reallocate = [](void* block, std::size_t size) {
        inUse -= ::malloc_usable_size(block);
        return counted(std::realloc(block, size));
    };
    const auto duplicate = [](const char* text) {
        return static_cast<char*>(counted(::strdup(text)));
    };
    const auto take = [](std::size_t size) { return counted(std::malloc(size)); };
    ::xmlMemSetup([](void* memory) { release(memory); }, take, reallocate, duplicate);
}

std::string repeated(std::string_view piece, std::size_t size) {
    std::string text;
    while (text.size() < size)
        text += piece;
    return text;
}

// Beyond what was in use before.
template <class Step>
std::size_t peakOf(Step step) {
    const std::size_t before = peak = inUse;
    step();
    return peak - before;
}

void expectWithin(std::size_t limit, std::size_t taken, std::string_view what) {
    if (taken <= limit)
        return;
    isFailed = true;
    std::fprintf(stderr, "%.*s: %zu, not %zu\n", static_cast<int>(what.size()), what.data(), taken,
                 limit);
}

constexpr std::size_t documentSize = 4'000'000;
constexpr std::size_t free = 64U << 20U;

// Of every shape that has many nodes in few bytes.
void parse() {
    for (const std::string_view piece :
         {"<a/>", "<a></a>", "x<a/>", "<a b='1'/>", "<a b='' c='' d=''/>", "<!---->", "<?p?>",
          "<a>x</a>", "<a>&lt;</a>", "<![CDATA[]]>x<a/>", "\n<a/>", "<a xmlns='u'/>"})
        for (const std::string_view start : {"", "<!DOCTYPE r>"}) {
            const std::string document =
                std::string(start) + "<r>" + repeated(piece, documentSize) + "</r>";
            const auto parse = [&] { isFailed |= !qx::XMLDocument::initWithData(document); };
            expectWithin(free + 8 * document.size(), peakOf(parse), piece);
        }
}

Ref<QXXMLMarshaller> marshallerFor(const std::string& classes) {
    const auto mapping = qx::XMLDocument::initWithData("<mapping>" + classes + "</mapping>");
    return QXXMLMarshaller::initWithMappingXML(mapping.get());
}

std::string nested(std::size_t levels, const std::string& content) {
    std::string document = content;
    for (std::size_t level = 0; level < levels; ++level)
        document = "<a>" + document + "</a>";
    return document;
}

// Unknown XML around a flattened object at each of 200 levels: everything is kept, once.
void keep() {
    constexpr std::size_t nodeSize = 256;
    constexpr std::size_t children = 100'000;
    const auto marshaller = marshallerFor(
        "<class name='A'><map-to xml='a'/>"
        "<field name='flat' type='Flat' container='false'><bind-xml node='element'/></field>"
        "<field name='a'><bind-xml name='a' node='element'/></field></class><class name='Flat'/>");
    const std::string document = nested(200, repeated("<b/>", 4 * children));
    expectWithin(free + 2 * nodeSize * children,
                 peakOf([&] { isFailed |= !marshaller->readString(document); }), "what is kept");
}

struct Line {
    std::string name;
    int number = 0;
    double price = 0;
};
struct Lines {
    std::vector<Line> lines;
};

// A struct takes what its members do, and has a share of the blocks that its box and the texts are
// cut from; the address sanitizer has each of these alone.
void readStructs() {
    constexpr std::size_t count = 1'000;
#ifdef __SANITIZE_ADDRESS__
    constexpr std::size_t shared = 5 * count;
#else
    constexpr std::size_t shared = count / 2;
#endif
    qx::Class::define<Line>("Line").members<&Line::name, &Line::number, &Line::price>();
    qx::Class::define<Lines>("Lines").members<&Lines::lines>();
    const auto marshaller =
        marshallerFor("<class name='Lines'><field name='lines' type='Line' collection='array'>"
                      "<bind-xml name='l'/></field></class><class name='Line'>"
                      "<field name='name'><bind-xml node='attribute'/></field>"
                      "<field name='number'><bind-xml node='attribute'/></field>"
                      "<field name='price'><bind-xml node='element'/></field></class>");
    const std::string line =
        "<l name='a name for memory of its own' number='7'><price>1.5</price></l>";
    const std::string document = "<lines>" + repeated(line, count * line.size()) + "</lines>";
    const std::size_t before = pieces;
    const auto read = marshaller->readString<Lines>(document);
    const std::size_t taken = pieces - before;
    isFailed |= !read || read->lines.size() != count || read->lines.back().price != 1.5;
    expectWithin(count + shared, taken, "pieces of memory for structs");
}

// All items edited, reversed or shuffled.
void arrange(qx::Array& items, int how) {
    const std::size_t count = items.count();
    for (std::size_t i = 0; i < count; ++i) {
        const std::size_t other = how == 1 ? count - 1 - i : i * 7919 % count;
        const qx::Value item = items.at(i);
        if (how == 0)
            item.object()->setValueForKey("new", "text");
        if (how == 0 || other <= i)
            continue;
        items.replace(i, items.at(other));
        items.replace(other, item);
    }
}

// How much memory is taken, and how often, grows with the number of items, however they change.
void save() {
    const auto marshaller =
        marshallerFor("<class name='L'><map-to xml='l'/><field name='items' type='I' "
                      "collection='array'><bind-xml name='i'/></field></class><class name='I'>"
                      "<field name='id'><bind-xml node='attribute'/></field>"
                      "<field name='text'><bind-xml node='text'/></field></class>");
    for (const int how : {0, 1, 2}) {
        std::size_t most[2] = {}, often[2] = {};
        for (const std::size_t count : {std::size_t(500), std::size_t(20'000)}) {
            std::string document = "<l>\n";
            for (std::size_t i = 0; i < count; ++i)
                document += "  <i id='" + std::to_string(i) + "'>Pens</i>\n";
            document += "</l>\n";
            const auto list = marshaller->readString(document);
            arrange(*list->valueForKey("items").as<qx::Array>(), how);
            const std::size_t before = pieces;
            const bool isLarge = count > 500;
            most[isLarge] = peakOf([&] {
                const auto update = QXXMLUpdate::updatedText(*marshaller, document, list);
                isFailed |= !update || update->edits().empty();
            });
            often[isLarge] = pieces - before;
        }
        expectWithin(48 * most[0], most[1], "memory of a save, of 40 times the items");
        expectWithin(48 * often[0], often[1], "pieces of memory of a save, of 40 times the items");
    }
}

} // namespace

void* operator new(std::size_t size) { return counted(std::malloc(size)); }
void* operator new(std::size_t size, std::align_val_t alignment) {
    const auto unit = static_cast<std::size_t>(alignment);
    return counted(std::aligned_alloc(unit, (size + unit - 1) / unit * unit));
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    void* const memory = std::malloc(size);
    return memory != nullptr ? counted(memory) : nullptr;
}
void operator delete(void* memory) noexcept { release(memory); }
void operator delete(void* memory, std::size_t) noexcept { ::operator delete(memory); }
void operator delete(void* memory, std::align_val_t) noexcept { ::operator delete(memory); }
void operator delete(void* memory, std::size_t, std::align_val_t) noexcept {
    ::operator delete(memory);
}

// Says nothing of what is kept.
void QXLogWarning(std::string_view, std::span<const qx::Value>) {}

int main() {
    countParserMemory();
    parse();
    keep();
    readStructs();
    save();
    return isFailed ? 1 : 0;
}
