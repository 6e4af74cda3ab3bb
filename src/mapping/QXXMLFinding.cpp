#include <QXXMLMarshalling/QXXMLFinding.h>

#include "base/Unicode.h"

const char* QXXMLFinding::nameOf(Severity severity) noexcept {
    constexpr const char* names[] = {"note", "warning", "error"};
    return names[static_cast<std::size_t>(severity)];
}

qx::String QXXMLFinding::description() const {
    std::string where = place.documentName.str();
    if (place.line != 0)
        where += ':' + std::to_string(place.line) + ':' + std::to_string(place.column);
    if (!where.empty())
        where += ": ";
    return qx::unicode::printable(qx::String::concat({where, nameOf(severity), ": ", text}));
}
