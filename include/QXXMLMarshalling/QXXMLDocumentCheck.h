#pragma once

// A check of a mapping against documents: what of them no field takes, which fields find nothing,
// what would be lost or moved if what was read were written again, and why a node is bound or not.
//
//     QXXMLDocumentCheck check(marshaller);
//     if (!check.addFile("order.xml", &error)) …
//     for (const QXXMLFinding& finding : check.findings())
//         std::cout << finding.description().view() << '\n';
//     std::cout << check.why("/order/item[2]/@x").view() << '\n';
//
// For one thread at a time.

#include <QXXMLMarshalling/QXXMLFinding.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <memory>

class QX_API QXXMLDocumentCheck {
public:
    // Documents are read and written by the marshaller, with its options, but that nothing fails for
    // being unknown. Its report handler is taken away.
    explicit QXXMLDocumentCheck(qx::Ref<QXXMLMarshaller> marshaller);
    ~QXXMLDocumentCheck();
    QXXMLDocumentCheck(const QXXMLDocumentCheck&) = delete;
    QXXMLDocumentCheck& operator=(const QXXMLDocumentCheck&) = delete;

    // Takes a document in. False with the error of parsing or reading it: then it does not count. A
    // root that no class maps to is a finding.
    bool addFile(const qx::String& path, qx::Ref<qx::Error>* error = nullptr);
    // The same for its bytes; findings call it by that name.
    bool addData(qx::XMLBytes bytes, const qx::String& name, qx::Ref<qx::Error>* error = nullptr);

    // What was found in all documents so far. Alike things are one finding, which counts them and
    // has the place of the first: in the document, but of fields that were never found in the
    // mapping.
    std::vector<QXXMLFinding> findings() const;

    // What became of a node of the last document, in a few lines: which field of which object took
    // it, or why none did. Paths are those of errors: /order/item[2]/@price, the first where no
    // number says which. Null where there is no such node.
    qx::String why(const qx::String& path) const;

private:
    struct State;
    std::unique_ptr<State> _state;
};
