// The HTTP side of CIM-XML (DSP0200): which requests are taken, and how answers are labelled. No sockets
// here.
#pragma once

#include "Failure.h"

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cimxml {

using Headers = std::vector<std::pair<std::string, std::string>>;

struct HttpRequest {
    std::string method; // as "POST"
    Headers headers;    // names in any case
    std::string body;

    // Null when there is none.
    const std::string* find(std::string_view header) const;
};

struct HttpResponse {
    int status = 200;
    Headers headers;
    std::string body;
    std::string summary; // one line for the person who runs the server: what was asked, and what came of it
};

// The extension headers of a CIM-XML request, with their values decoded.
class CimHeaders {
public:
    // Throws HttpError when this is no request that CIM-XML has.
    explicit CimHeaders(const HttpRequest& request);

    // Throws HttpError (header-mismatch) unless the headers announce this operation.
    void requireSingle(std::string_view method, std::string_view object) const;
    void requireBatch() const;
    // The headers of every answer to the request whose body is CIM-XML.
    Headers ofAnswer() const;

private:
    const std::string* find(const std::string& name) const;
    std::string decoded(const std::string& name) const;

    const HttpRequest& request_;
    std::string prefix_; // before the names of extension headers: "NN-" in an M-POST request
};

// The user's name in a header Authorization of the scheme Basic; empty where there is none. Nobody has
// checked it.
std::string userOf(const HttpRequest& request);

// The answer to a request that cannot be read.
HttpResponse refusal(const HttpError& error);

} // namespace cimxml
