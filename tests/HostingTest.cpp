// Which providers the broker asks, how it puts their answers together, and how it ends them.
#include "EmbeddedBroker.h"

#include <functional>
#include <gtest/gtest.h>
#include <stdexcept>

using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::Reply;
using oxahv::Request;

namespace {

// Providers whose functions a test sets.
template <int number>
struct Provider {
    static inline std::function<CMPIStatus(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)>
        serve;
    static inline std::function<CMPIStatus()> end;

    template <class MI, class... Rest>
    static CMPIStatus answer(MI*, const CMPIContext* context, const CMPIResult* result,
                             const CMPIObjectPath* path, Rest...) {
        return serve(context, result, path);
    }
    template <class MI>
    static CMPIStatus cleanup(MI*, const CMPIContext*, CMPIBoolean) {
        return end ? end() : CMPIStatus{CMPI_RC_OK, nullptr};
    }
    static CMPIInstanceMI* instance(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
        static CMPIInstanceMIFT table = {};
        static CMPIInstanceMI mi = {nullptr, &table};
        table.cleanup = cleanup;
        table.enumerateInstanceNames = answer;
        return &mi;
    }
    static CMPIAssociationMI* association(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
        static CMPIAssociationMIFT table = {};
        static CMPIAssociationMI mi = {nullptr, &table};
        table.referenceNames = answer;
        return &mi;
    }
};
using First = Provider<1>;
using Second = Provider<2>;

class HostedProviderTest : public testing::Test {
protected:
    ~HostedProviderTest() override { First::end = nullptr; }

    CMPIObjectPath* path(const char* className) { return request_.objectPath("root", className); }
    // The answers of a reply, in words.
    static std::string answersOf(const Reply& reply) {
        std::string words = oxahv::codeName(reply.code).substr(std::string("CMPI_RC_").size()) + ':';
        for (const oxahv::ProviderAnswer& answer : reply.answers) {
            words += ' ' + answer.provider + '=' + std::to_string(answer.results);
        }
        return words;
    }

    EmbeddedBroker broker_;
    Request request_{broker_};
};

// Returns paths, and then a status.
auto returning(int paths, CMPIrc code) {
    return [=](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path) {
        for (int i = 0; i < paths; ++i) {
            CMReturnObjectPath(result, path);
        }
        CMReturn(code);
    };
}

} // namespace

TEST_F(HostedProviderTest, SharesAssociationsWithOthers) {
    broker_.declare(ClassDeclaration("End"));
    broker_.declare(ClassDeclaration("Other"));
    broker_.declare(ClassDeclaration("Link").association().reference("A", "End").reference("B", "End"));
    broker_.declare(ClassDeclaration("SubLink").superclass("Link"));
    broker_.declare(ClassDeclaration("Elsewhere").association().reference("A", "Other"));
    broker_.host("One", {First::instance, First::association}, {"Link", "End"});
    broker_.host("Two", {Second::instance, Second::association}, {"SubLink"});
    broker_.host("Three", {nullptr, First::association}, {"Elsewhere"});
    const struct {
        decltype(returning(0, CMPI_RC_OK)) first;
        decltype(returning(0, CMPI_RC_OK)) second;
        const char* answers;
    } rows[] = {
        {returning(1, CMPI_RC_OK), returning(2, CMPI_RC_OK), "OK: One=1 Two=2"},
        {returning(0, CMPI_RC_ERR_NOT_FOUND), returning(0, CMPI_RC_OK), "OK: One=0 Two=0"},
        {returning(0, CMPI_RC_ERR_NOT_FOUND), returning(0, CMPI_RC_ERR_NOT_SUPPORTED),
         "ERR_NOT_FOUND: One=0 Two=0"},
        {returning(2, CMPI_RC_OK), returning(1, CMPI_RC_ERR_NOT_FOUND), "ERR_NOT_FOUND: One=2 Two=1"},
        {returning(1, CMPI_RC_OK), returning(0, CMPI_RC_ERR_FAILED), "ERR_FAILED: One=1 Two=0"},
    };
    std::size_t told = 0;
    request_.setProgressHandler([&](std::size_t results) { told = results; });
    for (const auto& row : rows) {
        First::serve = row.first;
        Second::serve = row.second;
        const Reply reply = request_.referenceNames(path("End"));
        EXPECT_EQ(answersOf(reply), row.answers);
        EXPECT_EQ(reply.objectPaths.size(), reply.answers[0].results + reply.answers[1].results);
        EXPECT_TRUE(reply.objectPaths.empty() || reply.objectPaths.size() == told);
        told = 0;
    }
    EXPECT_EQ(answersOf(request_.referenceNames(path("End"), {"", "SubLink", "", ""})),
              "ERR_FAILED: One=1 Two=0");
    EXPECT_EQ(answersOf(request_.referenceNames(path("Other"))), "OK: Three=1");
}

TEST_F(HostedProviderTest, PassesARefusedClassToTheNext) {
    broker_.host("One", {First::instance}, {"Demo"});
    broker_.host("Two", {Second::instance}, {"Demo"});
    First::serve = returning(0, CMPI_RC_ERR_NOT_SUPPORTED);
    Second::serve = returning(1, CMPI_RC_OK);
    EXPECT_EQ(answersOf(request_.enumerateInstanceNames(path("Demo"))), "OK: One=0 Two=1");
    First::serve = returning(0, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(answersOf(request_.enumerateInstanceNames(path("Demo"))), "ERR_NOT_FOUND: One=0");
}

TEST_F(HostedProviderTest, ReturnsErrorsWithTheirFields) {
    broker_.host("One", {First::instance});
    const auto answering = [this](const char* text) {
        const CMPIBroker* const b = broker_.handle();
        First::serve = [=](const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*) {
            const CMPIError* const error = b->eft->newCMPIError(
                b, "owner", "id", "told", ErrorSevLow, ErrorProbCauseOther, CMPI_RC_ERR_FAILED, nullptr);
            result->ft->returnError(result, error);
            return CMPIStatus{CMPI_RC_ERR_ACCESS_DENIED,
                              text != nullptr ? CMNewString(b, text, nullptr) : nullptr};
        };
        return request_.enumerateInstanceNames(path("Demo"));
    };
    const Reply reply = answering(nullptr);
    EXPECT_EQ(reply.code, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(reply.message, "told");
    const CMPIError* const error = reply.errors.at(0);
    EXPECT_STREQ(CMGetCharsPtr(error->ft->getMessageID(error, nullptr), nullptr), "id");
    EXPECT_EQ(error->ft->getCIMStatusCode(error, nullptr), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(answering("another").message, "another");
}

TEST_F(HostedProviderTest, SeesTheContextOfTheClient) {
    broker_.host("One", {First::instance});
    std::string seen;
    First::serve = [&](const CMPIContext* context, const CMPIResult*, const CMPIObjectPath*) {
        for (const char* const name : {CMPIPrincipal, CMPIInvocationFlags, CMPIAcceptLanguage}) {
            seen += oxahv::valueText(CMGetContextEntry(context, name, nullptr)) + ' ';
        }
        CMReturn(CMPI_RC_OK);
    };
    request_.setContextEntry(CMPIPrincipal, "somebody");
    request_.setContextEntry(CMPIAcceptLanguage, "de");
    request_.setInvocationFlags(CMPI_FLAG_LocalOnly | CMPI_FLAG_DeepInheritance);
    request_.enumerateInstanceNames(path("Demo"));
    EXPECT_EQ(seen, "\"somebody\" 3 \"de\" ");
}

TEST_F(HostedProviderTest, NestsAtMostAThousandUpcalls) {
    broker_.host("One", {First::instance}, {"Demo"});
    unsigned int calls = 0;
    const CMPIBroker* const b = broker_.handle();
    CMPIStatus innermost = {CMPI_RC_OK, nullptr};
    First::serve = [&](const CMPIContext* context, const CMPIResult*, const CMPIObjectPath* demo) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        ++calls;
        b->bft->enumerateInstanceNames(b, context, demo, &status);
        innermost = innermost.rc == CMPI_RC_OK ? status : innermost;
        CMReturn(CMPI_RC_OK);
    };
    EXPECT_TRUE(request_.enumerateInstanceNames(path("Demo")).ok());
    EXPECT_EQ(calls, 1000U);
    EXPECT_EQ(innermost.rc, CMPI_RC_ERR_FAILED);
}

TEST_F(HostedProviderTest, EndsAlthoughItsCleanupThrows) {
    std::string told;
    broker_.setMessageHandler([&](const oxahv::BrokerMessage& message) {
        told = message.component + '|' + message.text + (message.isBrokers ? "|broker" : "");
    });
    broker_.host("One", {First::instance});
    First::end = []() -> CMPIStatus { throw std::runtime_error("lost"); };
    broker_.unload("One");
    EXPECT_EQ(told, "One|provider One: its cleanup threw an exception: lost|broker");
}
