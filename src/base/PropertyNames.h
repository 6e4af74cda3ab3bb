#pragma once

#include <QXXMLMarshalling/base/Key.h>

namespace qx::detail {

// From here on the key answers namesProperty(), in every thread. Nothing takes that back: a key
// that no class has any more costs a look-up in vain. The null key is left alone.
void markAsProperty(Key key) noexcept;

} // namespace qx::detail
