#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>

#include <limits>

using qx::Data;
using qx::Dictionary;
using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;

QXXMLVolatileDataRepository::QXXMLVolatileDataRepository()
    : _documents(qx::make<Dictionary>()), _datas(qx::make<Dictionary>()) {}

QXXMLVolatileDataRepository::~QXXMLVolatileDataRepository() = default;

Ref<QXXMLVolatileDataRepository> QXXMLVolatileDataRepository::init() {
    return qx::make<QXXMLVolatileDataRepository>();
}

bool QXXMLVolatileDataRepository::containsDocument(const String& name) {
    return _documents->contains(name);
}

bool QXXMLVolatileDataRepository::containsData(const String& name) {
    return _datas->contains(name);
}

Ref<XMLDocument> QXXMLVolatileDataRepository::documentNamed(const String& name, std::uint64_t* size,
                                                            Ref<Error>*) {
    if (size != nullptr)
        *size = std::numeric_limits<std::int64_t>::max();
    return _documents->get(name).as<XMLDocument>();
}

Ref<Data> QXXMLVolatileDataRepository::dataForName(const String& name, Ref<Error>*) {
    return _datas->get(name).as<Data>();
}

bool QXXMLVolatileDataRepository::setDocument(const Ref<XMLDocument>& document, const String& name,
                                              Ref<Error>*) {
    _documents->set(name, document);
    return true;
}

bool QXXMLVolatileDataRepository::setData(const Ref<Data>& data, const String& name, Ref<Error>*) {
    _datas->set(name, data);
    return true;
}

String QXXMLVolatileDataRepository::description() const {
    if (_documents->isEmpty())
        return Object::description();
    return String::concat({Object::description(), " documents: ", _documents->description()});
}
