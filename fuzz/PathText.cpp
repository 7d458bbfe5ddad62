// Object path texts, as the runner takes them: what is read and written again reads as the same path.
#include "Fuzz.h"

#include "EmbeddedBroker.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    const std::string text = input.rest();
    static oxahv::EmbeddedBroker broker;
    oxahv::Request request(broker);
    std::string written;
    try {
        written = oxahv::pathText(request.objectPathFromText(text, "root/cimv2"));
    } catch (const oxahv::BrokerError&) {
        return 0;
    }
    // A path without a namespace is written without one.
    FUZZ_REQUIRE(oxahv::pathText(request.objectPathFromText(written, "")) == written);
    return 0;
}
