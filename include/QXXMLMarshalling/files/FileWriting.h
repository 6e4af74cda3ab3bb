#pragma once

// Saving bytes so that no moment shows half a file. Any thread may call.

#include <QXXMLMarshalling/model/Error.h>

#include <string_view>

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
QX_API bool writeFileAtomically(const String& path, std::string_view bytes,
                                Ref<Error>* error = nullptr);

} // namespace qx
