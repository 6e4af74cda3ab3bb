#pragma once

// What a marshaller passes over: handed to the handler of QXXMLMarshaller::setReportHandler() while
// it reads and writes.
//
//     marshaller->setReportHandler([](const QXXMLReport& report) {
//         std::cerr << report.place().line << ": " << report.name.view() << '\n';
//     });

#include <QXXMLMarshalling/detail/UniqueFunction.h>
#include <QXXMLMarshalling/model/Error.h>

namespace qx::detail {
class ErrorContext;
} // namespace qx::detail

class QX_API QXXMLReport {
public:
    enum class Kind : std::uint8_t {
        // No field took them. They are kept if the object can keep them; inside of a wrapper, and
        // of
        // an element that is read as a text, they are lost. A lenient marshaller that keeps no
        // unknown XML tells only of those.
        unboundChild, // a child element, or a processing instruction under its target
        unboundAttribute,
        // Text beside child elements that no field takes. Lost.
        droppedText,
        // An element among the items of a collection that is none of them. Lost.
        skippedItem,
        // An attribute that was not written, because its value is zero, false or empty; see
        // QXXMLMarshaller::setOmitsZeroAttributes().
        omittedValue
    };

    Kind kind;
    // Of the child or attribute, as written; null of a text.
    qx::String name;
    // Of the element around it, in what is written that of the field's class.
    qx::String elementName;
    // How many of that name the element has too many.
    std::size_t count = 1;
    // Whether the object is given it, to be written again.
    bool isKept = false;
    // The object that is read; null of what is written. Lent for the call.
    qx::Object* object = nullptr;

    // Where the first of them stands, worked out when asked for, during the call only. Nowhere of
    // what is written.
    qx::DocumentPlace place() const;
    qx::String path() const;

    using Handler = qx::detail::UniqueFunction<void(const QXXMLReport&)>;

    // For the library.
    const qx::detail::ErrorContext* context = nullptr;
};
