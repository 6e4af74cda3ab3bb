#pragma once

// The whole library: every public header. Programs that care for their compile times include those
// of the classes that they use; most start with three:
//
//     QXXMLMarshaller.h     reads and writes documents under a mapping
//     QXGenericRecord.h     what is read where no class of yours is described
//     model/Class.h         describes your own classes
//
// What stands in detail/ is for these headers alone: it may change with each version.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXMappedObject.h>
#include <QXXMLMarshalling/QXUnknownXML.h>
#include <QXXMLMarshalling/QXXMLBindToMapping.h>
#include <QXXMLMarshalling/QXXMLClassMapping.h>
#include <QXXMLMarshalling/QXXMLDataRepository.h>
#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLDocumentCheck.h>
#include <QXXMLMarshalling/QXXMLDocumentFile.h>
#include <QXXMLMarshalling/QXXMLDocumentMapping.h>
#include <QXXMLMarshalling/QXXMLFieldMapping.h>
#include <QXXMLMarshalling/QXXMLFieldValues.h>
#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLFinding.h>
#include <QXXMLMarshalling/QXXMLMapping.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/QXXMLReport.h>
#include <QXXMLMarshalling/QXXMLUpdate.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/base/Export.h>
#include <QXXMLMarshalling/base/Key.h>
#include <QXXMLMarshalling/base/Ref.h>
#include <QXXMLMarshalling/base/String.h>
#include <QXXMLMarshalling/base/Version.h>
#include <QXXMLMarshalling/files/FileWriting.h>
#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Boxed.h>
#include <QXXMLMarshalling/model/ChangeScope.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/CountedSet.h>
#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/model/DateTime.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/model/Format.h>
#include <QXXMLMarshalling/model/Invocation.h>
#include <QXXMLMarshalling/model/KeyedValue.h>
#include <QXXMLMarshalling/model/MethodSignature.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/model/Object.h>
#include <QXXMLMarshalling/model/Property.h>
#include <QXXMLMarshalling/model/Result.h>
#include <QXXMLMarshalling/model/Value.h>
#include <QXXMLMarshalling/model/ValueTraits.h>
#include <QXXMLMarshalling/model/WeakRef.h>
#include <QXXMLMarshalling/observe/Observation.h>
#include <QXXMLMarshalling/undo/ChangeTracking.h>
#include <QXXMLMarshalling/undo/UndoManager.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>
#include <QXXMLMarshalling/xml/XMLElement.h>
#include <QXXMLMarshalling/xml/XMLNode.h>
