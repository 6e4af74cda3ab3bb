// What repository/ keeps until it is flushed is no leak of the first test that needs it.

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>

#include <gtest/gtest.h>

namespace {

struct SharedManager : testing::Environment {
    void SetUp() override { QXXMLDataRepositoryManager::defaultManager(); }
};
const auto* const added = testing::AddGlobalTestEnvironment(new SharedManager);

} // namespace
