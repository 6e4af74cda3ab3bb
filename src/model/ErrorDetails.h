#pragma once

// What stands beside an error's texts. Whoever finds the error leaves a context: numbers and
// references, from which the answers are worked out when somebody asks. A context never changes and
// answers any thread.

#include <QXXMLMarshalling/model/Error.h>

#include <string>
#include <string_view>

namespace qx::detail {

// A place in a document, and the text there.
struct SourcePlace {
    DocumentPlace place;
    String path;
    String excerpt;                // the line, cut around the column; null where it is not known
    std::size_t excerptColumn = 0; // that of the place in the excerpt, 1-based
};

// The field or class of a mapping.
struct MappingNote {
    String field;
    String className;
    DocumentPlace place;
    std::vector<DocumentPlace> includes;
};

class ErrorContext {
public:
    ErrorContext() = default;
    ErrorContext(const ErrorContext&) = delete;
    ErrorContext& operator=(const ErrorContext&) = delete;
    virtual ~ErrorContext() = default;
    virtual SourcePlace source() const { return {}; }
    virtual MappingNote mapping() const { return {}; }
    virtual String suggestion() const { return {}; }
};

// What was worked out already.
class KnownContext final : public ErrorContext {
public:
    explicit KnownContext(SourcePlace source, MappingNote mapping = {}, String suggestion = {})
        : _source(std::move(source)), _mapping(std::move(mapping)),
          _suggestion(std::move(suggestion)) {}
    // What another one answers now: it may go, and what it keeps.
    explicit KnownContext(const ErrorContext& other)
        : KnownContext(other.source(), other.mapping(), other.suggestion()) {}
    SourcePlace source() const override { return _source; }
    MappingNote mapping() const override { return _mapping; }
    String suggestion() const override { return _suggestion; }

private:
    const SourcePlace _source;
    const MappingNote _mapping;
    const String _suggestion;
};

class ErrorDetails {
public:
    // While nobody else has the error yet.
    static void setContext(Error& error, std::unique_ptr<const ErrorContext> context);
    // Beside what its context answers so far.
    static void suggest(Error& error, String suggestion);
    static void setOthers(Error& error, std::vector<Ref<const Error>> others);
    // One that answers nothing where the error has none.
    static const ErrorContext& contextOf(const Error& error);
    static bool hasContext(const Error& error) {
        return error._details != nullptr && error._details->_context != nullptr;
    }
    static const std::vector<Ref<const Error>>& othersOf(const Error& error);
    // The error in the slot, if it has a place, is one of that document.
    static void nameDocument(Ref<Error>* error, const String& documentName);

private:
    static ErrorDetails& of(Error& error);

    std::unique_ptr<const ErrorContext> _context;
    std::vector<Ref<const Error>> _others;
};

// The line of the text that holds the offset, cut around it, and the column of the offset in it.
// What stands before `begin` is no part of the document.
void setExcerpt(SourcePlace& source, std::string_view text, std::size_t offset,
                std::size_t begin = 0);

} // namespace qx::detail
