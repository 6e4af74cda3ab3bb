// What host/ keeps for ever is no leak of the first test that needs it.

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/host/UserDefaults.h>

extern "C" void makeHostObjects();

extern "C" void makeHostObjects() {
    qx::Bundle::mainBundle();
    qx::Bundle::frameworkBundle();
    qx::UserDefaults::standardUserDefaults()->boolForKey("");
}
