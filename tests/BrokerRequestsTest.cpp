// Requests through the broker: providers, faults, records, modes, threads.
#include "TestLocales.h"

#include "EmbeddedBroker.h"
#include "ErrorOf.h"
#include "FailingMemory.h"

#include <atomic>
#include <dlfcn.h>
#include <functional>
#include <future>
#include <gtest/gtest.h>
#include <stdexcept>

using oxahv::BrokerError;
using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::KeyMode;
using oxahv::Reply;
using oxahv::Request;

namespace {

// A provider whose functions a test sets; the slots that none needs are empty.
using Served = std::function<CMPIStatus(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)>;
Served serve;
std::function<void(const CMPIContext*)> atEnd;
std::vector<std::string> told;
const CMPIBroker* broker = nullptr;

template <class Mi, class... Rest>
CMPIStatus serveAny(Mi* /*mi*/, const CMPIContext* context, const CMPIResult* result,
                    const CMPIObjectPath* path, Rest... /*rest*/) {
    return serve(context, result, path);
}

CMPIStatus end(CMPIInstanceMI* /*mi*/, const CMPIContext* context, CMPIBoolean /*isEnding*/) {
    if (atEnd) {
        atEnd(context);
    }
    CMReturn(CMPI_RC_OK);
}

CMPIStatus tellFilter(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                      const char* associationClass, const char* resultClass, const char* role,
                      const char* resultRole, const char**) {
    for (const char* const text : {associationClass, resultClass, role, resultRole}) {
        told.push_back(text != nullptr ? text : "null");
    }
    CMReturn(CMPI_RC_OK);
}

CMPIStatus giveBack(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                    const char* method, const CMPIArgs* in, CMPIArgs* out) {
    const CMPIData data = CMGetArg(in, "In", nullptr);
    CMAddArg(out, method, &data.value, data.type);
    return CMReturnData(result, &data.value, data.type);
}

CMPIInstanceMI* createInstanceMI(const CMPIBroker* theBroker, const CMPIContext* context, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.cleanup = end;
    table.enumerateInstanceNames = serveAny;
    table.getInstance = serveAny;
    broker = theBroker;
    told = {oxahv::valueText(CMGetContextEntry(context, "StateFile", nullptr))};
    return &mi;
}

CMPIAssociationMI* createAssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIAssociationMIFT table = {};
    static CMPIAssociationMI mi = {nullptr, &table};
    table.associators = tellFilter;
    return &mi;
}

CMPIMethodMI* createMethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIMethodMIFT table = {};
    static CMPIMethodMI mi = {nullptr, &table};
    table.invokeMethod = giveBack;
    return &mi;
}

// Returns the path of the request.
CMPIStatus echo(const CMPIContext* /*context*/, const CMPIResult* result, const CMPIObjectPath* path) {
    CMReturnObjectPath(result, path);
    return CMReturnDone(result);
}

class ARequest : public testing::Test {
protected:
    ARequest() {
        serve = echo;
        broker_.host("Tested", {createInstanceMI, createAssociationMI, createMethodMI});
    }
    ~ARequest() override { atEnd = nullptr; }

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root"); }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(ARequest, ReachesTheProviderAndBringsItsResultsBack) {
    CMPIObjectPath* const demo = path("Demo.Key=\"text\"");
    EXPECT_EQ(oxahv::pathText(request_.enumerateInstanceNames(demo).objectPaths.at(0)),
              "root:Demo.Key=\"text\"");
    serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        EXPECT_EQ(oxahv::valueText(CMGetContextEntry(context, CMPIInitNameSpace, nullptr)), "\"root\"");
        EXPECT_EQ(oxahv::valueText(CMGetContextEntry(context, CMPIPrincipal, nullptr)), "\"\"");
        EXPECT_EQ(oxahv::valueText(CMGetContextEntry(context, CMPIInvocationFlags, nullptr)), "0");
        CMPIInstance* const instance = CMNewInstance(broker, p, nullptr);
        const CMPIStatus status = CMReturnInstance(result, instance);
        CMSetProperty(instance, "Late", "x", CMPI_chars); // what was returned is a copy
        return status;
    };
    const Reply reply = request_.getInstance(demo);
    EXPECT_EQ(CMGetPropertyCount(reply.instances.at(0), nullptr), 1U);
    EXPECT_FALSE(reply.done);
    EXPECT_EQ(request_.deleteInstance(demo).code, CMPI_RC_ERR_NOT_SUPPORTED) << "the slot is empty";

    request_.associators(demo, {"A", "", "R", ""});
    EXPECT_EQ(told, std::vector<std::string>({"NULL", "A", "null", "R", "null"}));

    CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
    CMAddArg(in, "In", "value", CMPI_chars);
    EXPECT_EQ(oxahv::valueText(request_.invokeMethod(demo, "Any", in).data.at(0)), "\"value\"");
    broker_.declare(ClassDeclaration("Base").method("Out", CMPI_string, {{"In", CMPI_string}}));
    broker_.declare(ClassDeclaration("Demo").superclass("Base"));
    EXPECT_EQ(oxahv::valueText(CMGetArg(request_.invokeMethod(demo, "OUT", in).out, "Out", nullptr)),
              "\"value\"");
    const Reply other = request_.invokeMethod(demo, "Other", in);
    EXPECT_EQ(other.code, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(other.message, "class Demo has no method Other");
    EXPECT_TRUE(other.data.empty());
}

TEST_F(ARequest, ReportsWhatTheProviderReports) {
    serve = [](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*) {
        result->ft->returnError(result, broker->eft->newCMPIError(broker, "o", "i", "told", ErrorSevLow,
                                                                  ErrorProbCauseOther, CMPI_RC_ERR_NOT_FOUND,
                                                                  nullptr));
        return CMPIStatus{CMPI_RC_OK, nullptr};
    };
    Reply reply = request_.getInstance(path("Demo"));
    EXPECT_EQ(reply.code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(reply.message, "told");
    serve = [](auto&&...) -> CMPIStatus { throw std::runtime_error("lost"); };
    reply = request_.getInstance(path("Demo"));
    EXPECT_EQ(reply.code, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(reply.message, "exception: lost");
}

TEST_F(ARequest, ComesThroughWantOfMemory) {
    serve = [](auto&&...) {
        CMPIString* const why = CMNewString(broker, "a text that does not fit into a string itself", nullptr);
        return CMPIStatus{CMPI_RC_ERR_ACCESS_DENIED, why};
    };
    for (const bool once : {true, false}) {
        bool isReached = true;
        for (unsigned int n = 1; isReached; ++n) {
            SCOPED_TRACE((once ? "allocation " : "allocations from ") + std::to_string(n));
            EmbeddedBroker own;
            own.setContextEntry("an entry with a long name", "and with a text that is no shorter");
            once ? failing::allocation(n) : failing::allocationsFrom(n);
            try {
                own.load(TEST_PROVIDER, "TestProvider");
                Request request(own);
                request.enumerateInstances(request.objectPath("root", "Demo"));
                const Reply reply = request_.getInstance(request_.objectPath("root", "Demo"));
                own.unload("TestProvider");
                isReached = failing::ended();
                EXPECT_NE(reply.message.rfind("exception", 0), 0U) << "not the provider's: " << reply.message;
            } catch (const std::bad_alloc&) {
                isReached = failing::ended();
            } catch (const BrokerError&) { // of a factory whose status the broker could not make
                isReached = failing::ended();
            }
        }
        EXPECT_EQ(::dlopen(TEST_PROVIDER, RTLD_NOW | RTLD_NOLOAD), nullptr) << "no library stays behind";
    }
}

TEST_F(ARequest, FindsItsProviderByClass) {
    EmbeddedBroker own;
    own.declare(ClassDeclaration("Base"));
    own.declare(ClassDeclaration("Derived").superclass("Base"));
    own.declare(ClassDeclaration("Other"));
    own.host("Tested", {nullptr, nullptr, createMethodMI}, {"Base"});
    own.load(TEST_PROVIDER, "TestProvider", {"Base"});
    Request request(own);
    const auto codeFor = [&](const char* name) {
        return request.enumerateInstanceNames(request.objectPath("root", name)).code;
    };
    EXPECT_EQ(codeFor("derived"), CMPI_RC_OK);
    EXPECT_EQ(codeFor("Other"), CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(codeFor("None"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(request.enumerateInstanceNames(nullptr).code, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ARequest, TellsHowFarItHasCome) {
    std::vector<std::size_t> counts;
    request_.setProgressHandler([&](std::size_t results) { counts.push_back(results); });
    serve = [&](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        if (counts.empty()) { // an upcall, whose results are not the client's
            CMReturnObjectPath(result, p);
            broker->bft->enumerateInstanceNames(broker, context, p, nullptr);
            CMPIStatus status = {CMPI_RC_OK, nullptr};
            broker->bft->getInstance(broker, context, p, nullptr, &status);
            EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND) << "it returned none";
        }
        return echo(context, result, p);
    };
    request_.enumerateInstanceNames(path("Demo"));
    EXPECT_EQ(counts, std::vector<std::size_t>({1, 2}));
    request_.enumerateInstanceNames(path("Demo"));
    EXPECT_EQ(counts, std::vector<std::size_t>({1, 2, 1})) << "each operation counts for itself";
    request_.setProgressHandler(nullptr);
    request_.enumerateInstanceNames(path("Demo"));
    EXPECT_EQ(counts.size(), 3U);
}

TEST_F(ARequest, CarriesTheEntriesThatProvidersAreGiven) {
    broker_.setContextEntry("StateFile", "earlier");
    broker_.setContextEntry("StateFile", "/a/file");
    Request later(broker_);
    EXPECT_EQ(oxahv::valueText(CMGetContextEntry(later.context(), "StateFile", nullptr)), "\"/a/file\"");
    broker_.host("Another", {createInstanceMI});
    EXPECT_EQ(told, std::vector<std::string>{"\"/a/file\""});
}

TEST_F(ARequest, ReadsValuesAndPathsAndSaysWhatIsWrongWithThem) {
    const struct {
        const char* text;
        CMPIType type;
        const char* value;
    } values[] = {
        {"12", CMPI_null, "uint64 12"},
        {"-12", CMPI_null, "sint64 -12"},
        {"-0", CMPI_uint8, "uint8 0"},
        {"True", CMPI_null, "boolean TRUE"},
        {"-", CMPI_null, "string \"-\""},
        {"", CMPI_null, "string \"\""},
        {"65", CMPI_char16, "char16 65"},
        {"-0.5", CMPI_real64, "real64 -0.5"},
        {"nan", CMPI_real64, "value, column 1: expected a real64"},
        {"1e39", CMPI_real32, "value, column 1: expected a real32"},
        {"1.5x", CMPI_real32, "value, column 4: expected nothing behind the value"},
        {"now", CMPI_dateTime, "value, column 1: expected a datetime"},
        {"1", CMPI_boolean, "value, column 1: expected a boolean"},
        {"\"x", CMPI_string, "value, column 1: the quote is not closed"},
        {"A.", CMPI_ref, "object path, column 3: expected a key name"},
    };
    for (const auto& row : values) {
        std::string value;
        const std::string error = errorOf([&] {
            const CMPIData data = request_.valueFromText(row.text, row.type);
            value = oxahv::typeName(data.type) + ' ' + oxahv::valueText(data);
        });
        EXPECT_EQ(value.empty() ? error : value, row.value) << row.text;
    }
    broker_.declare(ClassDeclaration("Known").key("U", CMPI_uint8).property("X", CMPI_uint8));
    const struct {
        const char* text;
        const char* error;
    } paths[] = {
        {"root:Demo.K=\"a\\\"b\\\\c\"", "no error"},
        {"root/x:Demo.A=1,B=-2,C=TRUE,D=\"x:y.z=,\"", "no error"},
        {"root:Demo.M=18446744073709551615,N=-9223372036854775808", "no error"},
        {"", "column 1: expected a class name"},
        {"Demo.", "column 6: expected a key name"},
        {"Demo.K", "column 7: expected '='"},
        {"Demo.K=", "column 8: expected a value"},
        {"Demo.K=\"\\x\"", "column 10: expected \", \\, n, r or t after a backslash"},
        {"Demo.K=1,k=2", "column 10: key k stands twice"},
        {"Demo.K=1x", "column 8: expected a number"},
        {"Demo.K=maybe", "column 8: expected a value: a number, a text in quotes, TRUE or FALSE"},
        {"Demo.K=18446744073709551616", "column 8: 18446744073709551616 does not fit into uint64"},
        {"Demo K", "column 5: expected '.'"},
        {"Known.U=\"1\"", "column 9: expected a uint8"},
        {"Known.X=1", "column 7: class Known has no key X"},
    };
    for (const auto& row : paths) {
        std::string written;
        const std::string error = errorOf([&] { written = oxahv::pathText(path(row.text)); });
        EXPECT_EQ(error, (written.empty() ? "object path, " : "") + std::string(row.error)) << row.text;
        EXPECT_TRUE(written.empty() || written == row.text) << written;
    }
}

TEST_F(ARequest, DeliversKeysAsTheModeSays) {
    CMPIObjectPath* const tooWide = path("Demo.U=256,S=-32769");
    broker_.declare(ClassDeclaration("Demo")
                        .key("U", CMPI_uint8)
                        .key("S", CMPI_sint16)
                        .key("T", CMPI_string)
                        .key("B", CMPI_boolean)
                        .key("R", CMPI_ref));
    const CMPIInstance* const instance = CMNewInstance(broker_.handle(), tooWide, nullptr);
    EXPECT_EQ(CMGetProperty(instance, "U", nullptr).type, CMPI_uint64);
    EXPECT_EQ(CMGetProperty(instance, "S", nullptr).type, CMPI_sint64);
    const char* const text = "root:Demo.U=200,S=-5,T=\"t\",B=TRUE,R=\"Demo.U=1\"";
    const std::pair<KeyMode, std::vector<CMPIType>> rows[] = {
        {KeyMode::exact, {CMPI_uint8, CMPI_sint16, CMPI_string, CMPI_boolean, CMPI_ref, CMPI_uint8}},
        {KeyMode::untyped, {CMPI_uint64, CMPI_sint64, CMPI_string, CMPI_boolean, CMPI_ref, CMPI_uint64}},
        {KeyMode::chars, {CMPI_uint8, CMPI_sint16, CMPI_chars, CMPI_boolean, CMPI_ref, CMPI_uint8}},
    };
    for (const auto& [mode, expected] : rows) {
        broker_.setKeyMode(mode);
        std::vector<CMPIType> types;
        serve = [&](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* p) {
            for (CMPICount i = 0; i < CMGetKeyCount(p, nullptr); ++i) {
                const CMPIData key = CMGetKeyAt(p, i, nullptr, nullptr);
                types.push_back(key.type);
                if (key.type == CMPI_ref) {
                    types.push_back(CMGetKeyAt(key.value.ref, 0, nullptr, nullptr).type);
                }
            }
            CMReturnObjectPath(result, p);
            return CMReturnInstance(result, CMNewInstance(broker, p, nullptr));
        };
        const Reply reply = request_.getInstance(path(text));
        EXPECT_EQ(types, expected);
        EXPECT_EQ(oxahv::pathText(reply.objectPaths.at(0)), text);
        const CMPIData number = CMGetProperty(reply.instances.at(0), "S", nullptr);
        EXPECT_EQ(oxahv::typeName(number.type) + oxahv::valueText(number), "sint16-5") << "as it is declared";
        EXPECT_EQ(CMGetProperty(reply.instances[0], "T", nullptr).type, CMPI_string);
    }
}

TEST_F(ARequest, MeetsTheFaultsThatAreInjected) {
    CMPIObjectPath* const demo = path("Demo.A=1,B=2");
    CMPIStatus status = {CMPI_RC_OK, nullptr};
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
    broker_.injectFault("*", {CMPI_RC_ERR_FAILED, false, 0, 2});
    EXPECT_EQ(CMGetKeyCount(demo, &status), 2U) << "a call that fails does nothing";
    EXPECT_EQ(CMGetClassName(demo, &status), nullptr);

    EXPECT_EQ(errorOf([&] { broker_.injectFault("nothing", {}); }), "there is no slot nothing");
    EXPECT_EQ(errorOf([&] { broker_.injectFault("setProperty", {}); }),
              "slot setProperty is one of several: CMPIBrokerFT.setProperty, CMPIInstanceFT.setProperty");
}

TEST_F(ARequest, IsRecordedCallByCall) {
    CMPIStatus status = {CMPI_RC_ERR_FAILED, nullptr};
    CMPIObjectPath* const demo = path("Demo");
    broker_.startRecording();
    CMGetKey(demo, "none", &status);
    const std::vector<oxahv::Call> calls = broker_.stopRecording();
    CMGetKey(demo, "none", nullptr);
    EXPECT_TRUE(broker_.stopRecording().empty());
    ASSERT_EQ(calls.size(), 1U);
    EXPECT_EQ(calls[0].entryStatus.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(calls[0].code, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(ARequest, CanBeLeftToAThreadThatIsAttached) {
    serve = [this](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        CMPIContext* const prepared = broker->bft->prepareAttachThread(broker, context);
        std::thread([&] {
            EXPECT_EQ(broker->bft->attachThread(broker, prepared).rc, CMPI_RC_OK);
            EXPECT_FALSE(CMIsNullValue(CMGetContextEntry(prepared, CMPIInitNameSpace, nullptr)));
            const std::size_t before = broker_.liveObjects().strings;
            CMNewString(broker, "text", nullptr);
            EXPECT_EQ(broker_.liveObjects().strings, before + 1);
            CMReturnInstance(result, CMNewInstance(broker, p, nullptr));
            EXPECT_EQ(broker->bft->detachThread(broker, prepared).rc, CMPI_RC_OK);
            EXPECT_EQ(broker_.liveObjects().strings, before);
            EXPECT_EQ(broker->bft->detachThread(broker, prepared).rc, CMPI_RC_ERR_FAILED);
        }).join();
        return CMRelease(prepared);
    };
    const Reply reply = request_.getInstance(path("Demo.K=1"));
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(reply.instances.at(0), nullptr)), "root:Demo.K=1");
}

// What ends a thread's own values may call the broker still; a sanitizer sees what it must not touch.
TEST_F(ARequest, MayBeLeftByAThreadThatStaysAttached) {
    serve = [](const CMPIContext* context, const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
        CMPIContext* const prepared = broker->bft->prepareAttachThread(broker, context);
        CMPI_THREAD_KEY_TYPE key = 0;
        broker->xft->createThreadKey(&key, [](void* /*value*/) { CMNewString(broker, "late", nullptr); });
        std::thread([&] {
            broker->xft->setThreadSpecific(key, &key);
            broker->bft->attachThread(broker, prepared);
            CMNewString(broker, "text", nullptr);
        }).join();
        broker->xft->destroyThreadKey(key);
        return CMRelease(prepared);
    };
    EXPECT_TRUE(request_.getInstance(path("Demo.K=1")).ok());
}

TEST_F(ARequest, KeepsItsProviderWhileItIsInside) {
    std::promise<void> entered;
    std::promise<void> mayLeave;
    std::atomic<bool> hasEnded{false};
    atEnd = [&](auto&&...) { hasEnded = true; };
    serve = [&](auto&&...) {
        entered.set_value();
        mayLeave.get_future().wait();
        EXPECT_FALSE(hasEnded);
        return CMPIStatus{CMPI_RC_OK, nullptr};
    };
    std::thread inside([this] {
        Request request(broker_);
        EXPECT_TRUE(request.getInstance(request.objectPath("root", "Demo")).ok());
    });
    entered.get_future().wait();
    std::thread unloading([&] {
        broker_.unload("Tested");
        EXPECT_TRUE(hasEnded) << "unload returned too early";
    });
    while (request_.invokeMethod(path("Demo"), "Out", nullptr).code != CMPI_RC_ERR_NOT_SUPPORTED) {
        std::this_thread::yield(); // until it takes no further request
    }
    mayLeave.set_value();
    inside.join();
    unloading.join();
}

TEST_F(ARequest, RunsWhileTheBrokerIsSetUp) {
    serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        CMAddContextEntry(context, "Entry", "text", CMPI_chars);
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIInstance* const instance = CMNewInstance(broker, p, &status);
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
        const std::string name = "Class" + std::to_string(i);
        broker_.declare(ClassDeclaration(name).superclass("Demo"));
        broker_.load(TEST_PROVIDER, "TestProvider", {name});
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

TEST(Hosting, LoadsAndUnloadsLibraries) {
    EmbeddedBroker own;
    const auto errorOfLoading = [&](const char* file, const char* name) {
        return errorOf([&] { own.load(file, name); });
    };
    EXPECT_EQ(errorOfLoading(TEST_PROVIDER, "TestProvider"), "no error");
    EXPECT_EQ(errorOfLoading(TEST_PROVIDER, "TestProvider"), "a provider TestProvider is hosted already");
    own.unload("TestProvider");
    EXPECT_EQ(errorOf([&] { own.unload("TestProvider"); }), "no provider TestProvider is hosted");
    EXPECT_EQ(errorOfLoading(TEST_PROVIDER, "Generic"), "no error");
    EXPECT_EQ(errorOfLoading(TEST_PROVIDER, "Unknown"),
              "provider Unknown: its factory answered CMPI_RC_ERR_NOT_FOUND");
    EXPECT_EQ(errorOfLoading(TEST_PROVIDER, "Throws"), "provider Throws: its factory threw: no provider");
    EXPECT_EQ(errorOfLoading(TEST_PROVIDER, "ThrowsANumber"),
              "provider ThrowsANumber: its factory threw an exception of an unknown kind");
    EXPECT_EQ(errorOf([&] { own.host("Empty", {}); }), "provider Empty has no factory");
}

TEST(Hosting, ServesAProviderThatIsWrittenInC) {
    EmbeddedBroker own;
    own.load(C_PROVIDER, "CProvider");
    Request request(own);
    CMPIObjectPath* const path = request.objectPathFromText("root:Demo.Key=\"text\",Number=7", "");
    const std::vector<std::string> properties = {"Array", "Date"};
    const Reply all = request.enumerateInstances(path, &properties);
    ASSERT_EQ(all.instances.size(), 1U) << oxahv::codeName(all.code);
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(all.instances[0], nullptr)), oxahv::pathText(path));
    EXPECT_EQ(oxahv::valueText(CMGetProperty(all.instances[0], "Array", nullptr)), "{7}");
    EXPECT_EQ(oxahv::valueText(CMGetProperty(all.instances[0], "Date", nullptr)),
              "\"20240229120000.000000+000\"");
    EXPECT_TRUE(CMIsNullValue(CMGetProperty(all.instances[0], "Text", nullptr))) << "not asked for";

    CMPIArgs* const in = CMNewArgs(own.handle(), nullptr);
    CMAddArg(in, "In", "value", CMPI_chars);
    const Reply method = request.invokeMethod(path, "Name", in);
    EXPECT_EQ(oxahv::valueText(method.data.at(0)), "\"root\"");
    EXPECT_EQ(oxahv::valueText(CMGetArg(method.out, "In", nullptr)), "\"value\"");
    EXPECT_EQ(oxahv::valueText(CMGetArg(method.out, "Method", nullptr)), "\"Name\"");
}

TEST(Hosting, LetsAProviderSendRequestsWhileItEnds) {
    std::vector<CMPIrc> answers;
    atEnd = [&](const CMPIContext* context) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Other", nullptr);
        broker->bft->enumerateInstanceNames(broker, context, path, &status);
        answers.push_back(status.rc);
        EXPECT_FALSE(CMIsNullValue(CMGetContextEntry(context, "StateFile", nullptr)));
    };
    {
        EmbeddedBroker own;
        own.setContextEntry("StateFile", "/a/file");
        own.host("Ending", {createInstanceMI}, {"Ending"});
        own.load(TEST_PROVIDER, "TestProvider", {"Other"});
        own.unload("Ending");
        own.host("Ending", {createInstanceMI}, {"Ending"});
        own.unload("TestProvider");
        own.load(TEST_PROVIDER, "TestProvider", {"Other"});
    }
    atEnd = nullptr;
    EXPECT_EQ(answers, std::vector<CMPIrc>(2, CMPI_RC_OK));
}

TEST(TheTexts, NameCodesAndValues) {
    EXPECT_EQ(oxahv::codeName(CMPI_RC_ERR_NOT_FOUND), "CMPI_RC_ERR_NOT_FOUND");
    for (const char* const name : {"err_not_found", "CMPI_RC_ERR_NOT_FOUND", "6"}) {
        EXPECT_EQ(oxahv::codeFromName(name), CMPI_RC_ERR_NOT_FOUND) << name;
    }
    EXPECT_EQ(errorOf([] { oxahv::codeFromName("ERR_NO"); }), "there is no CMPI return code ERR_NO");
    CMPIValue value = {};
    value.sint8 = -5;
    EXPECT_EQ(oxahv::valueText({CMPI_sint8, 0, value}), "-5");
    EXPECT_EQ(oxahv::valueText({CMPI_real64, CMPI_nullValue, value}), "NULL");
    value.real64 = 1e300;
    EXPECT_EQ(oxahv::valueText({CMPI_real64, 0, value}), "1.0e+300");
    value.real32 = -3;
    EXPECT_EQ(oxahv::valueText({CMPI_real32, 0, value}), "-3.0");
    value.real64 = 0.1;
    const ThreadLocale german("de_DE.ISO-8859-1"); // which writes 0,1
    EXPECT_EQ(oxahv::valueText({CMPI_real64, 0, value}), "0.1");
}
