/**
 * @file
 * oxahv::Refusal, the exception by which a provider answers a request with a CMPI code and a text.
 */
#pragma once

#include <ProviderUtilities.h>

#include <stdexcept>
#include <string>

namespace oxahv {

/**
 * Ends a request with a code and a text for the client. The kit throws it itself for what the broker reports
 * and for keys and arguments that a client got wrong.
 *
 * A copy shares the text and throws nothing; the exception may be passed between threads.
 */
class Refusal : public std::runtime_error {
public:
    /**
     * A refusal with a code and a text.
     * @param code the CMPI code that the client receives; anything but `CMPI_RC_OK`.
     * @param text UTF-8, for a person; copied.
     * @throws std::bad_alloc
     */
    explicit Refusal(CMPIrc code, const std::string& text = {}) : std::runtime_error(text), code_(code) {}

    /** The code. */
    CMPIrc code() const noexcept { return code_; }

private:
    CMPIrc code_;
};

} // namespace oxahv
