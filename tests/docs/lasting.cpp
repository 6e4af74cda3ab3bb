#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/platform/Null.h>
#include <QXXMLMarshalling/platform/Observation.h>
#include <QXXMLMarshalling/platform/UserDefaults.h>

extern "C" void makeLastingObjects();

extern "C" void makeLastingObjects() {
    qx::Null::marker();
    qx::UserDefaults::standardUserDefaults()->boolForKey("");
    QXXMLDataRepositoryManager::defaultManager();
    QXXMLMarshaller::initWithMapping(nullptr)->readString("<a/>");
}
