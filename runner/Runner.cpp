#include "Runner.h"

#include "check/CrashLine.h"
#include "show/ProgressLine.h"
#include "show/Text.h"

#include <HVLogger.h>

#include <filesystem>
#include <iostream>
#include <unistd.h>

namespace oxahv::runner {

namespace {

constexpr int providerFailed = 1;

bool yieldsMany(const Operation& operation) {
    return operation.yields == Yields::paths || operation.yields == Yields::instances;
}

// Sends the request. Of one that may yield any number of results, each is printed as it comes; while others
// run, and where the results do not go to a terminal, a line tells how far it has come.
Reply performed(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* target,
                const Operation& operation, const Operands& operands, ResultPrinter& printer) {
    ProgressLine line; // its end comes before an error is printed
    struct Handlers {
        Request& request;
        ~Handlers() {
            request.setProgressHandler(nullptr);
            request.setResultHandlers(nullptr, nullptr);
        }
    } const handlers = {request};
    if (yieldsMany(operation)) {
        request.setResultHandlers([&](const CMPIInstance* instance) { printer.print(instance); },
                                  [&](const CMPIObjectPath* path) { printer.print(path); });
    }
    if (!yieldsMany(operation) || ::isatty(STDOUT_FILENO) != 1) {
        request.setProgressHandler(
            [&](std::size_t results) { line.show(std::to_string(results) + " results so far"); });
    }
    return operation.perform(broker, request, target, operands);
}

// Prints what has not been printed as it came.
void printReply(const Options& options, const CMPIObjectPath* target, const Operands& operands, Yields yields,
                const Reply& reply, ResultPrinter& printer) {
    if (yields == Yields::methodResult) {
        printMethodResult(std::cout, options.format, target, operands.method, reply);
        return;
    }
    for (const CMPIObjectPath* const path : reply.objectPaths) {
        yields == Yields::onePath ? printer.print(path) : void();
    }
    for (const CMPIInstance* const instance : reply.instances) {
        yields == Yields::oneInstance ? printer.print(instance) : void();
    }
    printer.end();
}

// NAME=TEXT
void addContextEntry(EmbeddedBroker& broker, const std::string& text) {
    const std::size_t equals = text.find('=');
    if (equals == std::string::npos || equals == 0) {
        throw BrokerError("context entry '" + text + "' is not NAME=TEXT");
    }
    broker.setContextEntry(text.substr(0, equals), text.substr(equals + 1));
}

// SLOT:N[:CODE], where the slot's name may not hold a colon.
void inject(EmbeddedBroker& broker, const std::string& text) {
    const std::size_t first = text.find(':');
    const std::size_t second = first != std::string::npos ? text.find(':', first + 1) : std::string::npos;
    const std::string number = first != std::string::npos ? text.substr(first + 1, second - first - 1) : "";
    if (number.empty() || number.size() > 9 || number.find_first_not_of("0123456789") != std::string::npos ||
        std::stoul(number) == 0) {
        throw BrokerError("fault '" + text + "' is not SLOT:N[:CODE] with N from 1 on");
    }
    Fault fault;
    fault.firstCall = static_cast<unsigned int>(std::stoul(number));
    if (second != std::string::npos) {
        fault.code = codeFromName(text.substr(second + 1));
    }
    try {
        broker.injectFault(text.substr(0, first), fault);
    } catch (const BrokerError& error) {
        throw BrokerError(std::string(error.what()) +
                          "; name it by table and member, as CMPIObjectPathFT.addKey");
    }
}

// Every message reaches the logger twice; one of the two is shown.
void showTraces() {
    HVLog::HVLogger::setSink([](const HVLog::Message& message) {
        if (message.channel == HVLog::Channel::trace) {
            std::cerr << HVLog::HVLogger::lineOf(message) << '\n';
        }
    });
    HVLog::HVLogger::setThreshold(0);
}

// An answer of OK with another number of results than the operation has is the provider's mistake.
void requireOneResult(Yields yields, Reply& reply) {
    const bool isPath = yields == Yields::onePath;
    const std::size_t count = isPath ? reply.objectPaths.size() : reply.instances.size();
    if (reply.ok() && (isPath || yields == Yields::oneInstance) && count != 1) {
        reply.code = CMPI_RC_ERR_FAILED;
        reply.message = "the provider returned " + std::to_string(count) +
                        (isPath ? " paths" : " instances") + " in place of one";
    }
}

} // namespace

CMPIObjectPath* targetOf(Request& request, const Options& options, const Operation& operation,
                         const Operands& operands) {
    if (operation.target == Target::ofClass) {
        return request.objectPath(options.nameSpace, operands.target);
    }
    try {
        return request.objectPathFromText(operands.target, options.nameSpace);
    } catch (const BrokerError& error) {
        throw BrokerError(std::string(error.what()) + "; write it as Class.Key=\"text\",Number=3");
    }
}

void apply(EmbeddedBroker& broker, const Conduct& conduct) {
    broker.setKeyMode(conduct.keyMode);
    broker.setNewInstances(conduct.newInstances);
    broker.setPathDelivery(conduct.pathDelivery);
}

static void warn(const std::vector<MofWarning>& warnings) {
    for (const MofWarning& warning : warnings) {
        const std::string place =
            warning.file + ':' + std::to_string(warning.line) + ':' + std::to_string(warning.column);
        std::cerr << "oxahv-provider: warning: " << printable(place + ": " + warning.text) << '\n';
    }
}

void prepare(EmbeddedBroker& broker, const Options& options) {
    if (options.showsTraces) {
        showTraces();
    }
    for (const std::string& file : options.mofFiles) {
        warn(broker.compileMof(file, options.mof));
    }
    for (const std::string& entry : options.contextEntries) {
        addContextEntry(broker, entry);
    }
}

// A name without a folder would be looked for among the system's libraries.
static void load(EmbeddedBroker& broker, const Library& library) {
    const std::string name = providerName(library);
    try {
        broker.load(std::filesystem::absolute(library.file), name, library.classes);
    } catch (const BrokerError& error) {
        const std::string message = error.what();
        const bool isLoaded = message.rfind("cannot load", 0) != 0;
        const bool isFile = std::filesystem::is_regular_file(library.file);
        throw BrokerError(message + (isLoaded ? "; is " + name + " its MI name? Else give it with --provider"
                                     : isFile ? "; ldd shows what the library needs and what it lacks"
                                              : "; give the path of the provider's library with --library"));
    }
}

void loadProviders(EmbeddedBroker& broker, const Options& options) {
    for (const Library& library : options.libraries) {
        load(broker, library);
    }
}

int run(const Options& options, const Operation& operation, const Operands& operands) {
    EmbeddedBroker broker;
    prepare(broker, options);
    tellCrashesInOneLine(broker);
    loadProviders(broker, options);
    apply(broker, options.conduct);
    for (const std::string& fault : options.faults) {
        inject(broker, fault);
    }
    Request request(broker);
    const CMPIObjectPath* const target = targetOf(request, options, operation, operands);
    ResultPrinter printer(std::cout, options.format);
    Reply reply = performed(broker, request, target, operation, operands, printer);
    broker.clearFaults(); // they are the request's; what is printed is asked of the broker too
    requireOneResult(operation.yields, reply);
    if (!reply.ok()) {
        if (!printer.isEmpty()) {
            printer.end();
            std::cout.flush(); // the error comes last
        }
        std::cerr << "oxahv-provider: " << codeName(reply.code)
                  << (reply.message.empty() ? "" : ": " + printable(reply.message)) << '\n';
        return providerFailed;
    }
    printReply(options, target, operands, operation.yields, reply, printer);
    return 0;
}

} // namespace oxahv::runner
