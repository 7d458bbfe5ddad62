#include "KitProbe.h"

#include <cstdlib>

Probe probe;

const std::vector<ValueType> valueTypes = {
    {"boolean", CMPI_boolean}, {"char16", CMPI_char16},     {"uint8", CMPI_uint8},   {"uint16", CMPI_uint16},
    {"uint32", CMPI_uint32},   {"uint64", CMPI_uint64},     {"sint8", CMPI_sint8},   {"sint16", CMPI_sint16},
    {"sint32", CMPI_sint32},   {"sint64", CMPI_sint64},     {"real32", CMPI_real32}, {"real64", CMPI_real64},
    {"string", CMPI_string},   {"datetime", CMPI_dateTime}, {"ref", CMPI_ref},
};

namespace {

enum class Outcome : std::uint32_t { done = 0, refused = 5 };

class ProbeProvider : public oxahv::InstanceProvider,
                      public oxahv::AssociationProvider,
                      public oxahv::MethodProvider {
public:
    static constexpr const char* traceCategory = "Kit.Probe";

    explicit ProbeProvider(const oxahv::Context& context) {
        if (probe.construct) {
            probe.construct(context);
        }
        ++probe.objects;
        method("Kit_Item.Add", &ProbeProvider::add, {"Left", "Right", "Sum"});
        method("Describe", &ProbeProvider::describe, {"Values", "When", "Peer", "Text", "Other"});
        method("Reset", &ProbeProvider::reset);
    }
    ~ProbeProvider() override { --probe.objects; }
    ProbeProvider(const ProbeProvider&) = delete;
    ProbeProvider& operator=(const ProbeProvider&) = delete;

    void enumerate(const oxahv::Operation& operation, oxahv::Instances& reply) override {
        return probe.enumerate ? probe.enumerate(operation, reply)
                               : InstanceProvider::enumerate(operation, reply);
    }
    oxahv::Path create(const oxahv::Operation& operation, const oxahv::Instance& wanted) override {
        return probe.create ? probe.create(operation, wanted) : InstanceProvider::create(operation, wanted);
    }
    void associations(const oxahv::Operation& operation, oxahv::Instances& reply) override {
        return probe.associations ? probe.associations(operation, reply)
                                  : AssociationProvider::associations(operation, reply);
    }

private:
    // The sum goes through the argument, which begins with what the client sent.
    Outcome add(const oxahv::Operation& operation, std::uint8_t left, std::optional<std::int16_t> right,
                std::int32_t& sum) const {
        sum += left + right.value_or(0);
        return operation.key<std::string>("Name") == "one" ? Outcome::done : Outcome::refused;
    }
    std::string describe(const std::vector<std::string>& values, std::chrono::system_clock::time_point when,
                         const std::optional<oxahv::Path>& peer, std::wstring& text,
                         std::optional<bool>& other) {
        text = peer ? L"ü" : L"none";
        other.reset();
        const auto micros = when.time_since_epoch() / std::chrono::microseconds(1);
        return values.at(0) + ' ' + std::to_string(micros);
    }
    void reset() { throw TK::FrameworkException("cannot be reset"); }
};

} // namespace

OXAHV_PROVIDER(KitProbe, ProbeProvider);

const oxahv::ProviderFactories probeFactories = {KitProbe_Create_InstanceMI, KitProbe_Create_AssociationMI,
                                                 KitProbe_Create_MethodMI};

KitTest::KitTest() {
    ::unsetenv("LOCPATH"); // or the C library's newlocale, which a provider calls, would lose a list of it
    using Declaration = oxahv::ClassDeclaration;
    Declaration value("Kit_Value");
    value.key("Id", CMPI_uint32);
    const oxahv::Qualifiers ofItem({{"EmbeddedInstance", {CMPI_string, false, {std::string("Kit_Item")}}}});
    value.property({"embedded", CMPI_string, false, "", {}, ofItem});
    value.property({"embeddedA", CMPI_stringA, false, "", {}, ofItem});
    for (const ValueType& type : valueTypes) {
        value.property(type.name, type.type);
        value.property(std::string(type.name) + 'A', static_cast<CMPIType>(type.type | CMPI_ARRAY));
    }
    broker_.declare(value);
    broker_.declare(
        Declaration("Kit_Item")
            .key("Name", CMPI_string)
            .key("Number", CMPI_uint16)
            .property("Size", CMPI_uint64)
            .property("Note", CMPI_string)
            .method("Add", CMPI_uint32,
                    {{"Left", CMPI_uint8}, {"Right", CMPI_sint16}, {"Sum", CMPI_sint32, "", true, true}})
            .method("Describe", CMPI_string,
                    {{"Values", CMPI_stringA},
                     {"When", CMPI_dateTime},
                     {"Peer", CMPI_ref},
                     {"Text", CMPI_string, "", false, true},
                     {"Other", CMPI_boolean, "", false, true}})
            .method("Reset", CMPI_uint32)
            .method("Unserved", CMPI_uint32));
    broker_.declare(Declaration("Kit_Part").superclass("Kit_Item"));
    broker_.declare(Declaration("Kit_Link")
                        .association()
                        .key("Left", CMPI_ref)
                        .key("Right", CMPI_ref)
                        .property("Note", CMPI_string));
    broker_.declare(Declaration("Kit_OwnLink").superclass("Kit_Link"));
    broker_.host("KitProbe", probeFactories);
}

KitTest::~KitTest() {
    probe.construct = nullptr;
    probe.enumerate = nullptr;
    probe.associations = nullptr;
    probe.create = nullptr;
}

oxahv::Reply KitTest::enumerate(
    const std::function<void(const oxahv::Operation&, oxahv::Instances&)>& function,
    const std::string& className) {
    probe.enumerate = function;
    return request_.enumerateInstances(path(className));
}
