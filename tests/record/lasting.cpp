#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Null.h>

extern "C" void makeLastingObjects();

extern "C" void makeLastingObjects() {
    qx::Null::marker();
    qx::UserDefaults::standardUserDefaults()->boolForKey("");
}
