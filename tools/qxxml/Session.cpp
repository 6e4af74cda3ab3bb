#include "qxxml/Session.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>

#include "qxxml/Failure.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>

namespace qxxml {

namespace {

void standFor(const std::string& application) {
    if (application.empty())
        return;
    const std::size_t slash = application.find('/');
    qx::ProcessInfo::setProcessName(application.substr(0, slash));
    // What was said is the whole version: no build of a property list comes behind it.
    if (slash != std::string::npos)
        qx::ProcessInfo::setProcessVersion(application.substr(slash + 1), "");
}

QXXMLMarshaller::NamespacePrefixes prefixes(const std::vector<std::string>& options) {
    QXXMLMarshaller::NamespacePrefixes prefixes;
    for (const std::string& option : options) {
        const std::size_t equals = option.find('=');
        prefixes.insert_or_assign(option.substr(equals + 1), option.substr(0, equals));
    }
    return prefixes;
}

} // namespace

Session::Session(const Options& options) : _options(options) {
    standFor(options.application);
    _repository = QXXMLFileSystemDataRepository::init<ToolRepository>();
    _repository->searchFirst(options.searchPaths);
    QXXMLDataRepositoryManager::defaultManager()->setPersistentRepository(_repository);
}

Session::~Session() {
    try {
        std::fputs(_summary->text(_options.json).c_str(), stderr);
    } catch (const std::bad_alloc&) {
        std::fputs("qxxml: warning: something was passed over\n", stderr);
    }
}

qx::Ref<QXXMLMarshallingMapping> Session::resolveMapping(QXXMLMappingOptions options) const {
    qx::Ref<qx::Error> error;
    const auto document = qx::XMLDocument::initWithContentsOfFile(_options.mapping, {}, &error);
    if (!document)
        throw Failure(error, _options.mapping);
    const auto folder = std::filesystem::path(_options.mapping).parent_path();
    options.includeFolder = folder.empty() ? "." : folder.string();
    auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get(), options, &error);
    if (!mapping)
        throw Failure(error, error->documentName().str());
    return mapping;
}

qx::Ref<QXXMLMarshaller> Session::makeMarshaller(qx::Ref<QXXMLMarshallingMapping> mapping) const {
    qx::Ref<qx::Error> error;
    auto marshaller = QXXMLMarshaller::initWithMapping(std::move(mapping));
    marshaller->setParseOptions(parseOptions());
    marshaller->setLenient(!_options.strict);
    marshaller->setSaveUnknownXML(!_options.discardUnknown);
    marshaller->setUsingNamespaceURIs(!_options.noNamespaceURIs);
    marshaller->setMaximumErrors(_options.errors);
    marshaller->setReportHandler([this](const QXXMLReport& report) {
        if (_options.verbose)
            std::fputs(lineOf(report).c_str(), stderr);
        else if (!_options.quiet)
            _summary->add(report);
    });
    if (!marshaller->setNamespacePrefixes(prefixes(_options.prefixes), &error) ||
        !marshaller->setMatchesNamespaces(_options.matchNamespaces, &error))
        throw Failure(error, _options.mapping);
    return marshaller;
}

qx::Ref<qx::Object> Session::readObject(QXXMLMarshaller& marshaller) const {
    const auto parsing = parseOptions();
    qx::Ref<qx::Error> error;
    const auto document =
        isStandardInput()
            ? qx::XMLDocument::initWithStream(std::cin, parsing, &error)
            : qx::XMLDocument::initWithContentsOfFile(_options.document, parsing, &error);
    if (!document)
        throw Failure(error, file());
    if (isStandardInput())
        document->setDocumentName(file());
    // One that asks for a class fails where none handles the root.
    const auto object = marshaller.unmarshall<qx::Object>(document);
    if (!object)
        throw Failure(object.error(), file());
    return *object;
}

void Session::readEach(QXXMLMarshaller& marshaller, const std::string& elementName,
                       const std::function<void(const qx::Ref<qx::Object>&)>& visit) const {
    // A descriptor gives what a pipe has; a stream may wait for more.
    const std::string path = isStandardInput() ? "/dev/stdin" : _options.document;
    marshaller.setParseOptions(parseOptions());
    qx::Ref<qx::Error> error;
    if (!marshaller.unmarshallEach(path, elementName, visit, &error))
        throw Failure(error, file());
}

std::string Session::readBytes(QXXMLMarshaller& marshaller) const {
    marshaller.setParseOptions(parseOptions());
    std::ostringstream bytes;
    std::ifstream document;
    if (!isStandardInput())
        document.open(_options.document, std::ios::binary);
    std::istream& source = isStandardInput() ? std::cin : document;
    if (source.peek() != std::istream::traits_type::eof())
        bytes << source.rdbuf();
    if (!isStandardInput() && bytes.str().empty()) {
        qx::Ref<qx::Error> error; // why it cannot be read
        qx::XMLDocument::initWithContentsOfFile(_options.document, {}, &error);
        throw Failure(error, file());
    }
    return bytes.str();
}

qx::XMLParseOptions Session::parseOptions() const {
    qx::XMLParseOptions parsing;
    parsing.keepWhiteSpace = _options.keepWhiteSpace;
    parsing.refuseDoctype = _options.noDoctype;
    return parsing;
}

} // namespace qxxml
