// Requests that a provider of the kit serves: instances, associations, methods, and whatever fails below it.

#include "FailureWays.h"
#include "KitProbe.h"
#include "TestLocales.h"

#include <atomic>
#include <clocale>
#include <langinfo.h>
#include <pthread.h>
#include <thread>

using oxahv::Instance;
using oxahv::Instances;
using oxahv::KeyMode;
using oxahv::Operation;
using oxahv::Path;
using oxahv::Reply;
using oxahv::Request;

namespace {

Path item(const Operation& operation, const char* name, int number) {
    return operation.path("Kit_Item", {{"Name", name}, {"Number", number}});
}

void listItems(const Operation& operation, Instances& reply) {
    if (!operation.isFor("Kit_Item")) {
        throw oxahv::Refusal(CMPI_RC_ERR_INVALID_CLASS, "no items");
    }
    const std::wstring note = L"\u00fc\u20ac";
    reply.add(
        operation.instance("Kit_Item", {{"Name", "one"}, {"Number", 1}}).set("Size", 1).set("Note", note));
    reply.add(operation.instance(item(operation, "two", 2)).set("Size", 2));
}

TK::DateTime zonedDate() {
    TK::DateTime date("2023-11-15 03:58:20", 3);
    date.setOffset(-345);
    return date;
}

// one - two by Kit_Link, two - one by Kit_OwnLink, and one - one.
void listLinks(const Operation& operation, Instances& reply) {
    const Path one = item(operation, "one", 1);
    const Path two = item(operation, "two", 2);
    reply.add(operation.instance("Kit_Link", {{"Left", one}, {"Right", two}}).set("Note", "a"));
    reply.add(operation.instance("Kit_OwnLink", {{"Left", two}, {"Right", one}}).set("Note", "b"));
    reply.add(operation.instance("Kit_Link", {{"Left", one}, {"Right", one}}).set("Note", "c"));
}

const char* const onePath = "root/cimv2:Kit_Item.Name=\"one\",Number=1";
const char* const twoPath = "root/cimv2:Kit_Item.Name=\"two\",Number=2";

// What a reply consists of, or its failure.
std::string textOf(const Reply& reply) {
    std::string text;
    for (const CMPIObjectPath* path : reply.objectPaths) {
        text += oxahv::pathText(path) + ' ';
    }
    for (const CMPIInstance* instance : reply.instances) {
        text += '[';
        CMPIString* name = nullptr;
        for (CMPICount i = 0; i < CMGetPropertyCount(instance, nullptr); ++i) {
            const CMPIData data = CMGetPropertyAt(instance, i, &name, nullptr);
            if (!CMIsNullValue(data)) {
                text += std::string(i == 0 ? "" : " ") + CMGetCharsPtr(name, nullptr) + '=' +
                        oxahv::valueText(data);
            }
        }
        text += "] ";
    }
    for (const CMPIData& data : reply.data) {
        text += "returns " + oxahv::valueText(data) + ' ';
    }
    if (reply.out != nullptr) {
        CMPIString* name = nullptr;
        for (CMPICount i = 0; i < CMGetArgCount(reply.out, nullptr); ++i) {
            const CMPIData data = CMGetArgAt(reply.out, i, &name, nullptr);
            text += std::string(CMGetCharsPtr(name, nullptr)) + '=' + oxahv::valueText(data) + ' ';
        }
    }
    return reply.ok() ? text : oxahv::codeName(reply.code) + ' ' + reply.message;
}

} // namespace

class KitRequests : public KitTest {
protected:
    KitRequests() {
        probe.enumerate = listItems;
        probe.associations = listLinks;
    }

    std::string get(const std::string& text, const std::vector<std::string>* properties = nullptr) {
        return textOf(request_.getInstance(path(text), properties));
    }

    CMPIArgs* arguments(std::initializer_list<oxahv::Key> values) {
        CMPIArgs* const in = CMNewArgs(broker_.handle(), nullptr);
        for (const oxahv::Key& value : values) {
            oxahv::detail::ValueAccess::giveArgument(broker_.handle(), in, value.name, value.value);
        }
        return in;
    }
    std::string call(const char* method, const CMPIArgs* in, const char* object = onePath) {
        return textOf(request_.invokeMethod(path(object), method, in));
    }
};

TEST_F(KitRequests, OfInstancesFollowFromAllOfThem) {
    const std::string one = "[Name=\"one\" Number=1 Size=1 Note=\"\u00fc\u20ac\"] ";
    const std::string two = "[Name=\"two\" Number=2 Size=2] ";
    const std::string both = std::string(onePath) + ' ' + twoPath + ' ';
    EXPECT_EQ(textOf(request_.enumerateInstances(path("kit_item"))), one + two);
    EXPECT_TRUE(request_.enumerateInstances(path("Kit_Item")).done);
    EXPECT_EQ(textOf(request_.enumerateInstanceNames(path("Kit_Item"))), both);
    for (const KeyMode mode :
         {KeyMode::exact, KeyMode::untyped, KeyMode::chars, KeyMode::signedIntegers, KeyMode::text}) {
        broker_.setKeyMode(mode);
        EXPECT_EQ(get(onePath), one);
        EXPECT_EQ(get("kit_item.NUMBER=2,NAME=\"two\""), two);
    }
    broker_.setNewInstances(oxahv::NewInstances::bare);
    EXPECT_EQ(get(onePath), one);
    broker_.injectFault("getKey", {CMPI_RC_ERR_NOT_FOUND, false, 0, 1, 0}); // as if names had another case
    EXPECT_EQ(get("kit_item.NUMBER=2,NAME=\"two\""), two);
    broker_.clearFaults();
    const std::vector<std::string> wanted = {"note"};
    EXPECT_EQ(get(onePath, &wanted), "[Name=\"one\" Number=1 Note=\"\u00fc\u20ac\"] ");
    EXPECT_EQ(get(twoPath, &wanted), "[Name=\"two\" Number=2] ");
    const std::string absent = "CMPI_RC_ERR_NOT_FOUND there is no such instance of class Kit_Item";
    EXPECT_EQ(get("Kit_Item.Name=\"one\",Number=2"), absent);
    EXPECT_EQ(get("Kit_Item.Name=\"one\""), absent);
    EXPECT_EQ(get("Kit_Part.Name=\"one\",Number=1"), "CMPI_RC_ERR_INVALID_CLASS no items");
    EXPECT_EQ(textOf(enumerate({})), "CMPI_RC_ERR_NOT_SUPPORTED this provider lists no instances");
}

TEST_F(KitRequests, MayNameAnInstanceWithKeysOfAnyType) {
    oxahv::EmbeddedBroker lenient;
    lenient.host("KitProbe", probeFactories);
    Request request(lenient);
    const auto get = [&](const char* number, CMPIType type, const char* name = "one") {
        CMPIObjectPath* const object = request.objectPath("root/cimv2", "Kit_Item");
        CMAddKey(object, "name", name, CMPI_chars);
        CMAddKey(object, "number", number, type);
        return request.getInstance(object);
    };
    CMPIValue value = {};
    value.sint64 = 1;
    for (const CMPIType type : {CMPIType{CMPI_sint64}, CMPIType{CMPI_uint8}, CMPIType{CMPI_sint32}}) {
        EXPECT_EQ(get(reinterpret_cast<const char*>(&value), type).instances.size(), 1U) << type;
    }
    EXPECT_EQ(get("1", CMPI_chars).instances.size(), 1U);
    EXPECT_EQ(get("1", CMPI_chars, "two").code, CMPI_RC_ERR_NOT_FOUND);
    for (const char* const text : {"x", "", "1x", " 1", "18446744073709551617"}) {
        EXPECT_EQ(get(text, CMPI_chars).code, CMPI_RC_ERR_NOT_FOUND) << text;
    }
    value.boolean = 1;
    EXPECT_EQ(failureOf(get(reinterpret_cast<const char*>(&value), CMPI_boolean)),
              "CMPI_RC_ERR_INVALID_PARAMETER key Number is no integer");
    value.sint64 = -1;
    EXPECT_EQ(get(reinterpret_cast<const char*>(&value), CMPI_sint64).code, CMPI_RC_ERR_NOT_FOUND);
    value.uint64 = ~0ULL;
    EXPECT_EQ(get(reinterpret_cast<const char*>(&value), CMPI_uint64).code, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(KitRequests, MayBeServedByWhatTheProviderOverrides) {
    const CMPIInstance* const sent = CMNewInstance(broker_.handle(), path(onePath), nullptr);
    probe.create = [](const Operation& operation, const Instance& wanted) {
        EXPECT_EQ(wanted.get<std::optional<int>>("size"), std::nullopt);
        return item(operation, wanted.get<std::string>("Name").c_str(), wanted.get<int>("NUMBER") + 1);
    };
    EXPECT_EQ(textOf(request_.createInstance(path("Kit_Item"), sent)),
              "root/cimv2:Kit_Item.Name=\"one\",Number=2 ");
    probe.create = [](const Operation& /*operation*/, const Instance& wanted) -> Path {
        wanted.get<std::uint64_t>("Size");
        throw std::logic_error("not reached");
    };
    EXPECT_EQ(textOf(request_.createInstance(path("Kit_Item"), sent)),
              "CMPI_RC_ERR_INVALID_PARAMETER property Size is NULL");
    EXPECT_EQ(request_.modifyInstance(path(onePath), sent).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.deleteInstance(path(onePath)).code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(request_.execQuery(path("Kit_Item"), "select", "WQL").code, CMPI_RC_ERR_INVALID_QUERY);
}

TEST_F(KitRequests, OfAssociationsFollowFromAllOfThem) {
    const auto names = [&](const char* object, const oxahv::AssociationFilter& filter) {
        return textOf(request_.associatorNames(path(object), filter));
    };
    const auto references = [&](const char* object, const oxahv::AssociationFilter& filter) {
        std::string notes;
        for (const CMPIInstance* link : request_.references(path(object), filter).instances) {
            notes += Instance(broker_.handle(), link).get<std::string>("Note");
        }
        EXPECT_EQ(request_.referenceNames(path(object), filter).objectPaths.size(), notes.size());
        return notes;
    };
    const std::string one = std::string(onePath) + ' ';
    const std::string two = std::string(twoPath) + ' ';
    const struct {
        const char* object;
        oxahv::AssociationFilter filter;
        std::string names;
        const char* references; // the filters that they have
    } cases[] = {
        {onePath, {}, two + two + one, "abc"},
        {twoPath, {}, one + one, "ab"},
        {onePath, {"kit_link", "", "", ""}, two + two + one, "abc"},
        {onePath, {"Kit_OwnLink", "", "", ""}, two, "abc"},
        {onePath, {"", "Kit_Item", "", ""}, two + two + one, "abc"},
        {onePath, {"", "Kit_Part", "", ""}, "", ""},
        {onePath, {"", "", "LEFT", ""}, two + one, "ac"},
        {onePath, {"", "", "Right", ""}, two + one, "bc"},
        {onePath, {"", "", "", "right"}, two + one, "abc"},
        {twoPath, {"Kit_Link", "Kit_Item", "Left", "Right"}, one, "b"},
        {twoPath, {"", "", "Left", "Left"}, "", "b"},
        {"Kit_Item.Name=\"three\",Number=3", {}, "", ""},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(&c - cases);
        EXPECT_EQ(names(c.object, c.filter), c.names);
        EXPECT_EQ(request_.associators(path(c.object), c.filter).instances.size(),
                  request_.associatorNames(path(c.object), c.filter).objectPaths.size());
        if (c.filter.resultClass.empty()) {
            EXPECT_EQ(references(c.object, c.filter), c.references);
        }
    }
    EXPECT_EQ(references(twoPath, {"", "Kit_OwnLink", "", ""}), "b");
    const std::vector<std::string> wanted = {"Size"};
    EXPECT_EQ(textOf(request_.associators(path(twoPath), {"Kit_OwnLink", "", "", ""}, &wanted)),
              "[Name=\"one\" Number=1 Size=1] ");
    probe.associations = nullptr;
    EXPECT_EQ(request_.associators(path(onePath)).code, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(KitRequests, CallMethodsWithTypedArguments) {
    using Bytes = std::uint8_t;
    EXPECT_EQ(call("add", arguments({{"Left", Bytes{2}}, {"Right", std::int16_t{-3}}, {"sum", 10}})),
              "returns 0 Sum=9 ");
    EXPECT_EQ(call("Add", arguments({{"LEFT", Bytes{2}}}), twoPath), "returns 5 Sum=2 ");
    const std::string invalid = "CMPI_RC_ERR_INVALID_PARAMETER argument ";
    EXPECT_EQ(call("Add", arguments({})), invalid + "Left is missing");
    EXPECT_EQ(call("Add", arguments({{"Left", nullptr}})), invalid + "Left is NULL");
    EXPECT_EQ(call("Reset", arguments({})), "CMPI_RC_ERR_INVALID_PARAMETER cannot be reset");
    EXPECT_EQ(call("Unserved", arguments({})),
              "CMPI_RC_ERR_METHOD_NOT_FOUND class Kit_Item has no method Unserved");

    const std::chrono::system_clock::time_point when(std::chrono::seconds(1));
    const std::vector<std::string> values = {"x"};
    EXPECT_EQ(call("Describe", arguments({{"Values", values}, {"When", when}})),
              "returns \"x 1000000\" Text=\"none\" ");
    EXPECT_EQ(call("Describe", arguments({{"Values", values}, {"When", when}, {"Peer", path(twoPath)}})),
              "returns \"x 1000000\" Text=\"\u00fc\" ");

    // A server that does not check the arguments.
    oxahv::EmbeddedBroker lenient;
    lenient.host("KitProbe", probeFactories);
    Request request(lenient);
    const auto callThere = [&](const char* className, const CMPIArgs* in) {
        const auto* object =
            request.objectPathFromText(std::string(className) + ".Name=\"one\"", "root/cimv2");
        return textOf(request.invokeMethod(object, "Add", in));
    };
    EXPECT_EQ(callThere("Kit_Item", arguments({{"Left", 256U}})), invalid + "Left is out of range");
    EXPECT_EQ(callThere("Kit_Item", arguments({{"Left", "2"}})), invalid + "Left is no integer");
    EXPECT_EQ(callThere("Kit_Value", arguments({{"Left", 2U}})),
              "CMPI_RC_ERR_METHOD_NOT_FOUND class Kit_Value has no method Add");
    EXPECT_EQ(textOf(request.invokeMethod(request.objectPath("root/cimv2", "Kit_Item"), "Describe",
                                          arguments({{"Values", "x"}}))),
              invalid + "Values is no array");
}

TEST_F(KitRequests, FailWithTheCodeAndTextOfWhatFailed) {
    const auto failing = [&](const std::function<void()>& failure) {
        return textOf(enumerate([&](const Operation& /*operation*/, Instances& /*reply*/) { failure(); }));
    };
    EXPECT_EQ(failing([] { throw oxahv::Refusal(CMPI_RC_ERR_ACCESS_DENIED, "no"); }),
              "CMPI_RC_ERR_ACCESS_DENIED no");
    EXPECT_EQ(failing([] { throw oxahv::Refusal(CMPI_RC_ERR_NOT_FOUND); }), "CMPI_RC_ERR_NOT_FOUND ");
    EXPECT_EQ(failing([] { throw TK::FrameworkException("keys"); }), "CMPI_RC_ERR_INVALID_PARAMETER keys");
    EXPECT_EQ(failing([] { throw std::bad_alloc(); }), "CMPI_RC_ERR_FAILED std::bad_alloc");
    EXPECT_EQ(failing([] { throw 1; }), "CMPI_RC_ERR_FAILED unknown exception");
    broker_.injectFault("returnDone", {CMPI_RC_ERR_ACCESS_DENIED});
    EXPECT_EQ(textOf(enumerate([](auto& /*operation*/, auto& /*reply*/) {})),
              "CMPI_RC_ERR_ACCESS_DENIED the broker did not end the reply");
}

TEST_F(KitRequests, ReachAnObjectThatEachBrokerHasOneOf) {
    EXPECT_EQ(probe.objects, 1U) << "of three kinds";
    {
        oxahv::EmbeddedBroker other;
        other.setContextEntry("KitEntry", "\u00fc");
        std::string entry;
        probe.construct = [&](const oxahv::Context& context) {
            entry = context.get<std::string>("KitEntry") + (context.broker() == other.handle() ? "" : "!");
        };
        other.host("KitProbe", probeFactories);
        EXPECT_EQ(entry, "\u00fc");
        EXPECT_EQ(probe.objects, 2U);
        other.unload("KitProbe");
        EXPECT_EQ(probe.objects, 1U);
        probe.construct = [](const oxahv::Context& context) { context.get<int>("KitEntry"); };
        try {
            other.host("KitProbe", probeFactories);
            ADD_FAILURE();
        } catch (const oxahv::BrokerError& error) {
            EXPECT_NE(
                std::string(error.what()).find("INVALID_PARAMETER: context entry KitEntry is no integer"),
                std::string::npos)
                << error.what();
        }
        EXPECT_EQ(probe.objects, 1U);
    }
    EXPECT_FALSE(textOf(request_.enumerateInstanceNames(path("Kit_Item"))).empty());
}

TEST_F(KitRequests, RunInUtf8AndLeaveTheServersLocale) {
    const std::string before = std::setlocale(LC_ALL, nullptr);
    std::setlocale(LC_ALL, "C"); // as most servers run
    const std::string note = "Note=\"\u00fc\u20ac\"";
    const auto expectNote = [&] {
        const locale_t own = ::uselocale(nullptr);
        EXPECT_NE(get(onePath).find(note), std::string::npos);
        EXPECT_EQ(::uselocale(nullptr), own);
        EXPECT_EQ(enumerate([](auto& /*operation*/, auto& /*reply*/) { throw 1; }).code, CMPI_RC_ERR_FAILED);
        EXPECT_EQ(::uselocale(nullptr), own);
        probe.enumerate = listItems;
    };
    expectNote();
    EXPECT_EQ(std::setlocale(LC_ALL, nullptr), std::string("C"));
    {
        ::setenv("LOCPATH", TEST_LOCALES, 1);
        const ThreadLocale latin("de_DE.ISO-8859-1");
        ::unsetenv("LOCPATH");
        expectNote();
        EXPECT_EQ(enumerate([](auto& /*operation*/, auto& /*reply*/) {
                      throw oxahv::Refusal(CMPI_RC_ERR_FAILED, ::nl_langinfo_l(DAY_1, ::uselocale(nullptr)));
                  }).message,
                  "Sonntag")
            << "the other categories are the thread's";
    }
    std::setlocale(LC_ALL, before.c_str());
}

TEST_F(KitRequests, AreTraced) {
    std::string traces;
    HVLog::HVLogger::setSink([&](const HVLog::Message& message) {
        if (message.channel == HVLog::Channel::trace && message.category == "Kit.Probe") {
            const std::string text = message.text;
            const std::size_t place = text.find(" in ");
            traces += text.substr(0, place) + text.substr(text.find("List: ", place) + 6) + '\n';
        }
    });
    HVLog::HVLogger::setThreshold(0);
    request_.enumerateInstanceNames(path("Kit_Item"));
    request_.associatorNames(path(twoPath), {"Kit_OwnLink", "", "Left", ""});
    call("Unserved", arguments({}));
    HVLog::HVLogger::reset();
    EXPECT_EQ(traces, "ENTERING: enumerateInstanceNames() class=Kit_Item\n"
                      "EXITING: enumerateInstanceNames() results=2\n"
                      "ENTERING: associatorNames() class=Kit_Item associationClass=Kit_OwnLink role=Left\n"
                      "EXITING: associatorNames() results=1\n"
                      "ENTERING: invokeMethod() class=Kit_Item method=Unserved\n"
                      "EXITING: invokeMethod() code=17 text=class Kit_Item has no method Unserved\n");
}

TEST_F(KitRequests, AnswerWithACodeWhateverFailsBelowThem) {
    const std::vector<std::string> wanted = {"Note", "Size"};
    const CMPIInstance* const sent = CMNewInstance(broker_.handle(), path(onePath), nullptr);
    const std::chrono::system_clock::time_point when(std::chrono::seconds(1));
    const CMPIArgs* const add = arguments({{"Left", std::uint8_t{2}}});
    const CMPIArgs* const describe =
        arguments({{"Values", std::vector<std::string>{"x"}}, {"When", when}, {"Peer", path(twoPath)}});
    probe.create = [](const Operation& operation, const Instance& instance) {
        return item(operation, instance.get<std::string>("Name").c_str(), instance.get<int>("Number"));
    };
    probe.enumerate = [](const Operation& operation, Instances& reply) {
        if (operation.isFor("Kit_Item")) {
            return listItems(operation, reply);
        }
        reply.add(operation.instance("Kit_Value", {{"Id", 1}})
                      .set("datetime", zonedDate())
                      .set("stringA", std::vector<std::wstring>{L"\u00fc"})
                      .set("uint16A", std::vector<int>{1})
                      .set("string", std::string_view("x")));
    };
    using Send = std::function<Reply(Request&, const CMPIObjectPath*)>;
    const struct {
        const char* path;
        Send send;
        bool looksUpClasses = false; // by the library, which counts a failure as no
    } operations[] = {
        {"Kit_Item", [](auto& request, auto* object) { return request.enumerateInstanceNames(object); }},
        {"Kit_Value", [](auto& request, auto* object) { return request.enumerateInstances(object); }},
        {onePath, [&](auto& request, auto* object) { return request.getInstance(object, &wanted); }},
        {"kit_item", [&](auto& request, auto* object) { return request.createInstance(object, sent); }},
        {onePath, [&](auto& request, auto* object) { return request.associators(object, {}, &wanted); }},
        {twoPath, [](auto& request, auto* object) { return request.references(object); }},
        {twoPath,
         [](auto& request, auto* object) {
             return request.associatorNames(object, {"Kit_Link", "Kit_Part", "Left", "Right"});
         },
         true},
        {onePath, [&](auto& request, auto* object) { return request.invokeMethod(object, "Add", add); }},
        {onePath,
         [&](auto& request, auto* object) { return request.invokeMethod(object, "Describe", describe); }},
    };
    std::vector<Way> ways = waysOfTheBroker(broker_);
    for (const Way& way : waysOfMemory()) {
        ways.push_back(way);
    }
    ways.push_back(wayOfTheLogger());
    for (const auto& operation : operations) {
        Request caller(broker_);
        const CMPIObjectPath* const target = caller.objectPathFromText(operation.path, "root/cimv2");
        const std::string whole = textOf(operation.send(caller, target));
        for (const Way& way : ways) {
            bool isReached = true;
            for (unsigned int n = 1; isReached; ++n) {
                SCOPED_TRACE(std::string(operation.path) + ' ' + std::to_string(&operation - operations) +
                             ' ' + way.name + ' ' + std::to_string(n));
                Request request(broker_);
                Reply reply;
                way.begin(n);
                try {
                    reply = operation.send(request, target);
                } catch (const std::bad_alloc&) { // the broker itself had no room for the reply
                    reply.code = CMPI_RC_ERR_FAILED;
                }
                isReached = way.end(n);
                const bool isWhole = reply.ok() && textOf(reply) == whole;
                EXPECT_NE(reply.message.rfind("exception", 0), 0U) << reply.message;
                EXPECT_TRUE(isWhole || (isReached && !way.isHarmless)) << textOf(reply);
                if (way.name.rfind("error code", 0) == 0 && isReached) {
                    EXPECT_TRUE(!reply.ok() || (operation.looksUpClasses && isWhole)) << textOf(reply);
                }
                if (way.thrown == Thrown::badAlloc && !failing::failedIn("oxahvbroker")) {
                    EXPECT_TRUE(!reply.ok() || isWhole) << "a failed allocation was swallowed";
                }
                if (way.thrown == Thrown::byTheLogger && isReached) {
                    EXPECT_EQ(reply.code, CMPI_RC_ERR_FAILED);
                }
            }
        }
    }
}

TEST_F(KitRequests, AreServedAtOnce) {
    std::atomic<unsigned int> failures{0};
    std::vector<std::thread> threads(4);
    for (std::thread& thread : threads) {
        thread = std::thread([&] {
            for (unsigned int round = 0; round < 20; ++round) {
                Request request(broker_);
                const auto* one = request.objectPathFromText(onePath, "");
                const Reply got = request.getInstance(one);
                const Reply links = request.associators(one);
                const bool isWhole =
                    textOf(got).find("\u20ac") != std::string::npos && links.instances.size() == 3;
                failures += isWhole ? 0U : 1U;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(failures, 0U);
}

TEST_F(KitRequests, LetTheEndOfAThreadThrough) {
    static locale_t atEnd;
    probe.enumerate = [](const Operation& /*operation*/, Instances& /*reply*/) { ::pthread_exit(&atEnd); };
    pthread_t thread = {};
    void* result = nullptr;
    const auto serve = [](void* broker) -> void* {
        struct LocaleAtEnd {
            ~LocaleAtEnd() { atEnd = ::uselocale(nullptr); }
        } const onTheWayOut;
        Request request(*static_cast<oxahv::EmbeddedBroker*>(broker));
        request.enumerateInstances(request.objectPath("root/cimv2", "Kit_Item"));
        return nullptr;
    };
    ASSERT_EQ(::pthread_create(&thread, nullptr, serve, &broker_), 0);
    ::pthread_join(thread, &result);
    EXPECT_EQ(result, &atEnd) << "it ended, and nothing caught that";
    EXPECT_EQ(atEnd, LC_GLOBAL_LOCALE);
}
