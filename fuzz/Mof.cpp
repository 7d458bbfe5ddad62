// MOF texts: what compiles, compiles again to the same answer; what does not is refused with the place of the
// error and declares nothing.
#include "Fuzz.h"

#include "EmbeddedBroker.h"

namespace {

// The answer to a text: nothing, or the error. It can include the files of the tests' MOF.
std::string compiled(const std::string& text) {
    oxahv::EmbeddedBroker broker;
    try {
        broker.compileMofText(text, MOF_FIXTURES "/text.mof");
    } catch (const oxahv::BrokerError& error) {
        FUZZ_REQUIRE(!broker.hasDeclarations());
        return error.what();
    }
    return "";
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Input input(data, size);
    const std::string text = input.rest();
    const std::string error = compiled(text);
    FUZZ_REQUIRE(compiled(text) == error);
    if (!error.empty()) {
        int line = 0;
        int column = 0;
        FUZZ_REQUIRE(std::sscanf(&error[error.find(".mof:")], ".mof:%d:%d: ", &line, &column) == 2);
        FUZZ_REQUIRE(line > 0 && column > 0);
    }
    return 0;
}
