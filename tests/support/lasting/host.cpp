// What host/ keeps for ever is no leak of the first test that needs it.

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/host/UserDefaults.h>

#include <gtest/gtest.h>

#include <system_error>
#include <typeinfo>

namespace {

struct HostObjects : testing::Environment {
    void SetUp() override {
        qx::Bundle::mainBundle();
        qx::Bundle::frameworkBundle();
        const std::error_category& ofRunTime = std::generic_category();
        qx::Bundle::bundleForClass(typeid(ofRunTime));
        qx::UserDefaults::standardUserDefaults()->boolForKey("");
    }
};
const auto* const added = testing::AddGlobalTestEnvironment(new HostObjects);

} // namespace
