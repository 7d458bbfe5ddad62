#include "Watch.h"

#include "Runner.h"
#include "check/CrashLine.h"
#include "serve/Signals.h"
#include "show/Output.h"
#include "show/Text.h"

#include <CLI/CLI.hpp>

#include <iostream>
#include <memory>

namespace oxahv::runner {

namespace {

constexpr int refused = 1;

constexpr const char* watchFooter =
    R"(Subscribes for the indications of a class as a CIM client does, and prints each as it comes, until
Ctrl-C or as many as --count says. A query names the class itself. With --output json each
indication is an array of one object. Exit status 1 when no provider takes the subscription.

  oxahv-provider --library ./libDemoPort.so --mof Demo.mof watch Demo_LinkDown
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof watch --query \
      "SELECT * FROM Demo_LinkDown WHERE Port = 'eth0'" --count 1)";

struct WatchOptions {
    std::string className;
    std::string query;
    std::string language = "WQL";
    unsigned long count = 0; // 0: until Ctrl-C
};

// Prints what comes. The subscription's end, and with it the provider's deactivation, follows.
void printIndications(EmbeddedBroker& broker, Subscription& subscription, const WatchOptions& watched,
                      const Options& options, const EndingSignals& signals) {
    for (unsigned long printed = 0; watched.count == 0 || printed < watched.count;) {
        const Request request(broker); // owns the indication
        if (CMPIInstance* const indication = subscription.next(std::chrono::milliseconds(100))) {
            ResultPrinter printer(std::cout, options.format);
            printer.print(indication);
            printer.end();
            std::cout.flush();
            ++printed;
        } else if (!std::cout || signals.wait(std::chrono::milliseconds(0))) {
            return;
        }
    }
}

int watch(const Options& options, const WatchOptions& watched) {
    if (watched.className.empty() == watched.query.empty()) {
        throw BrokerError("watch takes either a CLASS or --query");
    }
    const EndingSignals signals;
    EmbeddedBroker broker;
    prepare(broker, options);
    tellCrashesInOneLine(broker);
    loadProviders(broker, options);
    apply(broker, options.conduct);
    const std::string query = watched.query.empty() ? "SELECT * FROM " + watched.className : watched.query;
    try {
        Subscription subscription(broker, {query, watched.language, options.nameSpace});
        printIndications(broker, subscription, watched, options, signals);
    } catch (const SubscriptionError& error) {
        std::cerr << "oxahv-provider: " << codeName(error.code()) << ": " << printable(error.what()) << '\n';
        return refused;
    }
    return 0;
}

} // namespace

Action declareWatch(CLI::App& command) {
    const auto watched = std::make_shared<WatchOptions>(); // lives as long as the action
    command.add_option("CLASS", watched->className, "the class of the indications")->type_name("");
    command.add_option("--query", watched->query, "only what this query selects, in place of a CLASS")
        ->type_name("QUERY");
    command.add_option("--language", watched->language, "the query's language")
        ->type_name("NAME")
        ->capture_default_str();
    command.add_option("--count", watched->count, "end after this many; else at Ctrl-C")
        ->check(CLI::Range(1UL, 1000000000UL).description(""))
        ->type_name("N");
    command.footer(watchFooter);
    return [watched](const Options& options) { return watch(options, *watched); };
}

} // namespace oxahv::runner
