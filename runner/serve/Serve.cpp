#include "serve/Serve.h"

#include "Runner.h"
#include "check/CrashLine.h"
#include "serve/HttpServer.h"
#include "serve/Signals.h"
#include "show/Text.h"

#include <Front.h>

#include <CLI/CLI.hpp>

#include <chrono>
#include <ctime>
#include <iomanip>
#include <iostream>
#include <memory>
#include <mutex>
#include <sstream>
#include <unistd.h>

namespace oxahv::runner {

namespace {

constexpr const char* serveFooter =
    R"(Answers CIM clients over HTTP, in CIM-XML, until Ctrl-C or SIGTERM ends it with status 0; a second one
ends it at once. The first line of the standard output is the address that it listens on. On a terminal
the standard error stream gets a line for each request. Only this machine's own addresses are served,
since nobody is asked for a password. What clients may send is bounded: 4 MiB a body, 32 KiB a header,
512 connections; of the requests 8 are answered at a time.

  oxahv-provider --library ./libDemoPort.so --mof Demo.mof serve
  wbemcli ein http://localhost:5988/root/cimv2:Demo_Port)";

// Lines on requests, for a person at a terminal; none when there is no terminal.
class RequestLines {
public:
    void write(const std::string& text) {
        if (isTerminal_) {
            const std::time_t now = std::time(nullptr);
            std::tm local = {};
            ::localtime_r(&now, &local);
            std::ostringstream line;
            line << std::put_time(&local, "%H:%M:%S ") << printable(text) << '\n';
            const std::lock_guard<std::mutex> lock(mutex_);
            std::cerr << line.str() << std::flush;
        }
    }

private:
    const bool isTerminal_ = ::isatty(STDERR_FILENO) == 1;
    std::mutex mutex_;
};

cimxml::HttpResponse answer(const cimxml::Front& front, const cimxml::HttpRequest& request,
                            RequestLines& lines) {
    const auto begin = std::chrono::steady_clock::now();
    cimxml::HttpResponse response = front.answer(request);
    const auto time = std::chrono::steady_clock::now() - begin;
    const auto milliseconds = std::chrono::duration_cast<std::chrono::milliseconds>(time).count();
    lines.write(response.summary + ", " + std::to_string(milliseconds) + " ms");
    return response;
}

struct ServeOptions {
    std::string listen = "127.0.0.1:5988";
    unsigned int timeoutSeconds = HttpLimits().seconds;
};

int serve(const Options& options, const ServeOptions& serveOptions) {
    if (!options.faults.empty()) {
        throw BrokerError("--fault is for single requests; serve takes none");
    }
    const Address address = addressFrom(serveOptions.listen);
    const EndingSignals signals;
    RequestLines lines;
    EmbeddedBroker broker; // its end calls the providers' cleanup, when no request is left
    prepare(broker, options);
    tellCrashesInOneLine(broker);
    loadProviders(broker, options);
    apply(broker, options.conduct);
    const cimxml::Front front(broker, options.nameSpace);
    HttpLimits limits;
    limits.seconds = serveOptions.timeoutSeconds;
    HttpServer server(
        address, limits, [&](const cimxml::HttpRequest& request) { return answer(front, request, lines); },
        [&](const std::string& line) { lines.write(line); });
    std::cout << server.address().text() << std::endl;
    while (!signals.wait(std::chrono::seconds(1))) {
        server.endLateConnections();
    }
    return 0;
}

} // namespace

std::function<int(const Options&)> declareServe(CLI::App& command) {
    const auto serveOptions = std::make_shared<ServeOptions>(); // lives as long as the action
    command.add_option("--listen", serveOptions->listen, "where to listen; port 0 is any free one")
        ->type_name("ADDRESS:PORT")
        ->capture_default_str();
    command.add_option("--timeout", serveOptions->timeoutSeconds, "how long a request may take to come in")
        ->check(CLI::Range(1U, 3600U).description(""))
        ->type_name("SECONDS")
        ->capture_default_str();
    command.footer(serveFooter);
    return [serveOptions](const Options& options) { return serve(options, *serveOptions); };
}

} // namespace oxahv::runner
