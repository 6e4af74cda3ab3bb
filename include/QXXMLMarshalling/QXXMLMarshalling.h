#pragma once

// The whole library: every public header. Programs that care for their compile times include those
// of the classes that they use.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLBindToMapping.h>
#include <QXXMLMarshalling/QXXMLClassMapping.h>
#include <QXXMLMarshalling/QXXMLDataRepository.h>
#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLDocumentMapping.h>
#include <QXXMLMarshalling/QXXMLFieldMapping.h>
#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLMapping.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/platform/Array.h>
#include <QXXMLMarshalling/platform/Bundle.h>
#include <QXXMLMarshalling/platform/ChangeTracking.h>
#include <QXXMLMarshalling/platform/Class.h>
#include <QXXMLMarshalling/platform/ClassDescription.h>
#include <QXXMLMarshalling/platform/CountedSet.h>
#include <QXXMLMarshalling/platform/Data.h>
#include <QXXMLMarshalling/platform/Dictionary.h>
#include <QXXMLMarshalling/platform/Error.h>
#include <QXXMLMarshalling/platform/Exception.h>
#include <QXXMLMarshalling/platform/Export.h>
#include <QXXMLMarshalling/platform/Format.h>
#include <QXXMLMarshalling/platform/Invocation.h>
#include <QXXMLMarshalling/platform/Key.h>
#include <QXXMLMarshalling/platform/Log.h>
#include <QXXMLMarshalling/platform/MethodSignature.h>
#include <QXXMLMarshalling/platform/Null.h>
#include <QXXMLMarshalling/platform/Object.h>
#include <QXXMLMarshalling/platform/Observation.h>
#include <QXXMLMarshalling/platform/ProcessInfo.h>
#include <QXXMLMarshalling/platform/Ref.h>
#include <QXXMLMarshalling/platform/String.h>
#include <QXXMLMarshalling/platform/UndoManager.h>
#include <QXXMLMarshalling/platform/UndoableObject.h>
#include <QXXMLMarshalling/platform/UserDefaults.h>
#include <QXXMLMarshalling/platform/Value.h>
#include <QXXMLMarshalling/platform/ValueTraits.h>
#include <QXXMLMarshalling/platform/WeakRef.h>
#include <QXXMLMarshalling/platform/XMLDocument.h>
#include <QXXMLMarshalling/platform/XMLElement.h>
#include <QXXMLMarshalling/platform/XMLNode.h>
