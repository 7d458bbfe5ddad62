// What every client does with a class, and what is looked at meanwhile.
#pragma once

#include "check/Client.h"

#include <optional>
#include <string>
#include <vector>

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

    Client& client_;
    bool hasNames_ = false; // whether the provider lists names, and instances
    bool hasInstances_ = false;
    Results names_; // those of the instances when it lists none
    Results instances_;
};

// Looks at one result of a query for `className`: class, keys, texts. An empty name: any class.
void checkResult(Client& client, const std::string& request, const Result& result,
                 const std::string& className);

// Reports paths that stand twice.
void checkDuplicates(Client& client, const std::string& request, const std::vector<Result>& results);

// What only one of two lists holds: "only among WHAT: PATH", empty if nothing.
std::string differenceOf(const std::vector<Result>& first, const std::string& firstName,
                         const std::vector<Result>& second, const std::string& secondName);

// Looks at what a method yielded.
void checkMethodResult(Client& client, const Query& query, const Answer& answer);

// Whether a provider may answer so to say that it does not do such a thing.
bool isRefusal(CMPIrc code);
