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
std::function<CMPIStatus(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)> serve;
std::function<void(const CMPIContext*)> atEnd;
const CMPIBroker* broker = nullptr;

template <class... Rest>
CMPIStatus serveAny(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                    const CMPIObjectPath* path, Rest...) {
    return serve(context, result, path);
}

CMPIStatus end(CMPIInstanceMI*, const CMPIContext* context, CMPIBoolean) {
    if (atEnd) {
        atEnd(context);
    }
    CMReturn(CMPI_RC_OK);
}

CMPIInstanceMI* createInstanceMI(const CMPIBroker* theBroker, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.cleanup = end;
    table.enumerateInstanceNames = serveAny;
    table.getInstance = serveAny;
    broker = theBroker;
    return &mi;
}

// Returns the path of the request.
CMPIStatus echo(const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path) {
    CMReturnObjectPath(result, path);
    return CMReturnDone(result);
}

// A provider that notes what it is asked for, with all arguments, and answers with an instance of the path,
// or the path itself where that is asked for.
std::string asked;

void note(const char* text) {
    asked += text != nullptr ? text + std::string(" ") : "- ";
}
void note(const char** list) {
    for (; *list != nullptr; ++list) {
        note(*list);
    }
}
void note(const CMPIInstance* instance) {
    note(oxahv::valueText(CMGetProperty(instance, "K", nullptr)).c_str());
}
void note(const CMPIArgs* in) {
    note(oxahv::valueText(CMGetArg(in, "In", nullptr)).c_str());
}
void note(CMPIArgs* out) {
    CMAddArg(out, "Out", "value", CMPI_chars);
}

enum Operation { names, list, get, create, modify, remove, query, method, ends, endNames, links, linkNames };

template <Operation operation, class MI, class... Rest>
CMPIStatus noting(MI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                  Rest... rest) {
    asked += std::to_string(operation) + ' ';
    (note(rest), ...);
    const bool isPath =
        operation == names || operation == create || operation == endNames || operation == linkNames;
    return isPath ? CMReturnObjectPath(result, path)
                  : CMReturnInstance(result, CMNewInstance(broker, path, nullptr));
}

CMPIInstanceMI* createNotingInstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstanceNames = noting<names>;
    table.enumerateInstances = noting<list>;
    table.getInstance = noting<get>;
    table.createInstance = noting<create>;
    table.modifyInstance = noting<modify>;
    table.deleteInstance = noting<remove>;
    table.execQuery = noting<query>;
    return &mi;
}

CMPIAssociationMI* createNotingAssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIAssociationMIFT table = {};
    static CMPIAssociationMI mi = {nullptr, &table};
    table.associators = noting<ends>;
    table.associatorNames = noting<endNames>;
    table.references = noting<links>;
    table.referenceNames = noting<linkNames>;
    return &mi;
}

CMPIMethodMI* createNotingMethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIMethodMIFT table = {};
    static CMPIMethodMI mi = {nullptr, &table};
    table.invokeMethod = noting<method>;
    return &mi;
}

class ARequest : public testing::Test {
protected:
    ARequest() {
        serve = echo;
        broker_.host("Tested", {createInstanceMI});
    }
    ~ARequest() override { atEnd = nullptr; }

    CMPIObjectPath* path(const std::string& text) { return request_.objectPathFromText(text, "root"); }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

} // namespace

TEST_F(ARequest, ReachesTheProviderAndBringsItsResultsBack) {
    broker_.setContextEntry("StateFile", "earlier");
    broker_.setContextEntry("StateFile", "/a/file");
    Request request(broker_);
    CMPIObjectPath* const demo = path("Demo.Key=\"text\"");
    EXPECT_EQ(oxahv::pathText(request.enumerateInstanceNames(demo).objectPaths.at(0)),
              "root:Demo.Key=\"text\"");
    serve = [](const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* p) {
        const std::pair<const char*, const char*> entries[] = {{CMPIInitNameSpace, "\"root\""},
                                                               {CMPIPrincipal, "\"\""},
                                                               {CMPIInvocationFlags, "0"},
                                                               {"StateFile", "\"/a/file\""}};
        for (const auto& [name, value] : entries) {
            EXPECT_EQ(oxahv::valueText(CMGetContextEntry(context, name, nullptr)), value);
        }
        CMPIInstance* const instance = CMNewInstance(broker, p, nullptr);
        const CMPIStatus status = CMReturnInstance(result, instance);
        CMSetProperty(instance, "Late", "x", CMPI_chars); // what was returned is a copy
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
    const Reply other = request.invokeMethod(demo, "Other", nullptr);
    EXPECT_EQ(other.code, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(other.message, "class Demo has no method Other");
}

TEST_F(ARequest, CanBeSentByAProvider) {
    const CMPIBroker* const b = broker_.handle();
    const CMPIContext* const context = request_.context();
    broker_.host("Noting", {createNotingInstanceMI, createNotingAssociationMI, createNotingMethodMI},
                 {"Asked"});
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
    EXPECT_EQ(oxahv::valueText(CMGetArg(out, "Out", nullptr)), "\"value\"");
    EXPECT_EQ(b->bft->getProperty(b, context, p, "K", &status).value.uint64, 1U);
    EXPECT_EQ(b->bft->setProperty(b, context, p, "K", &two, CMPI_uint64).rc, CMPI_RC_OK);
    EXPECT_EQ(asked,
              "0 1 P Q 2 P Q 3 1 6 select WQL 8 Asked B C D P Q 9 Asked B C D 10 Asked B P Q 11 Asked - "
              "4 1 P Q 5 7 Start \"x\" 2 K 4 2 K ");
    b->bft->invokeMethod(b, context, p, "Start", in, reinterpret_cast<CMPIArgs*>(p), &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(request_.invokeMethod(p, "Start", reinterpret_cast<CMPIArgs*>(p)).code,
              CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ARequest, ForAMethodHasTheArgumentsThatItsClassDeclares) {
    broker_.host("Noting", {nullptr, nullptr, createNotingMethodMI}, {"Asked"});
    broker_.declare(ClassDeclaration("Asked").method(
        "Start", CMPI_uint32,
        {{"In", CMPI_string}, {"Number", CMPI_uint8A}, {"Out", CMPI_string, "", false, true}}));
    const auto messageOf = [&](const char* name, const void* value, CMPIType type) {
        CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
        CMAddArg(in, name, value, type);
        const Reply reply = request_.invokeMethod(path("Asked"), "start", in);
        EXPECT_TRUE(reply.code == CMPI_RC_OK || reply.code == CMPI_RC_ERR_INVALID_PARAMETER);
        return reply.message;
    };
    EXPECT_EQ(messageOf("IN", "text", CMPI_chars), "");
    EXPECT_EQ(messageOf("Number", nullptr, CMPI_null), "");
    EXPECT_EQ(messageOf("Number", "text", CMPI_chars), "argument Number of method Start is no uint8[]");
    EXPECT_EQ(messageOf("Out", "text", CMPI_chars), "method Start takes no argument Out");
    EXPECT_EQ(messageOf("Else", "text", CMPI_chars), "method Start takes no argument Else");
}

TEST_F(ARequest, ReportsWhatTheProviderReports) {
    serve = [](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*) {
        const CMPIError* const error = broker->eft->newCMPIError(
            broker, "o", "i", "told", ErrorSevLow, ErrorProbCauseOther, CMPI_RC_ERR_NOT_FOUND, nullptr);
        return result->ft->returnError(result, error);
    };
    const Reply reply = request_.getInstance(path("Demo"));
    EXPECT_EQ(reply.code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(reply.message, "told");
    serve = [](auto&&...) -> CMPIStatus { throw std::runtime_error("lost"); };
    EXPECT_EQ(request_.getInstance(path("Demo")).message, "exception: lost");
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
            std::string message;
            try {
                own.load(TEST_PROVIDER, "TestProvider");
                Request request(own);
                request.getInstance(request.objectPath("root", "Demo"));
                message = request_.getInstance(request_.objectPath("root", "Demo")).message;
                own.unload("TestProvider");
            } catch (const std::bad_alloc&) {
                message = "no room";
            } catch (const BrokerError&) {
                message = "no status"; // of a factory
            }
            isReached = failing::ended();
            EXPECT_NE(message.rfind("exception", 0), 0U) << "not the provider's: " << message;
        }
        EXPECT_EQ(::dlopen(TEST_PROVIDER, RTLD_NOW | RTLD_NOLOAD), nullptr) << "no library stays behind";
    }
}

TEST_F(ARequest, FindsItsProviderByClass) {
    EmbeddedBroker own;
    for (const char* const name : {"Base", "Other"}) {
        own.declare(ClassDeclaration(name));
    }
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

// Of an upcall for a class that nobody serves.
TEST_F(ARequest, IsAnsweredAsByAServerWhereNobodyServesTheClass) {
    EmbeddedBroker own;
    own.declare(ClassDeclaration("Demo").key("K", CMPI_string).method("Start", CMPI_uint32));
    own.declare(ClassDeclaration("Served"));
    std::string unserved;
    own.setUnservedHandler([&](const std::string& className) { unserved += className + ' '; });
    own.host("Tested", {createInstanceMI}, {"Served"});
    serve = [](const CMPIContext* context, const CMPIResult*, const CMPIObjectPath*) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPIObjectPath* const demo = CMNewObjectPath(broker, "root", "Demo", nullptr);
        const CMPIEnumeration* const lists[] = {
            broker->bft->enumerateInstanceNames(broker, context, demo, &status),
            broker->bft->enumerateInstances(broker, context, demo, nullptr, &status),
            broker->bft->associatorNames(broker, context, demo, nullptr, nullptr, nullptr, nullptr, &status),
            broker->bft->references(broker, context, demo, nullptr, nullptr, nullptr, &status)};
        for (const CMPIEnumeration* const list : lists) {
            EXPECT_TRUE(list != nullptr && CMHasNext(list, nullptr) == 0);
        }
        EXPECT_EQ(status.rc, CMPI_RC_OK);
        broker->bft->getInstance(broker, context, demo, nullptr, &status);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
        broker->bft->invokeMethod(broker, context, demo, "Start", nullptr, nullptr, &status);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_METHOD_NOT_AVAILABLE);
        EXPECT_EQ(broker->bft->deleteInstance(broker, context, demo).rc, CMPI_RC_ERR_NOT_SUPPORTED);
        demo->ft->setClassName(demo, "None");
        EXPECT_EQ(broker->bft->enumerateInstances(broker, context, demo, nullptr, &status), nullptr);
        EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_CLASS);
        CMReturn(CMPI_RC_OK);
    };
    Request request(own);
    EXPECT_TRUE(request.enumerateInstanceNames(request.objectPath("root", "Served")).ok());
    EXPECT_EQ(unserved, "Demo Demo Demo Demo Demo Demo Demo None ");
}

// Without a list of classes: whoever does not refuse the class, and not who calls up.
TEST_F(ARequest, FindsItsProviderAmongThoseThatServeAll) {
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
    EXPECT_EQ(ask("Own"), CMPI_RC_ERR_INVALID_HANDLE) << "the upcall found nobody but its caller";
    EXPECT_EQ(calls, 1U) << "and did not run for ever";
    broker_.load(TEST_PROVIDER, "TestProvider");
    EXPECT_EQ(ask("Refused"), CMPI_RC_OK);
    EXPECT_EQ(ask("Another"), CMPI_RC_OK);
    EXPECT_EQ(calls, 1U);
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
    request_.enumerateInstanceNames(path("Demo"));
    EXPECT_EQ(counts, std::vector<std::size_t>({1, 2, 1})) << "each operation counts for itself";
}

TEST_F(ARequest, ReadsValuesAndPathsAndSaysWhatIsWrongWithThem) {
    const ThreadLocale german("de_DE.ISO-8859-1"); // which writes 0,1
    broker_.declare(ClassDeclaration("Known").key("U", CMPI_uint8).property("X", CMPI_uint8));
    const struct {
        const char* text;
        CMPIType type;
        const char* answer;
    } rows[] = {
        {"-12", CMPI_null, "sint64 -12"},
        {"-0", CMPI_uint8, "uint8 0"},
        {"-", CMPI_null, "string \"-\""},
        {"", CMPI_null, "string \"\""},
        {"65", CMPI_char16, "char16 65"},
        {"0.1", CMPI_real64, "real64 0.1"},
        {"1e300", CMPI_real64, "real64 1.0e+300"},
        {"-3", CMPI_real32, "real32 -3.0"},
        {"nan", CMPI_real64, "value, column 1: expected a real64"},
        {"1e39", CMPI_real32, "value, column 1: expected a real32"},
        {"1.5x", CMPI_real32, "value, column 4: expected nothing behind the value"},
        {"now", CMPI_dateTime, "value, column 1: expected a datetime"},
        {"1", CMPI_boolean, "value, column 1: expected a boolean"},
        {"", CMPI_ref, "object path, column 1: expected a class name"},
        {"Demo.", CMPI_ref, "object path, column 6: expected a key name"},
        {"Demo.K", CMPI_ref, "object path, column 7: expected '='"},
        {"Demo.K=", CMPI_ref, "object path, column 8: expected a value"},
        {"Demo.K=\"\\q\"", CMPI_ref, "object path, column 10: expected \", \\, n, r, t or x after a backslash"},
        {"Demo.K=\"\\xD800\"", CMPI_ref, "object path, column 11: expected the digits of a character"},
        {"Demo.K=1,k=2", CMPI_ref, "object path, column 10: key k stands twice"},
        {"Demo.K=1x", CMPI_ref, "object path, column 8: expected a number"},
        {"Demo.K=maybe", CMPI_ref,
         "object path, column 8: expected a value: a number, a text in quotes, TRUE or FALSE"},
        {"Demo.K=18446744073709551616", CMPI_ref,
         "object path, column 8: 18446744073709551616 does not fit into uint64"},
        {"Demo K", CMPI_ref, "object path, column 5: expected '.'"},
        {"Known.U=\"1\"", CMPI_ref, "object path, column 9: expected a uint8"},
        {"Known.X=1", CMPI_ref, "object path, column 7: class Known has no key X"},
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

TEST_F(ARequest, DeliversKeysAsTheModeSays) {
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
        const CMPIData number = CMGetProperty(instance, "S", nullptr);
        EXPECT_EQ(oxahv::typeName(number.type) + oxahv::valueText(number), "sint16-5") << "as it is declared";
        EXPECT_EQ(CMGetProperty(instance, "T", nullptr).type, CMPI_string);
        EXPECT_EQ(oxahv::pathText(CMGetObjectPath(instance, nullptr)).rfind("root:Demo.U=200,S=-5,", 0), 0U);
    }
}

TEST_F(ARequest, KeepsTheBitsOfAKeyThatSignedIntegersDoNotHold) {
    broker_.declare(ClassDeclaration("Demo").key("U", CMPI_uint64));
    broker_.setKeyMode(KeyMode::signedIntegers);
    const CMPIObjectPath* const delivered = request_.deliver(path("Demo.U=18446744073709551615"));
    EXPECT_EQ(CMGetKey(delivered, "U", nullptr).value.sint64, -1);
    const CMPIInstance* const instance = CMNewInstance(broker_.handle(), delivered, nullptr);
    EXPECT_EQ(oxahv::valueText(CMGetProperty(instance, "U", nullptr)), "18446744073709551615");
}

TEST_F(ARequest, DeliversPathsAsServersAndClientsChangeThem) {
    broker_.declare(ClassDeclaration("Demo").key("Aa", CMPI_uint8).key("R", CMPI_ref));
    broker_.setPathDelivery({true, true, "a.example"});
    const CMPIObjectPath* const delivered = request_.deliver(path("root:Demo.Aa=1,R=\"x:Other.b_1=2,C=3\""));
    EXPECT_EQ(oxahv::pathText(delivered), R"(root:Demo.r="x:Other.c=3,B_1=2",aA=1)");
    const CMPIObjectPath* const referred = CMGetKey(delivered, "R", nullptr).value.ref;
    for (const CMPIObjectPath* const changed : {delivered, referred}) {
        EXPECT_STREQ(CMGetCharsPtr(CMGetHostname(changed, nullptr), nullptr), "a.example");
    }
}

TEST_F(ARequest, LeavesTheKeysOfABareInstanceToItsProvider) {
    broker_.declare(ClassDeclaration("Demo").key("U", CMPI_uint8));
    broker_.setNewInstances(oxahv::NewInstances::bare);
    CMPIInstance* const instance = CMNewInstance(broker_.handle(), path("Demo.U=1"), nullptr);
    instance->ft->setObjectPath(instance, path("root:Demo.U=2"));
    EXPECT_EQ(oxahv::valueText(CMGetProperty(instance, "U", nullptr)), "NULL");
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(instance, nullptr)), "root:Demo.U=2");
}

TEST_F(ARequest, MeetsTheFaultsThatAreInjectedAndIsRecorded) {
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

// A sanitizer sees the thread's end touch the objects of the broker that is gone.
TEST(AnAttachedThread, OutlivesItsBroker) {
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

TEST_F(ARequest, EndsWithTheThreadThatItsProviderEnds) {
    serve = [](auto&&...) -> CMPIStatus {
        broker->xft->exitThread(&serve);
        return {CMPI_RC_OK, nullptr};
    };
    const auto send = [](void* parameter) -> void* {
        auto* const own = static_cast<EmbeddedBroker*>(parameter);
        Request request(*own);
        request.getInstance(request.objectPath("root", "Demo"));
        return nullptr;
    };
    const std::size_t before = broker_.liveObjects().total();
    CMPI_THREAD_RETURN returned = nullptr;
    EXPECT_EQ(broker->xft->joinThread(broker->xft->newThread(send, &broker_, 0), &returned), 0);
    EXPECT_EQ(returned, &serve);
    EXPECT_EQ(broker_.liveObjects().total(), before);
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

TEST_F(ARequest, RunsWhileTheBrokerIsSetUp) {
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

TEST(Hosting, LoadsAndUnloadsLibraries) {
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

TEST(Hosting, ServesAProviderThatIsWrittenInC) {
    EmbeddedBroker own;
    own.load(C_PROVIDER, "CProvider");
    Request request(own);
    CMPIObjectPath* const path = request.objectPathFromText("root:Demo.Key=\"text\",Number=7", "");
    const std::vector<std::string> properties = {"Array", "Date"};
    const Reply all = request.enumerateInstances(path, &properties);
    ASSERT_EQ(all.instances.size(), 1U) << oxahv::codeName(all.code);
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(all.instances[0], nullptr)), oxahv::pathText(path));
    const auto property = [&](const char* name) {
        return oxahv::valueText(CMGetProperty(all.instances[0], name, nullptr));
    };
    EXPECT_EQ(property("Array") + property("Date"), "{7}\"20240229120000.000000+000\"");
    EXPECT_EQ(property("Text"), "NULL") << "not asked for";
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

TEST(ACode, IsFoundByItsNameOrNumber) {
    for (const char* const name : {"err_not_found", "CMPI_RC_ERR_NOT_FOUND", "6"}) {
        EXPECT_EQ(oxahv::codeName(oxahv::codeFromName(name)), "CMPI_RC_ERR_NOT_FOUND") << name;
    }
    EXPECT_EQ(errorOf([] { oxahv::codeFromName("ERR_NO"); }), "there is no CMPI return code ERR_NO");
}
