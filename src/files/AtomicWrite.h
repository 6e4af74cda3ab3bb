#pragma once

// Saving so that no moment shows half a file. Errors as in files/Files.h; any thread may call.

#include <QXXMLMarshalling/model/Error.h>

#include <memory>

namespace qx {

// Writes a temporary file beside the target, flushes it to disk and renames it over the target: at
// every moment, a power failure included, the path names the old bytes or the new ones, whole.
// False with an error; the old file is then untouched and the temporary one gone.
//
// Of a file that is replaced:
// - the permissions, group, owner and access list are kept as far as the system lets this process.
//   Where the group cannot be, its rights go to no other, and where the permissions cannot be told,
//   the new file is the owner's alone. The folder has to be writable, the file has not;
// - other hard links keep the old bytes;
// - symbolic links that the path ends in stay: what they lead to is replaced, or made. One that
//   another user put into a folder like /tmp is not followed (513);
// - pipes, sockets and devices are refused (512), directories too.
// A temporary file is called ".~qx-save-N.tmp". What a writer left that was killed is removed by
// the next that saves into the same folder.
bool writeFileAtomically(const String& path, std::string_view bytes, Ref<Error>* error = nullptr);

// The same, of bytes that come one after another. Until commit() the old file is untouched; what
// was not committed goes with the object.
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
