// Messages to records, which forward what they do not answer: tests/record/.

#include "support/Texts.h"

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Invocation.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
using support::raised;

struct Singer : Object {
    String sing(const String& what) const { return String::concat({"la ", what}); }
    void setLoud(bool value) { loud = value; }
    bool loud = false;
};

// Hands what it does not answer itself to its friend.
struct Proxy : Object {
    explicit Proxy(Ref<Object> other) : friendly(std::move(other)) {}
    Ref<MethodSignature> methodSignatureForSelector(Selector selector) const override {
        Ref<MethodSignature> own = Object::methodSignatureForSelector(selector);
        return own ? own : friendly->methodSignatureForSelector(selector);
    }
    void forwardInvocation(Invocation& invocation) override {
        seen = invocation.argument(1).string();
        invocation.invokeWithTarget(friendly.get());
    }
    Ref<Object> friendly;
    String seen;
};

const bool described = [] {
    Class::define<Singer>("InvocationTest.Singer")
        .operation<&Singer::sing>("sing:")
        .operation<&Singer::setLoud>("setLoud:");
    return true;
}();

TEST(InvocationTest, AClassMayForwardWhatItDoesNotAnswer) {
    const auto singer = make<Singer>();
    const auto proxy = make<Proxy>(singer);
    EXPECT_EQ(proxy->perform("sing:", "song"), Value("la song"));
    EXPECT_EQ(proxy->seen, "sing:");
    EXPECT_TRUE(proxy->perform("setLoud:", true).isNull());
    EXPECT_TRUE(singer->loud);
    EXPECT_EQ(raised([&] { proxy->perform("sing:"); }),
              "NSInvalidArgumentException: the operation sing: takes 1 arguments, not 0");
}

TEST(InvocationTest, AnUnansweredOperationRaisesWithClassAndNameThoughItWerePromised) {
    struct Promising : Object {
        Ref<MethodSignature> methodSignatureForSelector(Selector) const override {
            return make<MethodSignature>(0, true);
        }
    };
    EXPECT_EQ(raised([] { make<Singer>()->perform("dance:with:", 1, 2); }),
              "NSInvalidArgumentException: class InvocationTest.Singer does not answer the "
              "operation dance:with:");
    EXPECT_NE(raised([] { make<Promising>()->perform("dance"); }).find("operation dance"),
              std::string::npos);
}

TEST(InvocationTest, ArgumentsCanBeReadAndReplacedByIndex) {
    const auto singer = make<Singer>();
    const Value song("song");
    Invocation invocation(singer->methodSignatureForSelector("sing:"), singer.get(),
                          "sing:", {&song, 1});
    EXPECT_EQ(invocation.argument(0).object(), singer.get());
    EXPECT_EQ(invocation.argument(2), song);
    invocation.setArgument("lied", 2);
    invocation.invoke();
    EXPECT_EQ(invocation.returnValue(), Value("la lied"));
    for (const std::size_t index : {0U, 1U, 3U})
        EXPECT_EQ(raised([&] { invocation.setArgument(1, index); }),
                  "NSRangeException: an invocation of sing: has no argument at index " +
                      std::to_string(index));
}

} // namespace
