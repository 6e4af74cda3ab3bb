#pragma once

// What only some objects have, kept apart so that the others stay small.

#include <QXXMLMarshalling/platform/Object.h>

namespace qx {

struct Object::Extras {
    Ref<WeakAnchor> anchor;
};

} // namespace qx
