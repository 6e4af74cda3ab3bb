#pragma once

// One run of the tool: the application that it stands for, the places where documents are looked
// for, and the marshaller that the options ask for. It sets up the process, so there is one.

#include "qxxml/Options.h"
#include "qxxml/Summary.h"
#include "qxxml/ToolRepository.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <functional>

namespace qxxml {

class Session {
public:
    // The options must outlive the session.
    explicit Session(const Options& options);
    // Tells on the standard error what was passed over.
    ~Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    ToolRepository& repository() const noexcept { return *_repository; }
    // The mapping document, whose own folder is searched last for includes, resolved. What the
    // options say of that folder is not looked at.
    qx::Ref<QXXMLMarshallingMapping> resolveMapping(QXXMLMappingOptions options = {}) const;
    // Made from that, or from the one that is given. It is used no longer than the session is
    // there.
    qx::Ref<QXXMLMarshaller> makeMarshaller() const { return makeMarshaller(resolveMapping()); }
    qx::Ref<QXXMLMarshaller> makeMarshaller(qx::Ref<QXXMLMarshallingMapping> mapping) const;
    // The object that the marshaller reads from the document; never null.
    qx::Ref<qx::Object> readObject(QXXMLMarshaller& marshaller) const;

    // The document's bytes; the marshaller parses them as the options say from here on.
    std::string readBytes(QXXMLMarshaller& marshaller) const;

    // Calls visit(object) for each outermost element of that name.
    void readEach(QXXMLMarshaller& marshaller, const std::string& elementName,
                  const std::function<void(const qx::Ref<qx::Object>&)>& visit) const;

    const Options& options() const noexcept { return _options; }
    // The document as messages call it.
    std::string file() const { return isStandardInput() ? "<stdin>" : _options.document; }

private:
    qx::XMLParseOptions parseOptions() const;
    bool isStandardInput() const { return _options.document == "-"; }

    const Options& _options;
    // The summary is that of the marshallers' handlers.
    const std::unique_ptr<Summary> _summary = std::make_unique<Summary>();
    qx::Ref<ToolRepository> _repository;
};

} // namespace qxxml
