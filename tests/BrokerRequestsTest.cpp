// Requests through the broker: providers, faults, records, modes, threads.
#include "TestLocales.h"

#include "EmbeddedBroker.h"

#include <atomic>
#include <functional>
#include <future>
#include <gtest/gtest.h>
#include <stdexcept>

using oxahv::BrokerError;
using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::Fault;
using oxahv::KeyMode;
using oxahv::Reply;
using oxahv::Request;

namespace {

// A provider as a class, whose functions a test sets. Everything reaches the one that the test has set last.
struct Behaviour {
    const CMPIBroker* broker = nullptr;
    std::function<CMPIStatus(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)> serve;
    std::vector<std::string> filters;
    std::atomic<int> alive{0};
};
Behaviour behaviour;

std::string orNull(const char* text) {
    return text != nullptr ? text : "null";
}

class TestedProvider {
public:
    TestedProvider(const CMPIBroker* broker, const CMPIContext* /*context*/) {
        behaviour.broker = broker;
        ++behaviour.alive;
    }
    TestedProvider(const TestedProvider&) = delete;
    TestedProvider& operator=(const TestedProvider&) = delete;
    ~TestedProvider() { --behaviour.alive; }

    using Context = const CMPIContext*;
    using Result = const CMPIResult*;
    using Path = const CMPIObjectPath*;

    CMPIStatus enumerateInstanceNames(Context c, Result r, Path p) { return behaviour.serve(c, r, p); }
    CMPIStatus enumerateInstances(Context c, Result r, Path p, const char**) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus getInstance(Context c, Result r, Path p, const char**) { return behaviour.serve(c, r, p); }
    CMPIStatus createInstance(Context c, Result r, Path p, const CMPIInstance*) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus modifyInstance(Context c, Result r, Path p, const CMPIInstance*, const char**) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus deleteInstance(Context c, Result r, Path p) { return behaviour.serve(c, r, p); }
    CMPIStatus execQuery(Context c, Result r, Path p, const char*, const char*) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus associators(Context c, Result r, Path p, const char* associationClass, const char* resultClass,
                           const char* role, const char* resultRole, const char**) {
        behaviour.filters = {orNull(associationClass), orNull(resultClass), orNull(role), orNull(resultRole)};
        return behaviour.serve(c, r, p);
    }
    CMPIStatus associatorNames(Context c, Result r, Path p, const char*, const char*, const char*,
                               const char*) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus references(Context c, Result r, Path p, const char*, const char*, const char**) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus referenceNames(Context c, Result r, Path p, const char*, const char*) {
        return behaviour.serve(c, r, p);
    }
    CMPIStatus invokeMethod(Context, Result result, Path, const char* method, const CMPIArgs* in,
                            CMPIArgs* out) {
        const CMPIData data = CMGetArg(in, "In", nullptr);
        CMAddArg(out, method, &data.value, data.type);
        return CMReturnData(result, &data.value, data.type);
    }
};

CMProviderBase(Tested)
CMInstanceMIFactory(TestedProvider, Tested)
CMAssociationMIFactory(TestedProvider, Tested)
CMMethodMIFactory(TestedProvider, Tested)

CMPIStatus ok() {
    return {CMPI_RC_OK, nullptr};
}

// Returns the path of the request.
CMPIStatus echo(const CMPIContext* /*context*/, const CMPIResult* result, const CMPIObjectPath* path) {
    CMReturnObjectPath(result, path);
    return CMReturnDone(result);
}

std::string errorOf(const std::function<void()>& operation) {
    try {
        operation();
    } catch (const BrokerError& error) {
        return error.what();
    }
    return "no error";
}

class ARequest : public testing::Test {
protected:
    ARequest() {
        behaviour.serve = echo;
        behaviour.filters.clear();
        broker_.host("Tested",
                     {Tested_Create_InstanceMI, Tested_Create_AssociationMI, Tested_Create_MethodMI});
    }

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root"); }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(ARequest, ReachesTheProviderAndBringsItsResultsBack) {
    CMPIObjectPath* const demo = path("Demo.Key=\"text\"");
    EXPECT_EQ(oxahv::pathText(request_.enumerateInstanceNames(demo).objectPaths.at(0)),
              "root:Demo.Key=\"text\"");
    behaviour.serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        CMPIStatus status = ok();
        EXPECT_STREQ(
            CMGetCharsPtr(CMGetContextEntry(context, CMPIInitNameSpace, &status).value.string, nullptr),
            "root");
        CMPIInstance* const instance = CMNewInstance(behaviour.broker, p, &status);
        CMReturnInstance(result, instance);
        CMSetProperty(instance, "Late", "x", CMPI_chars); // what was returned is a copy
        return status;
    };
    const Reply reply = request_.getInstance(demo);
    ASSERT_EQ(reply.instances.size(), 1U);
    EXPECT_EQ(CMGetPropertyCount(reply.instances[0], nullptr), 1U);
    EXPECT_FALSE(reply.done);

    CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
    CMAddArg(in, "In", "value", CMPI_chars);
    const Reply method = request_.invokeMethod(demo, "Out", in);
    EXPECT_EQ(oxahv::valueText(method.data.at(0)), "\"value\"");
    EXPECT_EQ(oxahv::valueText(CMGetArg(method.out, "Out", nullptr)), "\"value\"");

    request_.associators(demo, {"A", "", "R", ""});
    EXPECT_EQ(behaviour.filters, std::vector<std::string>({"A", "null", "R", "null"}));
}

TEST_F(ARequest, AsksTheProviderForDeclaredMethodsAlone) {
    broker_.declare(ClassDeclaration("Base").method("Out", CMPI_string, {{"In", CMPI_string}}));
    broker_.declare(ClassDeclaration("Demo").superclass("Base"));
    CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
    CMAddArg(in, "In", "value", CMPI_chars);
    EXPECT_EQ(request_.invokeMethod(path("Demo"), "OUT", in).data.size(), 1U);
    const Reply reply = request_.invokeMethod(path("Demo"), "Other", in);
    EXPECT_EQ(reply.code, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(reply.message, "class Demo has no method Other");
    EXPECT_TRUE(reply.data.empty());
    EXPECT_EQ(CMGetArgCount(reply.out, nullptr), 0U);
}

TEST_F(ARequest, ReportsWhatTheProviderReports) {
    behaviour.serve = [](const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
        return CMPIStatus{CMPI_RC_ERR_ACCESS_DENIED, CMNewString(behaviour.broker, "not for you", nullptr)};
    };
    Reply reply = request_.getInstance(path("Demo"));
    EXPECT_EQ(reply.code, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(reply.message, "not for you");
    behaviour.serve = [](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*) {
        const CMPIError* const error =
            behaviour.broker->eft->newCMPIError(behaviour.broker, "o", "i", "told", ErrorSevLow,
                                                ErrorProbCauseOther, CMPI_RC_ERR_NOT_FOUND, nullptr);
        result->ft->returnError(result, error);
        return ok();
    };
    reply = request_.getInstance(path("Demo"));
    EXPECT_EQ(reply.code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(reply.message, "told");
    behaviour.serve = [](const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) -> CMPIStatus {
        throw std::runtime_error("lost");
    };
    EXPECT_EQ(request_.getInstance(path("Demo")).code, CMPI_RC_ERR_FAILED);
}

TEST_F(ARequest, FindsItsProviderByClass) {
    EmbeddedBroker broker;
    broker.declare(ClassDeclaration("Base"));
    broker.declare(ClassDeclaration("Derived").superclass("Base"));
    broker.declare(ClassDeclaration("Other"));
    broker.host("Tested", {nullptr, nullptr, Tested_Create_MethodMI}, {"Base"});
    broker.load(TEST_PROVIDER, "TestProvider", {"Base"});
    Request request(broker);
    EXPECT_EQ(request.enumerateInstanceNames(request.objectPath("root", "derived")).code, CMPI_RC_OK);
    EXPECT_EQ(request.enumerateInstanceNames(request.objectPath("root", "Other")).code,
              CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request.enumerateInstanceNames(request.objectPath("root", "None")).code,
              CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(request.enumerateInstanceNames(nullptr).code, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ARequest, CanSendRequestsOfItsOwn) {
    behaviour.serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        behaviour.serve = echo;
        CMPIEnumeration* const names =
            behaviour.broker->bft->enumerateInstanceNames(behaviour.broker, context, p, nullptr);
        EXPECT_EQ(CMGetArrayCount(CMToArray(names, nullptr), nullptr), 1U);
        while (CMHasNext(names, nullptr) != 0) {
            CMReturnObjectPath(result, CMGetNext(names, nullptr).value.ref);
        }
        CMPIStatus status = ok();
        EXPECT_EQ(behaviour.broker->bft->getInstance(behaviour.broker, context, p, nullptr, &status),
                  nullptr);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND) << "the provider returned none";
        return ok();
    };
    EXPECT_EQ(request_.enumerateInstanceNames(path("Demo")).objectPaths.size(), 1U);
}

TEST_F(ARequest, TellsHowFarItHasCome) {
    std::vector<std::size_t> told;
    request_.setProgressHandler([&](std::size_t results) { told.push_back(results); });
    behaviour.serve = [&](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path) {
        if (told.empty()) { // an upcall, whose results are not the client's
            CMReturnObjectPath(result, path);
            broker_.handle()->bft->enumerateInstanceNames(broker_.handle(), context, path, nullptr);
        }
        return echo(context, result, path);
    };
    request_.enumerateInstanceNames(request_.objectPath("root/x", "Demo"));
    EXPECT_EQ(told, std::vector<std::size_t>({1, 2}));
    request_.enumerateInstanceNames(request_.objectPath("root/x", "Demo"));
    EXPECT_EQ(told, std::vector<std::size_t>({1, 2, 1})) << "each operation counts for itself";
    request_.setProgressHandler(nullptr);
    request_.enumerateInstanceNames(request_.objectPath("root/x", "Demo"));
    EXPECT_EQ(told.size(), 3U);
}

TEST_F(ARequest, CarriesTheEntriesThatProvidersAreGiven) {
    broker_.setContextEntry("StateFile", "earlier");
    broker_.setContextEntry("StateFile", "/a/file");
    Request later(broker_);
    const CMPIData entry = CMGetContextEntry(later.context(), "StateFile", nullptr);
    EXPECT_EQ(oxahv::valueText(entry), "\"/a/file\"");
    EXPECT_TRUE(CMIsNullValue(CMGetContextEntry(request_.context(), "StateFile", nullptr)));

    static std::string given;
    oxahv::ProviderFactories factories;
    factories.method = [](const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* status) {
        given = oxahv::valueText(CMGetContextEntry(context, "StateFile", nullptr));
        return Tested_Create_MethodMI(broker, context, status);
    };
    broker_.host("Another", factories);
    EXPECT_EQ(given, "\"/a/file\"");
}

TEST_F(ARequest, ReadsValuesAndSaysWhatIsWrongWithThem) {
    const auto read = [&](const std::string& text, CMPIType type) {
        try {
            const CMPIData data = request_.valueFromText(text, type);
            return oxahv::typeName(data.type) + ' ' + oxahv::valueText(data);
        } catch (const BrokerError& error) {
            return std::string(error.what());
        }
    };
    EXPECT_EQ(read("12", CMPI_null), "uint64 12");
    EXPECT_EQ(read("-12", CMPI_null), "sint64 -12");
    EXPECT_EQ(read("True", CMPI_null), "boolean TRUE");
    EXPECT_EQ(read("-", CMPI_null), "string \"-\"");
    EXPECT_EQ(read("", CMPI_null), "string \"\"");
    EXPECT_EQ(read("65", CMPI_char16).substr(0, 6), "char16");
    EXPECT_EQ(read("-0.5", CMPI_real64), "real64 -0.5");
    EXPECT_EQ(read("", CMPI_real32), "value, column 1: expected a real32");
    EXPECT_EQ(read("nan", CMPI_real64), "value, column 1: expected a real64");
    EXPECT_EQ(read("1 2", CMPI_uint8), "value, column 2: expected nothing behind the value");
    EXPECT_EQ(read("\"x", CMPI_string), "value, column 1: the quote is not closed");
    EXPECT_EQ(read("A.", CMPI_ref), "object path, column 3: expected a key name");
}

TEST_F(ARequest, DeliversKeysAsTheModeSays) {
    broker_.declare(ClassDeclaration("Demo")
                        .key("U", CMPI_uint8)
                        .key("S", CMPI_sint16)
                        .key("T", CMPI_string)
                        .key("R", CMPI_ref)
                        .key("B", CMPI_boolean));
    const char* const text = "root:Demo.U=200,S=-5,T=\"t\",R=\"Demo.U=1\",B=TRUE";
    struct {
        KeyMode mode;
        std::vector<CMPIType> types;
    } const rows[] = {
        {KeyMode::exact, {CMPI_uint8, CMPI_sint16, CMPI_string, CMPI_ref, CMPI_boolean}},
        {KeyMode::untyped, {CMPI_uint64, CMPI_sint64, CMPI_string, CMPI_ref, CMPI_boolean}},
        {KeyMode::chars, {CMPI_uint8, CMPI_sint16, CMPI_chars, CMPI_ref, CMPI_boolean}},
    };
    for (const auto& row : rows) {
        broker_.setKeyMode(row.mode);
        std::vector<CMPIType> types;
        behaviour.serve = [&](const CMPIContext*, const CMPIResult*, const CMPIObjectPath* p) {
            EXPECT_EQ(oxahv::pathText(p), text);
            const CMPIInstance* const instance = CMNewInstance(behaviour.broker, p, nullptr);
            EXPECT_EQ(CMGetProperty(instance, "U", nullptr).type, CMPI_uint8) << "as it is declared";
            EXPECT_EQ(oxahv::valueText(CMGetProperty(instance, "S", nullptr)), "-5");
            EXPECT_EQ(CMGetProperty(instance, "S", nullptr).type, CMPI_sint16);
            EXPECT_EQ(CMGetProperty(instance, "T", nullptr).type, CMPI_string);
            for (CMPICount i = 0; i < CMGetKeyCount(p, nullptr); ++i) {
                types.push_back(CMGetKeyAt(p, i, nullptr, nullptr).type);
            }
            return ok();
        };
        EXPECT_TRUE(request_.getInstance(path(text)).ok());
        EXPECT_EQ(types, row.types);
    }
}

TEST_F(ARequest, ReadsPathsAndSaysWhatIsWrongWithThem) {
    for (const char* const good :
         {"root:Demo", "root:Demo.K=\"a\\\"b\\\\c\"", "root/x:Demo.A=1,B=-2,C=TRUE",
          "root:Demo.A=\"x:y.z=,\"", "root:Demo.M=18446744073709551615,N=-9223372036854775808"}) {
        EXPECT_EQ(oxahv::pathText(path(good)), good);
    }
    struct {
        const char* text;
        const char* error;
    } const rows[] = {
        {"", "object path, column 1: expected a class name"},
        {"Demo.", "object path, column 6: expected a key name"},
        {"Demo.K", "object path, column 7: expected '='"},
        {"Demo.K=", "object path, column 8: expected a value"},
        {"Demo.K=\"a", "object path, column 8: the quote is not closed"},
        {"Demo.K=\"\\x\"", "object path, column 10: expected \", \\, n, r or t after a backslash"},
        {"Demo.K=1,", "object path, column 10: expected a key name"},
        {"Demo.K=1,k=2", "object path, column 10: key k stands twice"},
        {"Demo.K=1x", "object path, column 8: expected a number"},
        {"Demo.K=18446744073709551616",
         "object path, column 8: 18446744073709551616 does not fit into uint64"},
        {"Demo.K=maybe",
         "object path, column 8: expected a value: a number, a text in quotes, TRUE or FALSE"},
        {"Demo K", "object path, column 5: expected '.'"},
        {"Known.U=256", "object path, column 9: 256 does not fit into uint8"},
        {"Known.U=\"1\"", "object path, column 9: expected a uint8"},
        {"Known.X=1", "object path, column 7: class Known has no key X"},
    };
    broker_.declare(ClassDeclaration("Known").key("U", CMPI_uint8).property("X", CMPI_uint8));
    for (const auto& row : rows) {
        EXPECT_EQ(errorOf([&] { path(row.text); }), row.error) << row.text;
    }
}

TEST_F(ARequest, MeetsTheFaultsThatAreInjected) {
    CMPIObjectPath* const demo = path("Demo.A=1,B=2");
    CMPIStatus status = ok();
    broker_.injectFault("getKeyAt", {CMPI_RC_ERR_ACCESS_DENIED, false, 0, 2, 2});
    for (const CMPIrc expected :
         {CMPI_RC_OK, CMPI_RC_ERR_ACCESS_DENIED, CMPI_RC_ERR_ACCESS_DENIED, CMPI_RC_OK}) {
        CMGetKeyAt(demo, 0, nullptr, &status);
        EXPECT_EQ(status.rc, expected);
    }
    broker_.clearFaults();
    broker_.injectFault("newString", {CMPI_RC_OK, true});
    EXPECT_EQ(CMNewString(broker_.handle(), "x", &status), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_NE(CMNewString(broker_.handle(), "x", &status), nullptr);
    broker_.injectFault("getKey", {CMPI_RC_OK, true, CMPI_badValue});
    CMPIData key = CMGetKey(demo, "A", &status);
    EXPECT_EQ(key.state, CMPI_keyValue | CMPI_badValue);
    EXPECT_TRUE(key.type == CMPI_uint64 && key.value.uint64 == 0 && status.rc == CMPI_RC_OK);
    broker_.injectFault("getKey", {CMPI_RC_ERR_FAILED, false, CMPI_badValue});
    key = CMGetKey(demo, "A", &status);
    EXPECT_EQ(key.state, CMPI_nullValue | CMPI_badValue);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
    broker_.injectFault("CMPIObjectPathFT.addKey", {});
    EXPECT_EQ(CMAddKey(demo, "C", "x", CMPI_chars).rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(CMGetKeyCount(demo, nullptr), 2U) << "a call that fails does nothing";
    broker_.injectFault("*", {CMPI_RC_ERR_FAILED, false, 0, 2});
    EXPECT_EQ(CMGetKeyCount(demo, &status), 2U);
    EXPECT_EQ(CMGetClassName(demo, &status), nullptr);

    EXPECT_EQ(errorOf([&] { broker_.injectFault("nothing", {}); }), "there is no slot nothing");
    EXPECT_EQ(errorOf([&] { broker_.injectFault("getArg", {}); }), "no error");
    EXPECT_EQ(errorOf([&] { broker_.injectFault("deleteInstance", {}); }), "no error");
    EXPECT_EQ(errorOf([&] { broker_.injectFault("setProperty", {}); }),
              "slot setProperty is one of several: CMPIBrokerFT.setProperty, CMPIInstanceFT.setProperty");
}

TEST_F(ARequest, IsRecordedCallByCall) {
    CMPIObjectPath* const demo = path("Demo");
    CMPIValue value = {};
    value.uint16 = 7;
    CMPIStatus status = {CMPI_RC_ERR_FAILED, nullptr};
    broker_.startRecording();
    CMAddKey(demo, "K", &value, CMPI_uint16);
    CMGetKey(demo, "none", &status);
    const std::vector<oxahv::Call> calls = broker_.stopRecording();
    CMGetKey(demo, "K", nullptr);
    ASSERT_EQ(calls.size(), 2U);
    EXPECT_EQ(calls[0].slot, "CMPIObjectPathFT.addKey");
    EXPECT_EQ(calls[0].object, demo);
    EXPECT_EQ(calls[0].name, "K");
    EXPECT_EQ(calls[0].type, CMPI_uint16);
    EXPECT_EQ(calls[0].value.uint16, 7);
    EXPECT_EQ(calls[1].entryStatus.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(calls[1].code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_TRUE(broker_.stopRecording().empty());
}

TEST_F(ARequest, RunsBesideOthersOnManyThreads) {
    behaviour.serve = [](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* p) {
        for (int i = 0; i < 10; ++i) {
            CMReturnInstance(result, CMNewInstance(behaviour.broker, p, nullptr));
        }
        return ok();
    };
    const oxahv::LiveObjects before = broker_.liveObjects();
    std::vector<std::thread> threads;
    for (int t = 0; t < 8; ++t) {
        threads.emplace_back([this, t] {
            for (int i = 0; i < 100; ++i) {
                Request request(broker_);
                const std::string key = "root:Demo.K=" + std::to_string(t);
                const Reply reply = request.enumerateInstances(request.objectPathFromText(key, ""));
                ASSERT_EQ(reply.instances.size(), 10U);
                ASSERT_EQ(oxahv::pathText(CMGetObjectPath(reply.instances[9], nullptr)), key);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(broker_.liveObjects().total(), before.total());
}

TEST_F(ARequest, CanBeLeftToAThreadThatIsAttached) {
    CMPIContext* const prepared =
        broker_.handle()->bft->prepareAttachThread(broker_.handle(), request_.context());
    std::thread([&] {
        const CMPIBroker* const broker = broker_.handle();
        EXPECT_EQ(broker->bft->attachThread(broker, prepared).rc, CMPI_RC_OK);
        const oxahv::LiveObjects before = broker_.liveObjects();
        CMNewString(broker, "text", nullptr);
        EXPECT_EQ(broker_.liveObjects().strings, before.strings + 1);
        EXPECT_EQ(broker->bft->detachThread(broker, prepared).rc, CMPI_RC_OK);
        EXPECT_EQ(broker_.liveObjects().strings, before.strings);
        EXPECT_EQ(broker->bft->detachThread(broker, prepared).rc, CMPI_RC_ERR_FAILED);
    }).join();
}

TEST_F(ARequest, KeepsItsProviderWhileItIsInside) {
    std::promise<void> entered;
    std::promise<void> mayLeave;
    behaviour.serve = [&](const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
        entered.set_value();
        mayLeave.get_future().wait();
        EXPECT_EQ(behaviour.alive, 1);
        return ok();
    };
    std::thread inside([this] {
        Request request(broker_);
        EXPECT_TRUE(request.getInstance(request.objectPath("root", "Demo")).ok());
    });
    entered.get_future().wait();
    std::thread unloading([this] {
        broker_.unload("Tested");
        EXPECT_EQ(behaviour.alive, 0) << "unload returned too early";
    });
    while (request_.invokeMethod(path("Demo"), "Out", nullptr).code != CMPI_RC_ERR_NOT_SUPPORTED) {
        std::this_thread::yield(); // until it takes no further request
    }
    mayLeave.set_value();
    inside.join();
    unloading.join();
}

TEST_F(ARequest, RunsWhileTheBrokerIsSetUp) {
    behaviour.serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        CMAddContextEntry(context, "Entry", "text", CMPI_chars);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIInstance* const instance = CMNewInstance(behaviour.broker, p, &status);
        return status.rc == CMPI_RC_OK ? CMReturnInstance(result, instance) : status;
    };
    broker_.declare(ClassDeclaration("Demo").key("K", CMPI_uint8));
    std::atomic<bool> isOver{false};
    std::vector<std::thread> threads;
    for (int t = 0; t < 3; ++t) {
        threads.emplace_back([&] {
            while (!isOver) {
                Request request(broker_);
                const Reply reply = request.getInstance(request.objectPathFromText("Demo.K=1", "root"));
                EXPECT_TRUE(reply.ok() || reply.code == CMPI_RC_ERR_FAILED) << oxahv::codeName(reply.code);
            }
        });
    }
    for (int i = 0; i < 50; ++i) {
        const std::string number = std::to_string(i);
        broker_.declare(ClassDeclaration("Class" + number).superclass("Demo"));
        broker_.load(TEST_PROVIDER, "TestProvider", {"Class" + number});
        broker_.startRecording();
        broker_.injectFault("newInstance", {CMPI_RC_ERR_FAILED, false, 0, 1, 1});
        broker_.setKeyMode(i % 2 == 0 ? KeyMode::untyped : KeyMode::chars);
        broker_.setMessageHandler([](const oxahv::BrokerMessage&) {});
        broker_.clearFaults();
        broker_.stopRecording();
        broker_.unload("TestProvider");
    }
    isOver = true;
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST_F(ARequest, KeepsWhatAnAttachedThreadReturns) {
    behaviour.serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        const CMPIBroker* const broker = behaviour.broker;
        CMPIContext* const prepared = broker->bft->prepareAttachThread(broker, context);
        std::thread([&] {
            broker->bft->attachThread(broker, prepared);
            CMReturnInstance(result, CMNewInstance(broker, p, nullptr));
            CMReturnData(result, "text", CMPI_chars);
            broker->bft->detachThread(broker, prepared);
        }).join();
        return CMRelease(prepared);
    };
    const Reply reply = request_.getInstance(path("Demo.K=1"));
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(reply.instances.at(0), nullptr)), "root:Demo.K=1");
    EXPECT_EQ(oxahv::valueText(reply.data.at(0)), "\"text\"");
}

TEST(Hosting, LoadsAndUnloadsLibraries) {
    EmbeddedBroker broker;
    broker.load(TEST_PROVIDER, "TestProvider");
    {
        Request request(broker);
        const CMPIObjectPath* const path = request.objectPath("root", "Demo");
        EXPECT_EQ(request.enumerateInstanceNames(path).objectPaths.size(), 1U);
        EXPECT_EQ(request.enumerateInstances(path).message, "not for you");
    }
    EXPECT_EQ(errorOf([&] { broker.load(TEST_PROVIDER, "TestProvider"); }),
              "a provider TestProvider is hosted already");
    broker.unload("TestProvider");
    EXPECT_EQ(errorOf([&] { broker.unload("TestProvider"); }), "no provider TestProvider is hosted");
    broker.load(TEST_PROVIDER, "Generic");
    EXPECT_EQ(errorOf([&] { broker.load(TEST_PROVIDER, "Unknown"); }),
              "provider Unknown: its factory answered CMPI_RC_ERR_NOT_FOUND");
    EXPECT_EQ(errorOf([&] { broker.load(NO_PROVIDER, "None"); }),
              "library " NO_PROVIDER " has no factory for a provider None, such as None_Create_InstanceMI");
    EXPECT_EQ(
        errorOf([&] { broker.load("/nowhere/lib.so", "None"); }).rfind("cannot load provider library: ", 0),
        0U);
    EXPECT_EQ(errorOf([&] { broker.host("Empty", {}); }), "provider Empty has no factory");
    EXPECT_EQ(errorOf([&] { broker.load(TEST_PROVIDER, "Throws"); }),
              "provider Throws: its factory threw: no provider");
}

TEST(Hosting, ServesAProviderThatIsWrittenInC) {
    EmbeddedBroker broker;
    broker.load(C_PROVIDER, "CProvider");
    Request request(broker);
    CMPIObjectPath* const path = request.objectPathFromText("root:Demo.Key=\"text\",Number=7", "");
    const std::vector<std::string> properties = {"Array", "Date"};
    const Reply all = request.enumerateInstances(path, &properties);
    ASSERT_EQ(all.instances.size(), 1U) << oxahv::codeName(all.code);
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(all.instances[0], nullptr)), oxahv::pathText(path));
    EXPECT_EQ(oxahv::valueText(CMGetProperty(all.instances[0], "Array", nullptr)), "{7}");
    EXPECT_EQ(oxahv::valueText(CMGetProperty(all.instances[0], "Date", nullptr)),
              "\"20240229120000.000000+000\"");
    EXPECT_TRUE(CMIsNullValue(CMGetProperty(all.instances[0], "Text", nullptr))) << "not asked for";

    const Reply associates = request.associators(path, {"", "demo", "Role", ""});
    EXPECT_EQ(oxahv::valueText(CMGetProperty(associates.instances.at(0), "Text", nullptr)), "\"Role\"");
    EXPECT_TRUE(request.associators(path, {"", "Other", "", ""}).instances.empty());

    CMPIArgs* const in = CMNewArgs(broker.handle(), nullptr);
    CMAddArg(in, "In", "value", CMPI_chars);
    const Reply method = request.invokeMethod(path, "Name", in);
    EXPECT_EQ(oxahv::valueText(method.data.at(0)), "\"root\"");
    EXPECT_EQ(oxahv::valueText(CMGetArg(method.out, "In", nullptr)), "\"value\"");
    EXPECT_EQ(oxahv::valueText(CMGetArg(method.out, "Method", nullptr)), "\"Name\"");
}

namespace {

// A provider whose MI has no function but cleanup, which sends a request to the provider "Tested".
CMPIStatus endWithARequest(CMPIInstanceMI* /*mi*/, const CMPIContext* context, CMPIBoolean /*isEnding*/) {
    const CMPIBroker* const broker = behaviour.broker;
    CMPIStatus status = ok();
    const CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Other", nullptr);
    CMPIEnumeration* const names = broker->bft->enumerateInstanceNames(broker, context, path, &status);
    behaviour.filters.push_back(oxahv::codeName(status.rc));
    EXPECT_TRUE(status.rc != CMPI_RC_OK || CMHasNext(names, nullptr) != 0);
    return ok();
}

CMPIInstanceMI* createEmpty(const CMPIBroker* broker, const CMPIContext* /*context*/,
                            CMPIStatus* /*status*/) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.cleanup = endWithARequest;
    behaviour.broker = broker;
    return &mi;
}

} // namespace

TEST(Hosting, LetsAProviderSendRequestsWhileItEnds) {
    behaviour.serve = echo;
    behaviour.filters.clear();
    {
        EmbeddedBroker broker;
        broker.host("Empty", {createEmpty}, {"Empty"});
        broker.host("Tested", {Tested_Create_InstanceMI}, {"Other"});
        Request request(broker);
        EXPECT_EQ(request.getInstance(request.objectPath("root", "Empty")).code, CMPI_RC_ERR_NOT_SUPPORTED)
            << "the slot is empty";
        broker.unload("Empty");
        broker.host("Empty", {createEmpty}, {"Empty"});
        broker.unload("Tested");
        broker.host("Tested", {Tested_Create_InstanceMI}, {"Other"});
    }
    EXPECT_EQ(behaviour.filters, std::vector<std::string>(2, "CMPI_RC_OK"));
    EXPECT_EQ(behaviour.alive, 0);
}

TEST(Hosting, DeclaresClassesOnce) {
    EmbeddedBroker broker;
    broker.declare(ClassDeclaration("A").key("K", CMPI_uint8).property("P", CMPI_string));
    EXPECT_EQ(errorOf([&] { broker.declare(ClassDeclaration("a")); }), "class a is declared already");
    EXPECT_EQ(errorOf([&] { broker.declare(ClassDeclaration("B").superclass("C")); }),
              "class B: superclass C is not declared");
    EXPECT_EQ(
        errorOf([&] { broker.declare(ClassDeclaration("B").superclass("A").property("p", CMPI_uint8)); }),
        "class B: property p is declared as string already");
    broker.declare(ClassDeclaration("B").superclass("A").key("P", CMPI_string).property("Q", CMPI_ref));
    const auto properties = broker.propertiesOf("b");
    ASSERT_EQ(properties.size(), 3U);
    EXPECT_TRUE(properties[1].isKey);
    EXPECT_TRUE(broker.isA("B", "a"));
    EXPECT_FALSE(broker.isA("A", "B"));
}

TEST(TheTexts, NameCodesAndValues) {
    EXPECT_EQ(oxahv::codeName(CMPI_RC_ERR_NOT_FOUND), "CMPI_RC_ERR_NOT_FOUND");
    EXPECT_EQ(oxahv::codeFromName("err_not_found"), CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(oxahv::codeFromName("CMPI_RC_ERR_NOT_FOUND"), CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(oxahv::codeFromName("6"), CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(errorOf([] { oxahv::codeFromName("ERR_NO"); }), "there is no CMPI return code ERR_NO");
    EXPECT_EQ(oxahv::typeName(CMPI_uint16A), "uint16");
    CMPIValue value = {};
    value.sint8 = -5;
    EXPECT_EQ(oxahv::valueText({CMPI_sint8, 0, value}), "-5");
    value.real64 = 0.1;
    EXPECT_EQ(oxahv::valueText({CMPI_real64, 0, value}), "0.1");
    EXPECT_EQ(oxahv::valueText({CMPI_real64, CMPI_nullValue, value}), "NULL");
    value.real64 = 1e300;
    EXPECT_EQ(oxahv::valueText({CMPI_real64, 0, value}), "1.0e+300");
    value.real32 = -3;
    EXPECT_EQ(oxahv::valueText({CMPI_real32, 0, value}), "-3.0");
    value.real64 = 0.1;
    const ThreadLocale german("de_DE.ISO-8859-1"); // which writes 0,1
    EXPECT_EQ(oxahv::valueText({CMPI_real64, 0, value}), "0.1");
}
