// The screen for users' texts: an exemption in the first line, the text behind it; narrow, and wide in two
// ways.
#include "Fuzz.h"

#include "../tests/Obvious.h"

#include "ProviderUtilities.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using TK::ProviderUtilities;
    fuzz::Input input(data, size);
    const std::string exemption = input.line();
    const std::string text = input.rest();
    const bool isAcceptable = obvious::isAcceptable(text, exemption);
    FUZZ_REQUIRE(ProviderUtilities::ValidateInput(text, exemption) == isAcceptable);

    std::wstring wideExemption = obvious::widened<wchar_t>(exemption);
    std::wstring wideText = obvious::widened<wchar_t>(text);
    FUZZ_REQUIRE(ProviderUtilities::ValidateInput(wideText, wideExemption) == isAcceptable);
    wideText = fuzz::wide(text);
    FUZZ_REQUIRE(ProviderUtilities::ValidateInput(wideText, wideExemption) ==
                 obvious::isAcceptable(wideText, wideExemption));
    return 0;
}
