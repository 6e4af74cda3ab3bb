#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/observe/Observation.h>

extern "C" void makeLastingObjects();

extern "C" void makeLastingObjects() {
    qx::Null::marker();
    qx::UserDefaults::standardUserDefaults()->boolForKey("");
    QXXMLDataRepositoryManager::defaultManager();
    QXXMLMarshaller::initWithMapping(nullptr)->readString("<a/>");
}
