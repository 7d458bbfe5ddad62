#include "check/Passes.h"

#include "check/Examination.h"
#include "check/LostTexts.h"
#include "check/MethodArguments.h"
#include "check/Residue.h"
#include "check/Strain.h"
#include "check/Unloading.h"

namespace oxahv::runner {

namespace {

void load(Client& client) {
    client.broker().setUnservedHandler([&client](const std::string& className) {
        client.tell({Message::Kind::unserved, 0, className});
    });
    client.broker().setMessageHandler([&client](const BrokerMessage& message) {
        if (message.isBrokers) {
            client.find(CheckKind::exception, cleaningUp, message.text);
        }
    });
    client.doing(loading, [&] { loadProviders(client.broker(), client.options()); });
}

void unloadProviders(Client& client) {
    client.doing(cleaningUp, [&] {
        for (const Library& library : client.options().libraries) {
            client.broker().unload(providerName(library));
        }
    });
}

void endProvider(Client& client, std::size_t before) {
    if (client.task().skipped.count(cleaningUp) != 0) {
        return;
    }
    unloadProviders(client);
    const std::size_t after = client.broker().liveObjects().total();
    if (after > before) {
        client.find(CheckKind::leftOver, cleaningUp,
                    "objects left at the end: " + std::to_string(after - before));
    }
}

// What a child does with a client, told to the parent when it fails.
template <class Work>
void runClient(EmbeddedBroker& broker, const Options& options, const CheckTask& task, ChildOutput& output,
               bool reports, const Work& work) {
    Client client(broker, options, task, output, reports);
    if (!options.showsTraces) { // which have the logger's sink
        countLostTexts();
    }
    try {
        work(client);
    } catch (const std::exception& exception) {
        client.tell({Message::Kind::unusable, 0, exception.what()});
    }
    broker.setUnservedHandler(nullptr);
    broker.setMessageHandler(nullptr);
}

} // namespace

const std::vector<Pass>& passes() {
    constexpr auto full = NewInstances::full;
    static const std::vector<Pass> all = {
        {"exact keys", {}, true, nullptr},
        {"untyped keys", {KeyMode::untyped}, true, strainByConduct},
        {"signed keys", {KeyMode::signedIntegers}, true, strainByConduct},
        {"chars keys", {KeyMode::chars}, true, strainByConduct},
        {"text keys", {KeyMode::text}, true, strainByConduct},
        {"bare instances", {KeyMode::exact, NewInstances::bare}, true, nullptr},
        {"reversed keys", {KeyMode::exact, full, {true, false, ""}}, true, strainByConduct},
        {"other case", {KeyMode::exact, full, {false, true, ""}}, true, strainByConduct},
        {"host", {KeyMode::exact, full, {false, false, "host.example.com"}}, true, strainByConduct},
        {"threads", {}, false, strainByThreads},
        {"faults", {}, false, strainByFaults},
    };
    return all;
}

void runPass(EmbeddedBroker& broker, const Options& options, const CheckTask& task, const Pass& pass,
             ChildOutput& output) {
    const std::size_t before = broker.liveObjects().total();
    runClient(broker, options, task, output, true, [&](Client& client) {
        load(client);
        apply(broker, pass.conduct);
        if (pass.examines) {
            Examination(client).run();
        }
        if (pass.strain != nullptr) {
            pass.strain(client);
        }
        if (pass.examines) {
            endProvider(client, before);
        }
    });
}

void runArguments(const EmbeddedBroker& declared, const Options& options, const CheckTask& task,
                  ChildOutput& output) {
    EmbeddedBroker bare;
    Options without = options;
    without.mofFiles.clear();
    runClient(bare, without, task, output, true, [&](Client& client) {
        prepare(bare, without);
        load(client);
        for (const KnownQuery& known : task.known) {
            const Operands& operands = known.query.operands;
            if (known.query.operation->takes == Takes::method) {
                callWithWrongTypes(client, declared, operands.target,
                                   {task.className, operands.method, operands.values});
            }
        }
    });
}

void runResidue(EmbeddedBroker& broker, const Options& options, const CheckTask& task, ChildOutput& output) {
    runClient(broker, options, task, output, true, [&](Client& client) {
        findResidue(
            client, [&] { load(client); },
            [&] {
                if (task.skipped.count(cleaningUp) == 0) {
                    unloadProviders(client);
                }
            });
    });
}

void runUnloading(EmbeddedBroker& broker, const Options& options, const CheckTask& task,
                  const std::vector<std::string>& classes, ChildOutput& output) {
    runClient(broker, options, task, output, false, [&](Client& client) { // what requests show has been told
        load(client);
        for (const std::string& className : classes) {
            client.askPlainly(queryOf("ei", className));
            const std::optional<Answer> names = client.askPlainly(queryOf("ein", className));
            if (names && !names->results.empty()) {
                client.askPlainly(queryOf("gi", names->results.front().path));
            }
        }
        unloadProviders(client);
        client.setReports(true);
        for (const Library& library : options.libraries) {
            const std::string why = whyStillMapped(library.file);
            if (!why.empty()) {
                client.find(CheckKind::staysMapped, cleaningUp,
                            providerName(library) + " stays mapped when it is unloaded: " + why);
            }
        }
    });
}

} // namespace oxahv::runner
