// The associations of one instance: from both ends, through every filter.
#pragma once

#include "check/Client.h"

#include <optional>
#include <string>
#include <vector>

namespace oxahv::runner {

class Associations {
public:
    Associations(Client& client, std::string path, std::string identity)
        : client_(client), path_(std::move(path)), identity_(std::move(identity)) {}

    // Asks for what is associated with the instance. `isThorough`: through filters too, which for one
    // instance of a class is enough.
    void run(bool isThorough);

private:
    // One way from the instance to another: what filters select.
    struct Way {
        std::string associationClass;
        std::string associationPath;
        std::string associationIdentity;
        std::string role;
        std::string resultRole;
        std::string otherClass;
        std::string otherPath;
        std::string otherIdentity;
    };
    struct Replies {
        std::optional<Answer> objects;
        std::optional<Answer> names;
        bool areSame = true;
    };

    void readWays(const Answer& references);
    void checkOwnEnds();
    void checkOtherEnds();
    void runFilters();
    std::vector<AssociationFilter> filters() const;
    std::string unrelatedClass(const std::string& wanted) const;
    std::string superclass(const std::string& className) const;
    bool passes(const Way& way, const AssociationFilter& filter) const;
    bool passesClass(const std::string& className, const std::string& filter) const;
    Query query(const char* verb, const AssociationFilter& filter) const;
    std::optional<Answer> ask(const char* verb, const AssociationFilter& filter);
    Replies askBoth(const char* objects, const char* names, const AssociationFilter& filter);
    bool compareWithWays(const char* verb, const std::optional<Answer>& answer,
                         const AssociationFilter& filter);

    Client& client_;
    std::string path_;
    std::string identity_;
    std::vector<Way> ways_;
    bool knowsWays_ = false; // whether the provider tells the references
};

} // namespace oxahv::runner
