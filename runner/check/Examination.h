// What every client does with a class, and what is looked at meanwhile.
#pragma once

#include "check/Client.h"

#include <optional>
#include <string>
#include <vector>

namespace oxahv::runner {

class Examination {
public:
    explicit Examination(Client& client) : client_(client) {}

    // Sends all queries of the task's class. Tells the parent whether the class is served.
    void run();

private:
    using Results = std::vector<Result>;

    bool enumerate();
    std::optional<Results> list(const char* verb);
    void compareNames();
    void lookUp(const Result& name);
    void compareProperties(const std::string& request, const Result& got);
    void lookUpAbsent();
    void askForProperties();
    bool yieldsMore(const Result& result, const std::vector<std::string>& wanted) const;
    void checkList(const Query& query, const std::vector<std::string>& wanted);
    void callMethods();
    void write();
    std::string pathOfAbsent() const;
    const std::string& methodTarget() const;

    Client& client_;
    bool hasNames_ = false; // whether the provider lists names, and instances
    bool hasInstances_ = false;
    Results names_; // those of the instances when it lists none
    Results instances_;
};

} // namespace oxahv::runner
