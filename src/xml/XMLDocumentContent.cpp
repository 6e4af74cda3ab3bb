#include "xml/XMLDocumentContent.h"

#include "xml/XMLNodeMaker.h"
#include "xml/XMLSiblings.h"

#include <atomic>
#include <mutex>

namespace qx {

namespace {

// The elements of a whole document, by the numbers of their entries.
class AllElements final : public XMLNodeTable {
public:
    explicit AllElements(std::size_t entries) : _elements(entries) {}
    Ref<XMLNode> find(XMLIndex::Number number) const override { return _elements[number]; }
    void add(XMLIndex::Number number, XMLElement& element) override {
        _elements[number] = Ref<XMLNode>(&element);
    }

private:
    std::vector<Ref<XMLNode>> _elements;
};

} // namespace

// The nodes are made once, by the first thread that asks; others wait.
struct XMLDocument::Pending {
    std::atomic<bool> isMade = false;
    std::mutex mutex; // guards the rest
    std::shared_ptr<const ParsedDocument> parsed;
    std::size_t readers = 0;
    std::unique_ptr<AllElements> elements; // while there are readers
};

XMLDocument::XMLDocument() noexcept : XMLNode(XMLNodeKind::document, String(), String()) {}

XMLDocument::~XMLDocument() { XMLSiblings::releaseAll(_firstChild); }

void XMLDocument::makeNodes() const {
    if (!_pending || _pending->isMade.load(std::memory_order_acquire))
        return;
    const std::lock_guard lock(_pending->mutex);
    if (_pending->isMade.load(std::memory_order_relaxed))
        return;
    const XMLIndex& index = _pending->parsed->index();
    std::unique_ptr<AllElements> elements;
    if (_pending->readers != 0)
        elements = std::make_unique<AllElements>(index.entries().size());
    auto& self = const_cast<XMLDocument&>(*this);
    try {
        XMLNodeMaker(index, elements.get()).fill(self);
    } catch (...) {
        XMLSiblings::releaseAll(self._firstChild);
        throw;
    }
    _pending->elements = std::move(elements);
    _pending->parsed = nullptr;
    _pending->isMade.store(true, std::memory_order_release);
}

Ref<XMLDocument> XMLDocumentContent::document(std::shared_ptr<const ParsedDocument> parsed) {
    if (!parsed)
        return nullptr;
    auto document = Ref<XMLDocument>::adopt(new XMLDocument);
    document->_version = parsed->index().version();
    document->_standalone = parsed->index().standalone();
    document->_encoding = parsed->encoding();
    document->_pending = std::make_unique<XMLDocument::Pending>();
    document->_pending->parsed = std::move(parsed);
    return document;
}

XMLDocumentContent::Reader::Reader(const XMLDocument& document) : _document(&document) {
    if (!document._pending)
        return;
    const std::lock_guard lock(document._pending->mutex);
    _parsed = document._pending->parsed;
    if (_parsed)
        ++document._pending->readers;
}

XMLDocumentContent::Reader::~Reader() {
    if (!_parsed)
        return;
    std::unique_ptr<AllElements> unused; // goes without the lock
    const std::lock_guard lock(_document->_pending->mutex);
    if (--_document->_pending->readers == 0)
        unused = std::move(_document->_pending->elements);
}

Ref<XMLNode> XMLDocumentContent::Reader::element(XMLIndex::Number number) const {
    _document->makeNodes();
    return _document->_pending->elements->find(number);
}

} // namespace qx
