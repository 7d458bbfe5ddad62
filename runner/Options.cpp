#include "Options.h"

#include "show/Text.h"

#include <CLI/CLI.hpp>

#include <filesystem>
#include <functional>
#include <map>

namespace oxahv::runner {

namespace {

// The options that are words on the command line and something else behind it.
struct Words {
    std::string format = "mof";
    std::string keyMode = "exact";
    std::string newInstances = "full";
    std::vector<std::string> pathChanges;

    void putInto(Options& options) const {
        options.format = format == "json" ? Format::json : Format::mof;
        options.hasConduct = keyMode != "exact" || newInstances != "full" || !pathChanges.empty();
        Conduct& conduct = options.conduct;
        conduct.keyMode = keyModes.at(keyMode);
        conduct.newInstances = newInstances == "bare" ? NewInstances::bare : NewInstances::full;
        for (const std::string& change : pathChanges) {
            conduct.pathDelivery.reversesKeys = conduct.pathDelivery.reversesKeys || change == "reversed";
            conduct.pathDelivery.changesCase = conduct.pathDelivery.changesCase || change == "case";
            if (change == "host") {
                conduct.pathDelivery.hostName = "host.example.com";
            }
        }
    }

    static inline const std::map<std::string, KeyMode> keyModes = {
        {"exact", KeyMode::exact}, {"untyped", KeyMode::untyped}, {"signed", KeyMode::signedIntegers},
        {"chars", KeyMode::chars}, {"text", KeyMode::text},
    };
};

// Each --provider and --serves is of the --library before it, or of the first one where none is.
class LibraryOptions {
public:
    explicit LibraryOptions(std::vector<Library>& libraries) : libraries_(libraries) {}

    void addTo(CLI::App& app) {
        add(app, "--library", "a provider's library; repeatable", "FILE", [this](const std::string& file) {
            if (isAhead_) {
                libraries_.back().file = file;
                isAhead_ = false;
            } else {
                libraries_.push_back({file});
            }
        });
        add(app, "--provider", "the MI name in it; else the file's stem without 'lib'", "NAME",
            [this](const std::string& name) { current().provider = name; });
        add(app, "--serves", "the classes that it serves; else all that it answers for", "CLASS,...",
            [this](const std::string& text) { current().classes = namesIn(text); });
    }

private:
    static CLI::Option* add(CLI::App& app, const char* name, const char* help, const char* type,
                            const std::function<void(const std::string&)>& take) {
        return app.add_option_function<std::string>(name, take, help)
            ->type_name(type)
            ->multi_option_policy(CLI::MultiOptionPolicy::TakeLast)
            ->trigger_on_parse();
    }
    Library& current() {
        if (libraries_.empty()) {
            libraries_.emplace_back();
            isAhead_ = true;
        }
        return libraries_.back();
    }

    std::vector<Library>& libraries_;
    bool isAhead_ = false; // the last one's file is still to come
};

void addOptions(CLI::App& app, Options& options, Words& words) {
    app.add_option("--mof", options.mofFiles, "declare the classes of a MOF file; repeatable")
        ->type_name("FILE")
        ->allow_extra_args(false);
    app.add_flag("--strict", options.mof.isStrict, "refuse MOF that breaks a rule of DSP0004");
    app.add_option("--namespace", options.nameSpace, "the namespace of the request")
        ->type_name("NS")
        ->capture_default_str();
    app.add_option("--output", words.format, "how results are printed: mof or json")
        ->check(CLI::IsMember({"mof", "json"}).description(""))
        ->type_name("FORM");
    app.add_flag("--trace", options.showsTraces, "show the provider's traces on the standard error stream");
    app.add_option("--keys", words.keyMode, "how keys reach it: exact, untyped, signed, chars or text")
        ->check(CLI::IsMember({"exact", "untyped", "signed", "chars", "text"}).description(""))
        ->type_name("MODE");
    app.add_option("--new-instance", words.newInstances,
                   "its path's keys are properties (full) or not (bare)")
        ->check(CLI::IsMember({"full", "bare"}).description(""))
        ->type_name("MODE");
    app.add_option("--path", words.pathChanges, "change paths: keys reversed, other case, a host; repeatable")
        ->check(CLI::IsMember({"reversed", "case", "host"}).description(""))
        ->type_name("CHANGE")
        ->allow_extra_args(false);
    app.add_option("--context", options.contextEntries, "an entry of the provider's context; repeatable")
        ->type_name("NAME=TEXT")
        ->allow_extra_args(false);
    app.add_option("--fault", options.faults,
                   "fail the N-th call of a slot, with ERR_FAILED or CODE; repeatable")
        ->type_name("SLOT:N[:CODE]")
        ->allow_extra_args(false);
}

// The MI name that a library's file stands for: its stem without "lib". A version behind ".so" is none of it.
std::string nameOf(const std::string& library) {
    const std::string file = std::filesystem::path(library).filename();
    const std::string stem = file.substr(0, file.find(".so"));
    return stem.rfind("lib", 0) == 0 ? stem.substr(3) : stem;
}

} // namespace

class OptionReader::State {
public:
    State(CLI::App& app, Options& options) : options_(options), libraries_(options.libraries) {
        libraries_.addTo(app);
        addOptions(app, options, words_);
    }
    void finish() { words_.putInto(options_); }

private:
    Options& options_;
    LibraryOptions libraries_;
    Words words_;
};

OptionReader::OptionReader(CLI::App& app, Options& options) : state_(std::make_unique<State>(app, options)) {}
OptionReader::~OptionReader() = default;

void OptionReader::finish() {
    state_->finish();
}

std::string providerName(const Library& library) {
    return library.provider.empty() ? nameOf(library.file) : library.provider;
}

} // namespace oxahv::runner
