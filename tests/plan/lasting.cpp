#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Null.h>

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>

extern "C" void makeLastingObjects();

extern "C" void makeLastingObjects() {
    qx::Null::marker();
    qx::UserDefaults::standardUserDefaults();
    QXXMLDataRepositoryManager::defaultManager();
    QXXMLDataRepositoryManager::flushDefaultManager();
}
