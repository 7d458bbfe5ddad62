// [fixture]
#include <EmbeddedBroker.h>

#include <gtest/gtest.h>
#include <sys/statvfs.h>

#include <string>
#include <thread>
#include <vector>

// A CIM server of the test's own, with the class declared and the provider loaded.
class FileSystemProvider : public testing::Test {
public:
    FileSystemProvider() {
        broker.compileMof(DEMO_MOF);
        broker.load(DEMO_LIBRARY, DEMO_PROVIDER);
    }

    oxahv::EmbeddedBroker broker;
};
// [fixture]

// [instance]
TEST_F(FileSystemProvider, TellsTheSizeOfTheRootFileSystem) {
    struct statvfs state;
    ASSERT_EQ(statvfs("/", &state), 0);

    oxahv::Request request(broker);
    const oxahv::Reply reply = request.getInstance(
        request.objectPathFromText("Demo_FileSystem.Root=\"/\"", "root/cimv2"));

    ASSERT_EQ(reply.code, CMPI_RC_OK) << reply.message;
    ASSERT_EQ(reply.instances.size(), 1U);
    const CMPIData size = CMGetProperty(reply.instances[0], "FileSystemSize", nullptr);
    EXPECT_EQ(size.type, CMPI_uint64);
    EXPECT_EQ(size.value.uint64, static_cast<CMPIUint64>(state.f_frsize) * state.f_blocks);
}

TEST_F(FileSystemProvider, DoesNotFindAFolderThatNothingIsMountedOn) {
    oxahv::Request request(broker);
    const auto* path =
        request.objectPathFromText("Demo_FileSystem.Root=\"/no/such/folder\"", "root/cimv2");
    EXPECT_EQ(request.getInstance(path).code, CMPI_RC_ERR_NOT_FOUND);
}
// [instance]

// [agreement]
TEST_F(FileSystemProvider, ServesEveryNameThatItGivesOut) {
    oxahv::Request request(broker);
    const auto* classPath = request.objectPath("root/cimv2", "Demo_FileSystem");
    const oxahv::Reply names = request.enumerateInstanceNames(classPath);
    ASSERT_FALSE(names.objectPaths.empty());
    for (const CMPIObjectPath* name : names.objectPaths) {
        EXPECT_EQ(request.getInstance(name).instances.size(), 1U) << oxahv::pathText(name);
    }
}
// [agreement]

// [properties]
TEST_F(FileSystemProvider, ReturnsTheKeyAndTheListedPropertiesAlone) {
    const std::vector<std::string> wanted = {"ReadOnly"};
    oxahv::Request request(broker);
    const auto* path = request.objectPathFromText("Demo_FileSystem.Root=\"/\"", "root/cimv2");
    const oxahv::Reply reply = request.getInstance(path, &wanted);
    ASSERT_EQ(reply.instances.size(), 1U);
    EXPECT_FALSE(CMIsNullValue(CMGetProperty(reply.instances[0], "Root", nullptr)));
    EXPECT_FALSE(CMIsNullValue(CMGetProperty(reply.instances[0], "ReadOnly", nullptr)));
    EXPECT_TRUE(CMIsNullValue(CMGetProperty(reply.instances[0], "FileSystemSize", nullptr)));
}
// [properties]

// [keys]
TEST_F(FileSystemProvider, AnswersTheSameWhateverAServerDoesWithKeysAndPaths) {
    using oxahv::KeyMode;
    using oxahv::NewInstances;
    const oxahv::PathDelivery otherPaths = {true, true, "host.example"};
    for (const KeyMode keys : {KeyMode::exact, KeyMode::untyped, KeyMode::chars,
                               KeyMode::signedIntegers, KeyMode::text}) {
        for (const NewInstances instances : {NewInstances::full, NewInstances::bare}) {
            for (const oxahv::PathDelivery& paths : {oxahv::PathDelivery{}, otherPaths}) {
                SCOPED_TRACE(testing::Message()
                             << "keys " << static_cast<int>(keys) << " instances "
                             << static_cast<int>(instances) << " host " << paths.hostName);
                broker.setKeyMode(keys);
                broker.setNewInstances(instances);
                broker.setPathDelivery(paths);
                oxahv::Request request(broker);
                const oxahv::Reply reply = request.getInstance(
                    request.objectPathFromText("Demo_FileSystem.Root=\"/\"", "root/cimv2"));
                ASSERT_EQ(reply.instances.size(), 1U) << reply.message;
                const CMPIData root = CMGetProperty(reply.instances[0], "Root", nullptr);
                EXPECT_EQ(oxahv::valueText(root), "\"/\"");
            }
        }
    }
}
// [keys]

// [faults]
TEST_F(FileSystemProvider, AnswersWithACodeWhenTheBrokerFails) {
    for (const char* slot : {"CMPIBrokerEncFT.newObjectPath", "CMPIBrokerEncFT.newInstance",
                             "CMPIResultFT.returnInstance", "CMPIResultFT.returnDone"}) {
        oxahv::Request request(broker);
        const auto* path =
            request.objectPathFromText("Demo_FileSystem.Root=\"/\"", "root/cimv2");
        broker.injectFault(slot, {});
        EXPECT_EQ(request.getInstance(path).code, CMPI_RC_ERR_FAILED) << slot;
        broker.clearFaults();
    }
}

TEST_F(FileSystemProvider, LeavesNoObjectBehind) {
    const std::size_t before = broker.liveObjects().total();
    {
        oxahv::Request request(broker);
        request.enumerateInstances(request.objectPath("root/cimv2", "Demo_FileSystem"));
    }
    EXPECT_EQ(broker.liveObjects().total(), before);
}
// [faults]

// [threads]
TEST_F(FileSystemProvider, ServesSeveralThreadsAtOnce) {
    std::vector<std::thread> threads(4);
    for (std::thread& thread : threads) {
        thread = std::thread([this] {
            for (int round = 0; round < 50; ++round) {
                oxahv::Request request(broker);
                const auto* path =
                    request.objectPathFromText("Demo_FileSystem.Root=\"/\"", "root/cimv2");
                EXPECT_EQ(request.getInstance(path).code, CMPI_RC_OK);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}
// [threads]
