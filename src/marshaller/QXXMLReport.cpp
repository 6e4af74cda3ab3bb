#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "model/ErrorDetails.h"

qx::DocumentPlace QXXMLReport::place() const {
    return context != nullptr ? context->source().place : qx::DocumentPlace();
}

qx::String QXXMLReport::path() const {
    return context != nullptr ? context->source().path : qx::String();
}

void QXXMLMarshaller::setReportHandler(QXXMLReport::Handler handler) {
    _reportHandler = handler ? std::make_shared<QXXMLReport::Handler>(std::move(handler)) : nullptr;
}
