#pragma once

// The placeholder that stands for null where a collection needs an object. There is one, for ever.

#include <QXXMLMarshalling/model/Object.h>

namespace qx {

class QX_API Null final : public Object {
public:
    static Null* marker();
    // "<null>".
    String description() const override;

protected:
    const Class& describedClass() const override;

private:
    Null() = default;
};

} // namespace qx
