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
        if (text.size() <= Value::mostInside || text.size() > UINT32_MAX)
            return text;
        Value value;
        value._cell.word.kind = Value::Kind::string;
        value._cell.word.form = Value::Form::lent;
        value._cell.word.size = static_cast<std::uint32_t>(text.size());
        value._cell.word.lent = text.data();
        return value;
    }
    // The value to keep: a lent text gets bytes in a block.
    static Value kept(Value&& value) {
        const bool isLent = value.isString() && value._cell.word.form == Value::Form::lent;
        return isLent ? Value(textInBlock(value.view())) : std::move(value);
    }
};

} // namespace qx::detail
