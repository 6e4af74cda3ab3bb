#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>

#include <QXXMLMarshalling/model/Array.h>

#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <thread>

using namespace qx;

// Everything that any thread may ask, by several at once.
TEST(ThreadsTest, DefaultsBundlesTextsAndRepositoriesAreAskedAtOnce) {
    FileSandbox world;
    const std::string bundlePath = world.path("app");
    world.bundle("app", {{"CFBundleIdentifier", "org.example.Threads"}});
    world.write("app/de.lproj/Localizable.strings", "\"a\" = \"A\";\n\"b\";");
    world.write("config/Client.plist", "<dict><key>Key</key><string>v</string></dict>");
    world.write("data/Client/shared.xml", "<a/>");
    world.setVariable("LANG", "de_DE");
    const auto work = [&](int thread) {
        const auto defaults = UserDefaults::standardUserDefaults();
        const char* const arguments[]{"-Argument", "x"};
        for (int i = 0; i < 100; ++i) {
            EXPECT_EQ(defaults->stringForKey("Key"), "v");
            defaults->setObject(make<Array>(), "Set");
            defaults->registerDefault(thread, "Registered");
            defaults->setArguments(arguments);
            if (i % 7 == 0)
                defaults->synchronize();
            const auto bundle = Bundle::bundleWithPath(bundlePath);
            EXPECT_EQ(bundle->localizedString("a"), "A");
            EXPECT_TRUE(Bundle::bundleWithIdentifier("org.example.Threads"));
            if (i % 11 == 0)
                Bundle::setMainBundle(thread % 2 != 0 ? bundle : nullptr);
            Bundle::mainBundle();
            Bundle::bundleForClass(typeid(*bundle));
            const auto manager = QXXMLDataRepositoryManager::defaultManager();
            if (i % 5 == 0)
                QXXMLDataRepositoryManager::flushDefaultManager();
            const auto files = QXXMLFileSystemDataRepository::init();
            Ref<Error> error;
            const auto data = make<Data>(std::to_string(thread));
            EXPECT_FALSE(files->writeFileToUserOverrideArea(data, "shared.xml", &error).isNull());
            EXPECT_FALSE(error) << error->description().view();
            EXPECT_EQ(files->dataForName("shared.xml")->size() > 0, true);
            EXPECT_TRUE(files->writeFileToUserOverrideArea(data, "../x", &error).isNull());
            error->localizedDescription();
            ProcessInfo::setProcessVersion("1", "2");
        }
    };
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 8; ++thread)
        threads.emplace_back(work, thread);
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(world.list("data/Client"), "shared.xml ");
    UserDefaults::standardUserDefaults()->removeObjectForKey("Set");
    UserDefaults::standardUserDefaults()->setArguments({});
    QXXMLDataRepositoryManager::flushDefaultManager();
}
