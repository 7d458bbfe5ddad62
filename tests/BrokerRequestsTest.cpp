// Requests through the broker: hosted providers, injected faults, delivery of keys, and threads.
#include "TestLocales.h"

#include "ErrorOf.h"
#include "Factory.h"
#include "FailingMemory.h"

#include <atomic>
#include <dlfcn.h>
#include <functional>
#include <future>
#include <gtest/gtest.h>
#include <stdexcept>

using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::KeyMode;
using oxahv::Reply;
using oxahv::Request;

namespace {

// A provider whose functions a test sets; the other slots are empty.
std::function<CMPIStatus(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)> serve;
std::function<void(const CMPIContext*)> atEnd;

template <class... Rest>
CMPIStatus serveAny(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                    const CMPIObjectPath* path, Rest...) {
    return serve(context, result, path);
}

CMPIStatus end(CMPIInstanceMI*, const CMPIContext* context, CMPIBoolean) {
    atEnd(context);
    CMReturn(CMPI_RC_OK);
}

// Returns the path of the request.
CMPIStatus echo(const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path) {
    CMReturnObjectPath(result, path);
    return CMReturnDone(result);
}

// Another provider, which notes its requests with all arguments. It returns an instance of the path, or the
// path itself where the operation's letter is a capital.
std::string asked;

struct Note {
    static void add(const char* text) { asked += text != nullptr ? text + std::string(" ") : "- "; }
    static void add(const char** list) {
        for (; *list != nullptr; ++list) {
            add(*list);
        }
    }
    static void add(const CMPIInstance* instance) { add(textOf(instance, "K").c_str()); }
    static void add(const CMPIArgs* in) { add(textOf(in, "In").c_str()); }
    static void add(CMPIArgs* out) { CMAddArg(out, "Out", "value", CMPI_chars); }
};

template <char operation, class MI, class... Rest>
CMPIStatus note(MI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path, Rest... rest) {
    asked += operation + std::string(" ");
    (Note::add(rest), ...);
    return operation < 'a' ? CMReturnObjectPath(result, path)
                           : CMReturnInstance(result, CMNewInstance(broker, path, nullptr));
}

const CMPIInstanceMIFT served = {0, 0, "", end, serveAny, {}, serveAny, {}, {}, {}, {}, {}};
const CMPIInstanceMIFT instances = {0,         0,         "",        {},        note<'N'>, note<'i'>,
                                    note<'g'>, note<'C'>, note<'m'>, note<'d'>, note<'q'>, {}};
const CMPIAssociationMIFT associations = {0, 0, "", {}, note<'a'>, note<'A'>, note<'r'>, note<'R'>, {}, {}};
const CMPIMethodMIFT methods = {0, 0, "", {}, note<'c'>};

class RequestTest : public testing::Test {
protected:
    RequestTest() {
        serve = echo;
        broker_.host("Tested", {create<served>});
    }
    ~RequestTest() override { atEnd = nullptr; }

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root"); }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

std::string firstPathOf(const Reply& reply) {
    return oxahv::pathText(reply.objectPaths.at(0));
}

} // namespace

TEST_F(RequestTest, ReachesTheProviderAndReturnsItsResults) {
    broker_.setContextEntry("StateFile", "earlier");
    broker_.setContextEntry("StateFile", "/a/file");
    Request request(broker_);
    CMPIObjectPath* const demo = path("Demo.Key=\"text\"");
    EXPECT_EQ(firstPathOf(request.enumerateInstanceNames(demo)), "root:Demo.Key=\"text\"");
    serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        std::string entries;
        for (const char* const name : {CMPIInitNameSpace, CMPIPrincipal, CMPIInvocationFlags, "StateFile"}) {
            entries += textOf(context, name) + ' ';
        }
        EXPECT_EQ(entries, R"("root" "" 0 "/a/file" )");
        CMPIInstance* const instance = CMNewInstance(broker, p, nullptr);
        const CMPIStatus status = CMReturnInstance(result, instance);
        CMSetProperty(instance, "Late", "x", CMPI_chars); // the result is a copy
        return status;
    };
    const Reply reply = request.getInstance(demo);
    EXPECT_EQ(CMGetPropertyCount(reply.instances.at(0), nullptr), 1U);
    EXPECT_FALSE(reply.done);
    EXPECT_EQ(request.deleteInstance(demo).code, CMPI_RC_ERR_NOT_SUPPORTED) << "the slot is empty";
    broker_.declare(ClassDeclaration("Base").method("Start", CMPI_string));
    broker_.declare(ClassDeclaration("Demo").superclass("Base"));
    EXPECT_EQ(request.invokeMethod(demo, "START", nullptr).code, CMPI_RC_ERR_NOT_SUPPORTED)
        << "the provider has no methods";
    EXPECT_EQ(failureOf(request.invokeMethod(demo, "Other", nullptr)),
              "CMPI_RC_ERR_METHOD_NOT_FOUND class Demo has no method Other");
}

TEST_F(RequestTest, CanComeFromAProvider) {
    const CMPIBroker* const b = broker_.handle();
    const CMPIContext* const context = request_.context();
    broker_.host("Noting", {create<instances>, create<associations>, create<methods>}, {"Asked"});
    CMPIObjectPath* const p = path("Asked.K=1");
    CMPIInstance* const instance = CMNewInstance(b, p, nullptr);
    CMPIArgs* const in = CMNewArgs(b, nullptr);
    CMPIArgs* const out = CMNewArgs(b, nullptr);
    CMAddArg(in, "In", "x", CMPI_chars);
    CMPIValue two = {};
    two.uint64 = 2;
    const char* properties[] = {"P", "Q", nullptr};
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const auto pathOf = [](CMPIEnumeration* all) {
        EXPECT_EQ(CMGetArrayCount(CMToArray(all, nullptr), nullptr), 1U);
        const CMPIData first = CMGetNext(all, nullptr);
        return oxahv::pathText(first.type == CMPI_ref ? first.value.ref
                                                      : CMGetObjectPath(first.value.inst, nullptr));
    };
    const std::vector<std::string> paths = {
        pathOf(b->bft->enumerateInstanceNames(b, context, p, &status)),
        pathOf(b->bft->enumerateInstances(b, context, p, properties, &status)),
        oxahv::pathText(CMGetObjectPath(b->bft->getInstance(b, context, p, properties, &status), nullptr)),
        oxahv::pathText(b->bft->createInstance(b, context, p, instance, &status)),
        pathOf(b->bft->execQuery(b, context, p, "select", "WQL", &status)),
        pathOf(b->bft->associators(b, context, p, "Asked", "B", "C", "D", properties, &status)),
        pathOf(b->bft->associatorNames(b, context, p, "Asked", "B", "C", "D", &status)),
        pathOf(b->bft->references(b, context, p, "Asked", "B", properties, &status)),
        pathOf(b->bft->referenceNames(b, context, p, "Asked", nullptr, &status))};
    EXPECT_EQ(paths, std::vector<std::string>(9, "root:Asked.K=1"));
    EXPECT_EQ(b->bft->modifyInstance(b, context, p, instance, properties).rc, CMPI_RC_OK);
    EXPECT_EQ(b->bft->deleteInstance(b, context, p).rc, CMPI_RC_OK);
    b->bft->invokeMethod(b, context, p, "Start", in, out, &status);
    EXPECT_EQ(textOf(out, "Out"), "\"value\"");
    EXPECT_EQ(b->bft->getProperty(b, context, p, "K", &status).value.uint64, 1U);
    EXPECT_EQ(b->bft->setProperty(b, context, p, "K", &two, CMPI_uint64).rc, CMPI_RC_OK);
    EXPECT_EQ(asked, "N i P Q g P Q C 1 q select WQL a Asked B C D P Q A Asked B C D r Asked B P Q R Asked - "
                     "m 1 P Q d c Start \"x\" g K m 2 K ");
    auto* const foreign = reinterpret_cast<CMPIArgs*>(p);
    b->bft->invokeMethod(b, context, p, "Start", in, foreign, &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(request_.invokeMethod(p, "Start", foreign).code, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(RequestTest, PassesTheArgumentsThatTheMethodDeclares) {
    broker_.host("Noting", {nullptr, nullptr, create<methods>}, {"Asked"});
    broker_.declare(ClassDeclaration("Asked").method(
        "Start", CMPI_uint32,
        {{"In", CMPI_string}, {"Number", CMPI_uint8A}, {"Out", CMPI_string, "", false, true}}));
    const std::string refused = "CMPI_RC_ERR_INVALID_PARAMETER ";
    const struct {
        const char* name;
        CMPIType type;
        std::string answer;
    } rows[] = {
        {"IN", CMPI_chars, "CMPI_RC_OK "},
        {"Number", CMPI_null, "CMPI_RC_OK "},
        {"Number", CMPI_chars, refused + "argument Number of method Start is no uint8[]"},
        {"Out", CMPI_chars, refused + "method Start takes no argument Out"},
        {"Else", CMPI_chars, refused + "method Start takes no argument Else"},
    };
    for (const auto& row : rows) {
        CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
        CMAddArg(in, row.name, row.type == CMPI_null ? nullptr : "text", row.type);
        EXPECT_EQ(failureOf(request_.invokeMethod(path("Asked"), "start", in)), row.answer);
    }
}

TEST_F(RequestTest, ReportsErrorsAndExceptionsOfTheProvider) {
    serve = [](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*) {
        const CMPIError* const error = broker->eft->newCMPIError(
            broker, "o", "i", "told", ErrorSevLow, ErrorProbCauseOther, CMPI_RC_ERR_NOT_FOUND, nullptr);
        return result->ft->returnError(result, error);
    };
    EXPECT_EQ(failureOf(request_.getInstance(path("Demo"))), "CMPI_RC_ERR_NOT_FOUND told");
    serve = [](auto&&...) -> CMPIStatus { throw std::runtime_error("lost"); };
    EXPECT_EQ(request_.getInstance(path("Demo")).message, "exception: lost");
}

TEST_F(RequestTest, SurvivesOutOfMemory) {
    serve = [](auto&&...) {
        CMPIString* const why = CMNewString(broker, "a text that does not fit into a string itself", nullptr);
        return CMPIStatus{CMPI_RC_ERR_ACCESS_DENIED, why};
    };
    for (const auto fail : {failing::allocation, failing::allocationsFrom}) {
        bool isReached = true;
        for (unsigned int n = 1; isReached; ++n) {
            SCOPED_TRACE((fail == failing::allocation ? "allocation " : "allocations from ") +
                         std::to_string(n));
            EmbeddedBroker own;
            own.setContextEntry("an entry with a long name", "and with a text that is no shorter");
            fail(n);
            std::string message;
            try {
                own.load(TEST_PROVIDER, "TestProvider");
                Request request(own);
                request.getInstance(request.objectPath("root", "Demo"));
                message = request_.getInstance(request_.objectPath("root", "Demo")).message;
                own.unload("TestProvider");
            } catch (const std::bad_alloc&) {
                message = "no room";
            } catch (const oxahv::BrokerError&) {
                message = "no status"; // of a factory
            }
            isReached = failing::ended();
            EXPECT_NE(message.rfind("exception", 0), 0U) << "not the provider's: " << message;
        }
        EXPECT_EQ(::dlopen(TEST_PROVIDER, RTLD_NOW | RTLD_NOLOAD), nullptr) << "the library stays loaded";
    }
}

TEST_F(RequestTest, FindsTheProviderOfTheClass) {
    EmbeddedBroker own;
    own.declare(ClassDeclaration("Base"));
    own.declare(ClassDeclaration("Other"));
    own.declare(ClassDeclaration("Derived").superclass("Base"));
    own.load(TEST_PROVIDER, "TestProvider", {"Base"});
    Request request(own);
    const std::pair<const char*, CMPIrc> rows[] = {
        {"derived", CMPI_RC_OK}, {"Other", CMPI_RC_ERR_NOT_SUPPORTED}, {"None", CMPI_RC_ERR_INVALID_CLASS}};
    for (const auto& [name, code] : rows) {
        EXPECT_EQ(request.enumerateInstanceNames(request.objectPath("root", name)).code, code) << name;
    }
    EXPECT_EQ(request.enumerateInstanceNames(nullptr).code, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(RequestTest, FromAProviderForAnUnservedClassIsAnsweredAsByAServer) {
    EmbeddedBroker own;
    own.declare(ClassDeclaration("Demo").key("K", CMPI_string).method("Start", CMPI_uint32));
    own.declare(ClassDeclaration("Served"));
    std::string unserved;
    own.setUnservedHandler([&](const std::string& className) { unserved += className + ' '; });
    own.host("Tested", {create<served>}, {"Served"});
    serve = [](const CMPIContext* context, const CMPIResult*, const CMPIObjectPath*) {
        const CMPIBroker* const b = broker;
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPIObjectPath* const demo = CMNewObjectPath(b, "root", "Demo", nullptr);
        const CMPIEnumeration* const lists[] = {
            b->bft->enumerateInstanceNames(b, context, demo, &status),
            b->bft->enumerateInstances(b, context, demo, nullptr, &status),
            b->bft->associatorNames(b, context, demo, nullptr, nullptr, nullptr, nullptr, &status),
            b->bft->references(b, context, demo, nullptr, nullptr, nullptr, &status)};
        for (const CMPIEnumeration* const list : lists) {
            EXPECT_TRUE(list != nullptr && CMHasNext(list, nullptr) == 0);
        }
        EXPECT_EQ(status.rc, CMPI_RC_OK);
        b->bft->getInstance(b, context, demo, nullptr, &status);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
        b->bft->invokeMethod(b, context, demo, "Start", nullptr, nullptr, &status);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_METHOD_NOT_AVAILABLE);
        EXPECT_EQ(b->bft->deleteInstance(b, context, demo).rc, CMPI_RC_ERR_NOT_SUPPORTED);
        demo->ft->setClassName(demo, "None");
        EXPECT_EQ(b->bft->enumerateInstances(b, context, demo, nullptr, &status), nullptr);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_CLASS);
        CMReturn(CMPI_RC_OK);
    };
    Request request(own);
    EXPECT_TRUE(request.enumerateInstanceNames(request.objectPath("root", "Served")).ok());
    EXPECT_EQ(unserved, "Demo Demo Demo Demo Demo Demo Demo None ");
}

TEST_F(RequestTest, SkipsProvidersThatRefuseTheClassOrSentTheRequest) {
    unsigned int calls = 0;
    serve = [&](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) -> CMPIStatus {
        const std::string name = CMGetCharsPtr(CMGetClassName(p, nullptr), nullptr);
        ++calls;
        if (name == "Refused") {
            CMReturn(CMPI_RC_ERR_INVALID_CLASS);
        }
        if (name == "Another" || name == "Own") {
            CMPIEnumeration* const found = broker->bft->enumerateInstanceNames(
                broker, context, CMNewObjectPath(broker, "root", name.c_str(), nullptr), nullptr);
            return CMReturnObjectPath(result, CMGetNext(found, nullptr).value.ref);
        }
        return echo(context, result, p);
    };
    const auto ask = [&](const char* name) {
        calls = 0;
        return request_.enumerateInstanceNames(request_.objectPath("root", name)).code;
    };
    EXPECT_EQ(ask("Refused"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(ask("Own"), CMPI_RC_ERR_INVALID_HANDLE) << "nobody else serves the class";
    EXPECT_EQ(calls, 1U) << "the provider called itself";
    broker_.load(TEST_PROVIDER, "TestProvider");
    EXPECT_EQ(ask("Refused"), CMPI_RC_OK);
    EXPECT_EQ(ask("Another"), CMPI_RC_OK);
    EXPECT_EQ(calls, 1U);
}

TEST_F(RequestTest, ReportsItsProgress) {
    std::vector<std::size_t> counts;
    request_.setProgressHandler([&](std::size_t results) { counts.push_back(results); });
    serve = [&](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        if (counts.empty()) { // the results of the provider's own requests do not count
            CMReturnObjectPath(result, p);
            broker->bft->enumerateInstanceNames(broker, context, p, nullptr);
            CMPIStatus status = {CMPI_RC_OK, nullptr};
            broker->bft->getInstance(broker, context, p, nullptr, &status);
            EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND) << "no instance was returned";
        }
        return echo(context, result, p);
    };
    request_.enumerateInstanceNames(path("Demo"));
    request_.enumerateInstanceNames(path("Demo"));
    EXPECT_EQ(counts, std::vector<std::size_t>({1, 2, 1})) << "each operation counts from 1";
}

TEST_F(RequestTest, ReadsValuesAndPathsFromText) {
    const ThreadLocale german("de_DE.ISO-8859-1"); // which writes 0,1
    broker_.declare(ClassDeclaration("Known").key("U", CMPI_uint8).property("X", CMPI_uint8));
    const struct {
        CMPIType type;
        const char* text;
        const char* answer;
    } rows[] = {
        {CMPI_null, "-12", "sint64 -12"},
        {CMPI_uint8, "-0", "uint8 0"},
        {CMPI_null, "-", "string \"-\""},
        {CMPI_null, "", "string \"\""},
        {CMPI_char16, "65", "char16 65"},
        {CMPI_real64, "0.1", "real64 0.1"},
        {CMPI_real64, "1e300", "real64 1.0e+300"},
        {CMPI_real32, "-3", "real32 -3.0"},
        {CMPI_real64, "nan", "value, column 1: expected a real64"},
        {CMPI_real32, "1e39", "value, column 1: expected a real32"},
        {CMPI_real32, "1.5x", "value, column 4: expected nothing behind the value"},
        {CMPI_dateTime, "now", "value, column 1: expected a datetime"},
        {CMPI_boolean, "1", "value, column 1: expected a boolean"},
        {CMPI_ref, "", "object path, column 1: expected a class name"},
        {CMPI_ref, "Demo.", "object path, column 6: expected a key name"},
        {CMPI_ref, "Demo.K", "object path, column 7: expected '='"},
        {CMPI_ref, "Demo.K=", "object path, column 8: expected a value"},
        {CMPI_ref, "Demo.K=\"\\q\"",
         "object path, column 10: expected \", \\, n, r, t or x after a backslash"},
        {CMPI_ref, "Demo.K=\"\\xD800\"", "object path, column 11: expected the digits of a character"},
        {CMPI_ref, "Demo.K=1,k=2", "object path, column 10: key k stands twice"},
        {CMPI_ref, "Demo.K=1x", "object path, column 8: expected a number"},
        {CMPI_ref, "Demo.K=maybe",
         "object path, column 8: expected a value: a number, a text in quotes, TRUE or FALSE"},
        {CMPI_ref, "Demo.K=18446744073709551616",
         "object path, column 8: 18446744073709551616 does not fit into uint64"},
        {CMPI_ref, "Demo K", "object path, column 5: expected '.'"},
        {CMPI_ref, "Known.U=\"1\"", "object path, column 9: expected a uint8"},
        {CMPI_ref, "Known.X=1", "object path, column 7: class Known has no key X"},
    };
    for (const auto& row : rows) {
        std::string value;
        const std::string error = errorOf([&] {
            const CMPIData data = request_.valueFromText(row.text, row.type);
            value = oxahv::typeName(data.type) + ' ' + oxahv::valueText(data);
        });
        EXPECT_EQ(value.empty() ? error : value, row.answer) << row.text;
    }
    for (const char* const whole :
         {"root:Demo.K=\"a\\\"b\\\\c\"", "root/x:Demo.A=1,B=-2,C=TRUE,D=\"x:y.z=,\"",
          "root:Demo.M=18446744073709551615,N=-9223372036854775808"}) {
        EXPECT_EQ(oxahv::pathText(path(whole)), whole);
    }
}

TEST_F(RequestTest, DeliversKeysInEachMode) {
    CMPIObjectPath* const tooWide = path("Demo.U=256,S=-32769");
    broker_.declare(ClassDeclaration("Demo")
                        .key("U", CMPI_uint8)
                        .key("S", CMPI_sint16)
                        .key("T", CMPI_string)
                        .key("B", CMPI_boolean)
                        .key("R", CMPI_ref));
    const CMPIInstance* instance = CMNewInstance(broker_.handle(), tooWide, nullptr);
    EXPECT_EQ(CMGetProperty(instance, "U", nullptr).type, CMPI_uint64);
    EXPECT_EQ(CMGetProperty(instance, "S", nullptr).type, CMPI_sint64);
    const char* const text = "root:Demo.U=200,S=-5,T=\"t\",B=TRUE,R=\"Demo.U=1\"";
    const std::pair<KeyMode, std::vector<CMPIType>> rows[] = {
        {KeyMode::exact, {CMPI_uint8, CMPI_sint16, CMPI_string, CMPI_boolean, CMPI_ref, CMPI_uint8}},
        {KeyMode::untyped, {CMPI_uint64, CMPI_sint64, CMPI_string, CMPI_boolean, CMPI_ref, CMPI_uint64}},
        {KeyMode::chars, {CMPI_uint8, CMPI_sint16, CMPI_chars, CMPI_boolean, CMPI_ref, CMPI_uint8}},
        {KeyMode::signedIntegers,
         {CMPI_keyInteger, CMPI_keyInteger, CMPI_keyString, CMPI_keyBoolean, CMPI_ref, CMPI_keyInteger}},
        {KeyMode::text, {CMPI_string, CMPI_string, CMPI_string, CMPI_boolean, CMPI_ref, CMPI_string}},
    };
    for (const auto& [mode, expected] : rows) {
        broker_.setKeyMode(mode);
        const CMPIObjectPath* const delivered = request_.deliver(path(text));
        EXPECT_EQ(oxahv::pathText(delivered),
                  mode == KeyMode::text ? R"(root:Demo.U="200",S="-5",T="t",B=TRUE,R="Demo.U=\"1\"")" : text);
        std::vector<CMPIType> types;
        CMPIData key = {};
        for (CMPICount i = 0; i < CMGetKeyCount(delivered, nullptr); ++i) {
            key = CMGetKeyAt(delivered, i, nullptr, nullptr);
            types.push_back(key.type);
        }
        types.push_back(CMGetKeyAt(key.value.ref, 0, nullptr, nullptr).type);
        EXPECT_EQ(types, expected);
        instance = CMNewInstance(broker_.handle(), delivered, nullptr);
        EXPECT_EQ(textOf(instance, "S"), "-5");
        EXPECT_EQ(CMGetProperty(instance, "S", nullptr).type, CMPI_sint16) << "as it is declared";
        EXPECT_EQ(CMGetProperty(instance, "T", nullptr).type, CMPI_string);
        EXPECT_EQ(oxahv::pathText(CMGetObjectPath(instance, nullptr)).rfind("root:Demo.U=200,S=-5,", 0), 0U);
    }
}

TEST_F(RequestTest, DeliversLargeKeysAsSignedIntegersWithTheSameBits) {
    broker_.declare(ClassDeclaration("Demo").key("U", CMPI_uint64));
    broker_.setKeyMode(KeyMode::signedIntegers);
    const CMPIObjectPath* const delivered = request_.deliver(path("Demo.U=18446744073709551615"));
    EXPECT_EQ(CMGetKey(delivered, "U", nullptr).value.sint64, -1);
    EXPECT_EQ(textOf(CMNewInstance(broker_.handle(), delivered, nullptr), "U"), "18446744073709551615");
}

TEST_F(RequestTest, DeliversPathsWithOtherOrderCaseAndHost) {
    broker_.declare(ClassDeclaration("Demo").key("Aa", CMPI_uint8).key("R", CMPI_ref));
    broker_.setPathDelivery({true, true, "a.example"});
    const CMPIObjectPath* const delivered = request_.deliver(path("root:Demo.Aa=1,R=\"x:Other.b_1=2,C=3\""));
    EXPECT_EQ(oxahv::pathText(delivered), R"(root:Demo.r="x:Other.c=3,B_1=2",aA=1)");
    const CMPIObjectPath* const referred = CMGetKey(delivered, "R", nullptr).value.ref;
    for (const CMPIObjectPath* const changed : {delivered, referred}) {
        EXPECT_STREQ(CMGetCharsPtr(CMGetHostname(changed, nullptr), nullptr), "a.example");
    }
}

TEST_F(RequestTest, LeavesKeysOfBareInstancesToTheProvider) {
    broker_.declare(ClassDeclaration("Demo").key("U", CMPI_uint8));
    broker_.setNewInstances(oxahv::NewInstances::bare);
    CMPIInstance* const instance = CMNewInstance(broker_.handle(), path("Demo.U=1"), nullptr);
    instance->ft->setObjectPath(instance, path("root:Demo.U=2"));
    EXPECT_EQ(textOf(instance, "U"), "NULL");
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(instance, nullptr)), "root:Demo.U=2");
}

TEST_F(RequestTest, MeetsInjectedFaultsAndIsRecorded) {
    CMPIObjectPath* const demo = path("Demo.A=1,B=2");
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    broker_.injectFault("getKeyAt", {CMPI_RC_ERR_ACCESS_DENIED, false, 0, 2, 2});
    broker_.startRecording();
    std::vector<CMPIrc> codes;
    for (int i = 0; i < 4; ++i) {
        CMGetKeyAt(demo, 0, nullptr, &status);
        codes.push_back(status.rc);
    }
    EXPECT_EQ(codes, std::vector<CMPIrc>(
                         {CMPI_RC_OK, CMPI_RC_ERR_ACCESS_DENIED, CMPI_RC_ERR_ACCESS_DENIED, CMPI_RC_OK}));
    const std::vector<oxahv::Call> calls = broker_.stopRecording();
    EXPECT_EQ(calls.size(), codes.size());
    EXPECT_EQ(calls.at(3).entryStatus.rc, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(calls.at(2).code, CMPI_RC_ERR_ACCESS_DENIED);

    const auto faultyKey = [&](const oxahv::Fault& fault) {
        broker_.injectFault("getKey", fault);
        return CMGetKey(demo, "A", &status);
    };
    CMPIData key = faultyKey({CMPI_RC_OK, true, CMPI_badValue});
    EXPECT_EQ(key.state, CMPI_keyValue | CMPI_badValue);
    EXPECT_TRUE(key.type == CMPI_uint64 && key.value.uint64 == 0 && status.rc == CMPI_RC_OK);
    key = faultyKey({CMPI_RC_ERR_FAILED, false, CMPI_badValue});
    EXPECT_EQ(key.state, CMPI_nullValue | CMPI_badValue);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
    broker_.clearFaults();
    broker_.injectFault("*", {CMPI_RC_ERR_FAILED, false, 0, 1, 2});
    EXPECT_EQ(CMAddKey(demo, "C", "x", CMPI_chars).rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(CMGetClassName(demo, &status), nullptr);
    EXPECT_EQ(CMGetKeyCount(demo, &status), 2U) << "a call that fails does nothing";
    broker_.injectFault("freeString", {CMPI_RC_OK, true});
    CMPIString* const kept = CMNewString(broker, "text", nullptr);
    broker->mft->freeString(broker, kept);
    EXPECT_STREQ(CMGetCharsPtr(kept, nullptr), "text") << "the call is left out";
    broker_.startRecording();
    CMNewObjectPath(broker, "", "Demo", nullptr);
    broker->bft->associatorNames(broker, request_.context(), demo, "A", "B", "C", "D", nullptr);
    std::string texts;
    for (const oxahv::Call& call : broker_.stopRecording()) {
        texts += call.name + '|' + call.secondName + ' ';
    }
    EXPECT_EQ(texts, "|Demo A|B ");
    EXPECT_EQ(errorOf([&] { broker_.injectFault("setProperty", {}); }),
              "slot setProperty is one of several: CMPIBrokerFT.setProperty, CMPIInstanceFT.setProperty");
}

TEST_F(RequestTest, CanBeAnsweredByAnAttachedThread) {
    serve = [this](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        CMPIContext* const prepared = broker->bft->prepareAttachThread(broker, context);
        std::thread([&] {
            EXPECT_EQ(broker->bft->attachThread(broker, prepared).rc, CMPI_RC_OK);
            EXPECT_EQ(textOf(prepared, CMPIInitNameSpace), "\"root\"");
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

// The destructors of a thread's own values may still call the broker; a sanitizer sees what they must not
// touch.
TEST_F(RequestTest, SurvivesAThreadThatEndsAttached) {
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

// A sanitizer sees whether the thread's end touches objects of the destroyed broker.
TEST(AttachedThreadTest, CanOutliveTheBroker) {
    auto shortLived = std::make_unique<EmbeddedBroker>();
    const CMPIBroker* const handle = shortLived->handle();
    std::promise<void> attached;
    std::promise<void> gone;
    std::thread thread([&] {
        {
            Request request(*shortLived);
            handle->bft->attachThread(handle, request.context());
            CMNewString(handle, "text", nullptr);
        }
        attached.set_value();
        gone.get_future().wait();
    });
    attached.get_future().wait();
    EXPECT_EQ(shortLived->liveObjects().strings, 1U);
    shortLived.reset();
    gone.set_value();
    thread.join();
}

TEST_F(RequestTest, EndsWhenTheProviderExitsItsThread) {
    serve = [](auto&&...) -> CMPIStatus {
        broker->xft->exitThread(&serve);
        return {CMPI_RC_OK, nullptr};
    };
    const auto send = [](void* parameter) -> void* {
        Request request(*static_cast<EmbeddedBroker*>(parameter));
        request.getInstance(request.objectPath("root", "Demo"));
        return nullptr;
    };
    const std::size_t before = broker_.liveObjects().total();
    CMPI_THREAD_RETURN returned = nullptr;
    EXPECT_EQ(broker->xft->joinThread(broker->xft->newThread(send, &broker_, 0), &returned), 0);
    EXPECT_EQ(returned, &serve);
    EXPECT_EQ(broker_.liveObjects().total(), before);
}

TEST_F(RequestTest, DelaysTheUnloadOfItsProvider) {
    std::promise<void> entered;
    std::promise<void> mayLeave;
    std::atomic<bool> hasEnded{false};
    atEnd = [&](auto*) { hasEnded = true; };
    serve = [&](auto&&...) {
        entered.set_value();
        mayLeave.get_future().wait();
        EXPECT_FALSE(hasEnded);
        return CMPIStatus{CMPI_RC_OK, nullptr};
    };
    const auto inside = std::async(std::launch::async, [this] {
        Request request(broker_);
        EXPECT_TRUE(request.getInstance(request.objectPath("root", "Demo")).ok());
    });
    entered.get_future().wait();
    const auto unloading = std::async(std::launch::async, [&] {
        broker_.unload("Tested");
        EXPECT_TRUE(hasEnded) << "unload returned too early";
    });
    while (request_.deleteInstance(path("Demo")).message.empty()) {
        std::this_thread::yield(); // until there is no provider; of this one the slot is empty
    }
    mayLeave.set_value();
}

TEST_F(RequestTest, MayRunWhileTheBrokerIsSetUp) {
    serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        CMAddContextEntry(context, "Entry", "text", CMPI_chars);
        return CMReturnInstance(result, CMNewInstance(broker, p, nullptr));
    };
    broker_.declare(ClassDeclaration("Demo").key("K", CMPI_uint8));
    std::atomic<bool> isOver{false};
    const auto send = [&] {
        while (!isOver) {
            Request request(broker_);
            const CMPIrc code = request.getInstance(request.objectPathFromText("Demo.K=1", "root")).code;
            EXPECT_TRUE(code == CMPI_RC_OK || code == CMPI_RC_ERR_INVALID_HANDLE) << oxahv::codeName(code);
        }
    };
    std::vector<std::future<void>> clients;
    for (int t = 0; t < 3; ++t) {
        clients.push_back(std::async(std::launch::async, send));
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
}

TEST(HostingTest, LoadsAndUnloadsLibraries) {
    EmbeddedBroker own;
    const std::pair<const char*, const char*> rows[] = {
        {"TestProvider", "no error"},
        {"TestProvider", "a provider TestProvider is hosted already"},
        {"Generic", "no error"},
        {"Throws", "provider Throws: its factory threw: no provider"},
        {"ThrowsANumber", "provider ThrowsANumber: its factory threw an exception of an unknown kind"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(errorOf([&] { own.load(TEST_PROVIDER, row.first); }), row.second);
    }
    own.unload("TestProvider");
    EXPECT_EQ(errorOf([&] { own.unload("TestProvider"); }), "no provider TestProvider is hosted");
    EXPECT_EQ(errorOf([&] { own.host("Empty", {}); }), "provider Empty has no factory");
}

TEST(HostingTest, LetsAProviderSendRequestsWhileItEnds) {
    std::vector<CMPIrc> answers;
    atEnd = [&](const CMPIContext* context) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Other", nullptr);
        broker->bft->enumerateInstanceNames(broker, context, path, &status);
        answers.push_back(status.rc);
        EXPECT_EQ(textOf(context, "StateFile"), "\"/a/file\"");
    };
    {
        EmbeddedBroker own;
        own.setContextEntry("StateFile", "/a/file");
        own.host("Ending", {create<served>}, {"Ending"});
        own.load(TEST_PROVIDER, "TestProvider", {"Other"});
        own.unload("Ending");
        own.host("Ending", {create<served>}, {"Ending"});
        own.unload("TestProvider");
        own.load(TEST_PROVIDER, "TestProvider", {"Other"});
    }
    EXPECT_EQ(answers, std::vector<CMPIrc>(2, CMPI_RC_OK));
}

TEST(HostingTest, EndsWhenAFactoryExitsItsThread) {
    EmbeddedBroker own;
    const auto host = [](void* parameter) -> void* {
        oxahv::ProviderFactories factories{create<served>};
        factories.method = [](const CMPIBroker* b, const CMPIContext*, CMPIStatus*) -> CMPIMethodMI* {
            b->xft->exitThread(&serve);
            return nullptr;
        };
        static_cast<EmbeddedBroker*>(parameter)->host("Ending", factories);
        return nullptr;
    };
    bool hasEnded = false;
    atEnd = [&](auto&&...) { hasEnded = true; };
    CMPI_THREAD_RETURN returned = nullptr;
    EXPECT_EQ(own.handle()->xft->joinThread(own.handle()->xft->newThread(host, &own, 0), &returned), 0);
    atEnd = nullptr;
    EXPECT_EQ(returned, &serve);
    EXPECT_TRUE(hasEnded) << "the instance MI was there already";
    EXPECT_EQ(own.liveObjects().total(), 0U);
    own.host("Ending", {create<served>}); // the name is free
}

// The broker runs a cleanup on a thread of its own, which the cleanup may end.
TEST(HostingTest, SurvivesACleanupThatExitsItsThread) {
    int ended = 0;
    atEnd = [&](auto&&...) {
        ++ended;
        CMNewString(broker, "left", nullptr);
        broker->xft->exitThread(nullptr);
    };
    {
        EmbeddedBroker own;
        own.host("Ending", {create<served>});
        own.unload("Ending");
        EXPECT_EQ(own.liveObjects().total(), 0U);
        own.host("Ending", {create<served>});
    }
    atEnd = nullptr;
    EXPECT_EQ(ended, 2);
}

TEST(CodeTest, IsFoundByNameOrNumber) {
    for (const char* const name : {"err_not_found", "CMPI_RC_ERR_NOT_FOUND", "6"}) {
        EXPECT_EQ(oxahv::codeName(oxahv::codeFromName(name)), "CMPI_RC_ERR_NOT_FOUND") << name;
    }
    EXPECT_EQ(errorOf([] { oxahv::codeFromName("ERR_NO"); }), "there is no CMPI return code ERR_NO");
}

TEST_F(RequestTest, ReadsAPathWithAHost) {
    const std::string texts[][3] = {
        {"//host.domain:5989/root/cimv2:Demo.Key=\"a:/b\"", "host.domain:5989",
         "root/cimv2:Demo.Key=\"a:/b\""},
        {"//[::1]/root:Demo", "[::1]", "root:Demo"},
        {"root:Demo.Key=\"//x/y:z\"", "", "root:Demo.Key=\"//x/y:z\""},
    };
    for (const auto& [text, host, rest] : texts) {
        const CMPIObjectPath* const read = path(text);
        EXPECT_EQ(CMGetCharsPtr(CMGetHostname(read, nullptr), nullptr), host);
        EXPECT_EQ(oxahv::pathText(read), rest);
    }
    const std::pair<std::string, const char*> wrong[] = {
        {"///root:Demo", "column 3: expected a host"},
        {"//host", "column 3: expected a slash and a namespace after the host"},
        {"//host/Demo.Key=1", "column 8: expected a namespace and a colon after the host"},
    };
    for (const auto& [text, error] : wrong) {
        const std::string& whole = text;
        EXPECT_EQ(errorOf([&] { path(whole); }), std::string("object path, ") + error);
    }
}
