#include "Runner.h"

#include <HVLogger.h>

#include <filesystem>
#include <iostream>

namespace {

constexpr int providerFailed = 1;

oxahv::Reply enumerateNames(oxahv::Request& request, const Options& options, const std::string& className) {
    oxahv::Reply reply = request.enumerateInstanceNames(request.objectPath(options.nameSpace, className));
    if (reply.ok()) {
        printPaths(std::cout, options.format, reply.objectPaths);
    }
    return reply;
}

oxahv::Reply enumerate(oxahv::Request& request, const Options& options, const std::string& className) {
    oxahv::Reply reply = request.enumerateInstances(request.objectPath(options.nameSpace, className));
    if (reply.ok()) {
        printInstances(std::cout, options.format, reply.instances);
    }
    return reply;
}

oxahv::Reply getInstance(oxahv::Request& request, const Options& options, const std::string& path) {
    oxahv::Reply reply = request.getInstance(request.objectPathFromText(path, options.nameSpace));
    if (reply.ok() && reply.instances.size() != 1) {
        reply.code = CMPI_RC_ERR_FAILED;
        reply.message =
            "the provider returned " + std::to_string(reply.instances.size()) + " instances in place of one";
    }
    if (reply.ok()) {
        printInstances(std::cout, options.format, reply.instances);
    }
    return reply;
}

// The MI name that a library's file stands for: its stem without "lib". A version behind ".so" is none of it.
std::string nameOf(const std::string& library) {
    const std::string file = std::filesystem::path(library).filename();
    const std::string stem = file.substr(0, file.find(".so"));
    return stem.rfind("lib", 0) == 0 ? stem.substr(3) : stem;
}

// SLOT:N[:CODE], where the slot's name may not hold a colon.
void inject(oxahv::EmbeddedBroker& broker, const std::string& text) {
    const std::size_t first = text.find(':');
    const std::size_t second = first != std::string::npos ? text.find(':', first + 1) : std::string::npos;
    const std::string number = first != std::string::npos ? text.substr(first + 1, second - first - 1) : "";
    if (number.empty() || number.size() > 9 || number.find_first_not_of("0123456789") != std::string::npos ||
        std::stoul(number) == 0) {
        throw oxahv::BrokerError("fault '" + text + "' is not SLOT:N[:CODE] with N from 1 on");
    }
    oxahv::Fault fault;
    fault.firstCall = static_cast<unsigned int>(std::stoul(number));
    if (second != std::string::npos) {
        fault.code = oxahv::codeFromName(text.substr(second + 1));
    }
    broker.injectFault(text.substr(0, first), fault);
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

} // namespace

const std::vector<Verb>& verbs() {
    static const std::vector<Verb> all = {
        {"ein", "CLASS", "enumerate the instance names of a class", enumerateNames},
        {"ei", "CLASS", "enumerate the instances of a class", enumerate},
        {"gi", "PATH", "get the instance with an object path", getInstance},
    };
    return all;
}

int run(const Options& options, const Verb& verb, const std::string& operand) {
    oxahv::EmbeddedBroker broker;
    if (options.showsTraces) {
        showTraces();
    }
    // A name without a folder would be looked for among the system's libraries.
    const std::string file = std::filesystem::absolute(options.library);
    broker.load(file, options.provider.empty() ? nameOf(options.library) : options.provider);
    broker.setKeyMode(options.keyMode);
    for (const std::string& fault : options.faults) {
        inject(broker, fault);
    }
    oxahv::Request request(broker);
    const oxahv::Reply reply = verb.perform(request, options, operand);
    if (!reply.ok()) {
        std::cerr << "oxahv-provider: " << oxahv::codeName(reply.code)
                  << (reply.message.empty() ? "" : ": " + reply.message) << '\n';
        return providerFailed;
    }
    return 0;
}
