// Queries, the language on the first line: what is accepted says the same of an instance as its normal forms,
// and what is refused is refused with a text.
#include "Fuzz.h"

#include "EmbeddedBroker.h"

namespace {

const CMPIBroker* broker = nullptr;

// The instance as an accessor sees it, which asks for properties of embedded instances by their whole names.
CMPIData valueNamed(const char* name, void* parm) {
    return CMGetProperty(static_cast<CMPIInstance*>(parm), name, nullptr);
}

CMPIInstance* demo(oxahv::Request& request) {
    CMPIInstance* const demo = CMNewInstance(broker, request.objectPath("root", "Demo"), nullptr);
    const auto set = [&](const char* name, CMPIType type, const char* text) {
        const CMPIData data = request.valueFromText(text, type);
        CMSetProperty(demo, name, &data.value, type);
    };
    set("a", CMPI_uint64, "18446744073709551615");
    set("b", CMPI_sint8, "-1");
    set("c", CMPI_string, "text");
    set("d", CMPI_dateTime, "19690720201740.000000+060");
    set("r", CMPI_real32, "0.1");
    set("t", CMPI_boolean, "TRUE");
    return demo;
}

// What the predicates of a normal form say together; false also where one of them cannot be evaluated.
bool isTrue(const CMPISelectCond* condition, CMPIInstance* instance, CMPIStatus& failure) {
    int type = -1;
    const CMPICount count = CMGetSubCondCountAndType(condition, &type, nullptr);
    const bool isDoc = type == CMPI_COND_DOC;
    bool whole = !isDoc;
    for (CMPICount i = 0; i < count; ++i) {
        const CMPISubCond* const sub = CMGetSubCondAt(condition, i, nullptr);
        bool group = isDoc;
        for (CMPICount j = 0; j < CMGetPredicateCount(sub, nullptr); ++j) {
            CMPIStatus status = {CMPI_RC_OK, nullptr};
            const bool is = CMEvaluatePredicateUsingAccessor(CMGetPredicateAt(sub, j, nullptr), valueNamed,
                                                             instance, &status) != 0;
            failure = status.rc != CMPI_RC_OK ? status : failure;
            group = isDoc ? group && is : group || is;
        }
        whole = isDoc ? whole || group : whole && group;
    }
    return whole;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    const std::string language = input.line();
    const std::string text = input.rest();
    static oxahv::EmbeddedBroker embedded;
    broker = embedded.handle();
    oxahv::Request request(embedded);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPISelectExp* const query =
        CMNewSelectExp(broker, text.c_str(), language.c_str(), nullptr, &status);
    FUZZ_REQUIRE((query == nullptr) == (status.rc != CMPI_RC_OK));
    if (query == nullptr) {
        FUZZ_REQUIRE(status.msg != nullptr);
        return 0;
    }
    CMPIInstance* const instance = demo(request);
    const bool accepted = CMEvaluateSelExpUsingAccessor(query, valueNamed, instance, &status) != 0;
    const CMPIrc code = status.rc;
    FUZZ_REQUIRE(code == CMPI_RC_OK || code == CMPI_RC_ERR_TYPE_MISMATCH);
    for (const CMPISelectCond* const form : {CMGetDoc(query, nullptr), CMGetCod(query, nullptr)}) {
        CMPIStatus failure = {CMPI_RC_OK, nullptr};
        if (form != nullptr) { // else it would have been too large
            const bool same = isTrue(form, instance, failure);
            FUZZ_REQUIRE(failure.rc == code);
            FUZZ_REQUIRE(code != CMPI_RC_OK || same == accepted);
        }
    }
    return 0;
}
