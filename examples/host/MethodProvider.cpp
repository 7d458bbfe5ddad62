// The function table for methods: OXATK_ComputerSystem.SetAssetTag.

#include "Provider.h"

#include <Trace.h>

#include <system_error>

using TK::ProviderUtilities;

namespace {

// What SetAssetTag returns, as its declaration lists it.
enum class ReturnCode : unsigned int { completed = 0, invalidParameter = 5 };

// The argument's text. The getter takes any value for a text, so the type is asked for before.
std::string tagIn(const CMPIArgs* in) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData argument = CMGetArg(in, "Tag", &status);
    std::string tag;
    if (status.rc != CMPI_RC_OK || argument.type != CMPI_string ||
        !ProviderUtilities::getProperty(in, "Tag", tag)) {
        throw Refusal{CMPI_RC_ERR_INVALID_PARAMETER,
                      ProviderUtilities::getNLSText(L"The asset tag is missing.")};
    }
    return tag;
}

// A tag that is refused changes nothing.
ReturnCode setAssetTag(const CMPIArgs* in) {
    TK_TRACE_ENTERING(category);
    const std::string tag = tagIn(in);
    if (!isAcceptableAssetTag(tag)) {
        TK_TRACE_MESSAGE(
            category, ProviderUtilities::getNLSText(L"The asset tag holds characters that are not allowed."));
        TK_TRACE_EXITING(category);
        return ReturnCode::invalidParameter;
    }
    try {
        machine().assetTag.write(tag);
    } catch (const std::system_error& error) {
        throw Refusal{CMPI_RC_ERR_FAILED,
                      std::string(ProviderUtilities::getNLSText(L"The asset tag could not be saved.")) + ' ' +
                          error.what()};
    }
    TK_TRACE_EXITING(category);
    return ReturnCode::completed;
}

void invokeMethod(const CMPIResult* result, const CMPIObjectPath* path, const char* method,
                  const CMPIArgs* in) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path << " method=" << method);
    const HostClass& hostClass = classOf(path);
    if (!ProviderUtilities::textEqual(hostClass.name, computerSystem) ||
        !ProviderUtilities::textEqual(method, "SetAssetTag")) {
        throw Refusal{CMPI_RC_ERR_METHOD_NOT_FOUND,
                      std::string("class ") + hostClass.name + " has no method " + method};
    }
    keysOf(hostClass, path);
    CMPIValue value = {};
    value.uint32 = static_cast<CMPIUint32>(setAssetTag(in));
    require(CMReturnData(result, &value, CMPI_uint32));
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

CMPIStatus HostMethodCleanup(CMPIMethodMI* /*mi*/, const CMPIContext* /*context*/,
                             CMPIBoolean /*terminating*/) {
    return answer([] {});
}

CMPIStatus HostInvokeMethod(CMPIMethodMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                            const CMPIObjectPath* path, const char* method, const CMPIArgs* in,
                            CMPIArgs* /*out*/) {
    return answer([&] { invokeMethod(result, path, method, in); });
}

} // namespace

CMMethodMIStub(Host, OXAHost, broker, )
