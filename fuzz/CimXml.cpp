// Bodies of CIM-XML requests: whatever a client sends, the answer is an HTTP status of the protocol, and its
// body is XML that a client can read.
#include "Fuzz.h"

#include <EmbeddedBroker.h>
#include <Front.h>
#include <Xml.h>

#include <set>

namespace {

constexpr const char* classes = R"(
    class Demo_Thing { [Key] string Name; [Key] uint8 Number; datetime When; real64 Real; char16 Letter;
                       boolean Flags[]; [EmbeddedInstance("Demo_Thing")] string Part;
                       uint32 Set([In] Demo_Thing REF Peer, [In] sint64 Values[]); };
    class Demo_Special : Demo_Thing { string Extra; };)";

// Hands instances and arguments back.
CMPIStatus createInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                          const CMPIObjectPath* path, const CMPIInstance* instance) {
    CMReturnInstance(result, instance);
    return CMReturnObjectPath(result, path);
}

CMPIStatus getInstance(CMPIInstanceMI* mi, const CMPIContext* /*context*/, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** /*properties*/) {
    const auto* const broker = static_cast<const CMPIBroker*>(mi->hdl);
    return CMReturnInstance(result, CMNewInstance(broker, path, nullptr));
}

CMPIStatus invokeMethod(CMPIMethodMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                        const CMPIObjectPath* path, const char* /*method*/, const CMPIArgs* in,
                        CMPIArgs* out) {
    const CMPICount count = CMGetArgCount(in, nullptr);
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = CMGetArgAt(in, i, &name, nullptr);
        CMAddArg(out, CMGetCharsPtr(name, nullptr), CMIsNullValue(data) ? nullptr : &data.value, data.type);
    }
    CMPIValue value = {};
    value.ref = const_cast<CMPIObjectPath*>(path);
    return CMReturnData(result, &value, CMPI_ref);
}

CMPIInstanceMI* instanceMI(const CMPIBroker* broker, const CMPIContext* /*context*/, CMPIStatus* /*status*/) {
    static CMPIInstanceMIFT table = {};
    table.createInstance = createInstance;
    table.getInstance = getInstance;
    static CMPIInstanceMI mi = {nullptr, &table};
    mi.hdl = const_cast<CMPIBroker*>(broker);
    return &mi;
}

CMPIMethodMI* methodMI(const CMPIBroker* /*broker*/, const CMPIContext* /*context*/, CMPIStatus* /*status*/) {
    static CMPIMethodMIFT table = {};
    table.invokeMethod = invokeMethod;
    static CMPIMethodMI mi = {nullptr, &table};
    return &mi;
}

oxahv::EmbeddedBroker& broker() {
    static oxahv::EmbeddedBroker broker;
    if (!broker.hasDeclarations()) {
        broker.compileMofText(classes, "classes.mof");
        oxahv::ProviderFactories factories;
        factories.instance = instanceMI;
        factories.method = methodMI;
        broker.host("Demo", factories);
    }
    return broker;
}

// The first attribute of a name in the body, for the headers that have to announce it.
std::string attributeIn(const std::string& body, const std::string& element, const std::string& name) {
    const std::string start = name + "=\"";
    const std::size_t at = body.find(start, body.find('<' + element));
    const std::size_t begin = at != std::string::npos ? at + start.size() : body.size();
    return body.substr(begin, body.find('"', begin) - begin);
}

// Announces what the body holds, as a client does.
cimxml::HttpRequest requestWith(const std::string& body) {
    cimxml::HttpRequest request = {"POST", {{"CIMOperation", "MethodCall"}}, body};
    const std::string nameSpace = "root/cimv2";
    if (body.find("<MULTIREQ") != std::string::npos) {
        request.headers.emplace_back("CIMBatch", "");
    } else if (body.find("<METHODCALL") != std::string::npos) {
        const bool isClass = body.find("<LOCALCLASSPATH") != std::string::npos;
        request.headers.emplace_back("CIMMethod", attributeIn(body, "METHODCALL", "NAME"));
        request.headers.emplace_back("CIMObject",
                                     nameSpace + ':' +
                                         (isClass ? attributeIn(body, "CLASSNAME", "NAME")
                                                  : attributeIn(body, "INSTANCENAME", "CLASSNAME")));
    } else {
        request.headers.emplace_back("CIMMethod", attributeIn(body, "IMETHODCALL", "NAME"));
        request.headers.emplace_back("CIMObject", nameSpace);
    }
    return request;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    static const cimxml::Front front(broker(), "root/cimv2");
    const cimxml::HttpResponse response = front.answer(requestWith(input.rest()));
    static const std::set<int> statuses = {200, 400, 501};
    FUZZ_REQUIRE(statuses.count(response.status) != 0);
    if (response.status == 200) {
        FUZZ_REQUIRE(cimxml::parseXml(response.body).name == "CIM");
    }
    return 0;
}
