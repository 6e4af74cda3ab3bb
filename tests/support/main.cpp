// Runs the tests, and after each one checks that it has left no live object behind.

#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/model/Object.h>

#include <gtest/gtest.h>

namespace {

class LeakCheck : public testing::EmptyTestEventListener {
    void OnTestStart(const testing::TestInfo&) override { _before = qx::Object::liveCount(); }
    void OnTestEnd(const testing::TestInfo& test) override {
        const std::int64_t left = qx::Object::liveCount() - _before;
        if (left > 0 && !test.result()->Failed())
            ADD_FAILURE() << left << " objects are still alive after the test";
    }

    std::int64_t _before = 0;
};

} // namespace

int main(int argc, char** argv) {
    testing::InitGoogleTest(&argc, argv);
    qx::Null::marker();
    testing::UnitTest::GetInstance()->listeners().Append(new LeakCheck);
    return RUN_ALL_TESTS();
}
