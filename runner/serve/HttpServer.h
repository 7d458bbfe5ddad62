// An HTTP server on a loopback address. It bounds what clients can cost: connections, threads, waiting
// requests, the sizes of header and body, and time.
#pragma once

#include "serve/Address.h"

#include <Http.h>

#include <cstddef>
#include <functional>
#include <memory>

namespace oxahv::runner {

struct HttpLimits {
    unsigned int threads = 8;                  // requests that are answered at the same time
    unsigned int waitingRequests = 64;         // further ones are answered with status 503
    unsigned int connections = 512;            // further ones are closed at once
    std::size_t headerBytes = 32768;           // of request line and headers; beyond, status 431 or 414
    std::size_t bodyBytes = 4UL * 1024 * 1024; // beyond, status 413
    unsigned int seconds = 30;                 // for a whole request to come in; beyond, status 408
};

class HttpServer {
public:
    // Answers a request; called on several threads at once.
    using Handler = std::function<cimxml::HttpResponse(const cimxml::HttpRequest&)>;
    // Takes a line on a request that has not reached the handler; called on several threads at once.
    using Observer = std::function<void(const std::string& line)>;

    // Listens and answers from now on. Throws std::runtime_error when it cannot.
    HttpServer(const Address& address, const HttpLimits& limits, Handler handler, Observer observer);
    // Accepts no more connections, answers the requests that have come in, and closes all connections.
    ~HttpServer();
    HttpServer(const HttpServer&) = delete;
    HttpServer& operator=(const HttpServer&) = delete;

    // With the port that the system chose, where the given one was 0.
    Address address() const;
    // Ends the connections of clients that are too slow. To be called every second or so.
    void endLateConnections();

private:
    class Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace oxahv::runner
