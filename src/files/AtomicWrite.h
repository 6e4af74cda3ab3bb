#pragma once

// Saving so that no moment shows half a file. Errors as in files/Files.h; any thread may call.

#include <QXXMLMarshalling/files/FileWriting.h>

#include <memory>

namespace qx {

// What writeFileAtomically() does, of bytes that come one after another. Until commit() the old
// file is untouched; what was not committed goes with the object.
class AtomicFile {
public:
    explicit AtomicFile(String path);
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;
    ~AtomicFile();

    // Before anything else.
    bool open(Ref<Error>* error);
    bool write(std::string_view bytes, Ref<Error>* error);
    bool commit(Ref<Error>* error);

private:
    struct State;

    const String _path;
    std::unique_ptr<State> _state;
};

// False with an error for a path that is too long to be written, or has a component that is: to be
// known before directories are made for it.
bool checkLengthOfPath(const String& path, Ref<Error>* error = nullptr);

} // namespace qx
