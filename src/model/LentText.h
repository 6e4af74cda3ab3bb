#pragma once

// Texts as values without memory of their own, for setters that take out of them what they need:
// so what is read into a member costs no allocation but the member's.

#include <QXXMLMarshalling/model/Value.h>

#include "base/TextBlocks.h"

namespace qx::detail {

class LentText {
public:
    // Refers to the bytes, as long as they stay. Each copy of the value has bytes of its own; one
    // that is moved refers to them, too.
    static Value of(std::string_view text) {
        if (text.size() <= Value::Cell::mostInside || text.size() > UINT32_MAX)
            return text;
        return Value(Value::Cell::lent(text));
    }
    // Of a value that is to be kept: a lent text gets bytes in a block.
    static void keep(Value& value) {
        if (value.isString() && value._cell.form() == Value::Form::lent)
            value = Value(textInBlock(value.view()));
    }
};

} // namespace qx::detail
