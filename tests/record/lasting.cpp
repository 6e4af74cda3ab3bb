#include <QXXMLMarshalling/platform/Null.h>
#include <QXXMLMarshalling/platform/UserDefaults.h>

extern "C" void makeLastingObjects();

extern "C" void makeLastingObjects() {
    qx::Null::marker();
    qx::UserDefaults::standardUserDefaults()->boolForKey("");
}
