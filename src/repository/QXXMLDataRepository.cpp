#include <QXXMLMarshalling/QXXMLDataRepository.h>

QXXMLDataRepository::~QXXMLDataRepository() = default;
QXXMLMutableDataRepository::~QXXMLMutableDataRepository() = default;
QXXMLPersistentRepository::~QXXMLPersistentRepository() = default;
