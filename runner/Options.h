// The options that every verb takes, as plain values and as the command line gives them.
#pragma once

#include "show/Output.h"

#include <EmbeddedBroker.h>

#include <memory>
#include <string>
#include <vector>

namespace CLI {
class App;
}

namespace oxahv::runner {

// One provider of a library.
struct Library {
    std::string file;
    std::string provider{};             // the MI name; empty: by the file's name
    std::vector<std::string> classes{}; // that it serves; empty: all that it answers for
};

// How the broker serves requests, where CIM servers differ.
struct Conduct {
    KeyMode keyMode = KeyMode::exact;
    NewInstances newInstances = NewInstances::full;
    PathDelivery pathDelivery{};
};

struct Options {
    std::vector<Library> libraries; // the first is the one that a check is about
    std::string nameSpace = "root/cimv2";
    Format format = Format::mof;
    bool showsTraces = false;
    Conduct conduct;
    bool hasConduct = false; // whether the user has asked for any
    std::vector<std::string> mofFiles;
    MofOptions mof;
    std::vector<std::string> contextEntries; // NAME=TEXT
    std::vector<std::string> faults;         // SLOT:N[:CODE]
};

// Declares these options on the command line and keeps what it reads of them.
class OptionReader {
public:
    // Both arguments have to outlive this object.
    OptionReader(CLI::App& app, Options& options);
    ~OptionReader();
    OptionReader(const OptionReader&) = delete;
    OptionReader& operator=(const OptionReader&) = delete;

    // Completes the options when the command line is parsed.
    void finish();

private:
    class State;
    std::unique_ptr<State> state_;
};

// The MI name: the option, or what the library's file stands for.
std::string providerName(const Library& library);

} // namespace oxahv::runner
