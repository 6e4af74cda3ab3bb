#include <QXXMLMarshalling/detail/MemberName.h>

namespace {

using qx::detail::memberName;

struct Point {
    double lat = 0;
    int _id = 0;
    const char* names[2] = {};
    double height() const { return 0; }
    void setHeight(double) {}
};

template <class T>
struct Pair {
    T first;
};

// A program that compiles has passed. With Clang, tests/checks/headers.sh compiles it.
static_assert(memberName<&Point::lat>() == "lat");
static_assert(memberName<&Point::_id>() == "_id");
static_assert(memberName<&Point::names>() == "names");
static_assert(memberName<&Point::height>() == "height");
static_assert(memberName<&Point::setHeight>() == "setHeight");
static_assert(memberName<&Pair<Pair<int>>::first>() == "first");

} // namespace
