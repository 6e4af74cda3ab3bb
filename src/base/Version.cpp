#include <QXXMLMarshalling/base/Version.h>

#define QX_TEXT_OF(number) #number
#define QX_TEXT(macro) QX_TEXT_OF(macro)

namespace qx {

int libraryVersion() noexcept { return QXXMLMARSHALLING_VERSION; }

std::string_view libraryVersionText() noexcept {
    return QX_TEXT(QXXMLMARSHALLING_VERSION_MAJOR) "." QX_TEXT(
        QXXMLMARSHALLING_VERSION_MINOR) "." QX_TEXT(QXXMLMARSHALLING_VERSION_PATCH);
}

} // namespace qx
