// Creates, changes and deletes instances, sends queries, and undoes what it has changed.
#pragma once

#include "check/Client.h"

#include <string>
#include <vector>

namespace oxahv::runner {

class Writing {
public:
    // `names` are the class's instances, and `absent` the path of one that does not exist; empty: none can
    // be made.
    Writing(Client& client, const std::vector<Result>& instances, std::string absent)
        : client_(client), instances_(instances), absent_(std::move(absent)) {}

    // What the provider does not do is reported as untested.
    void run();

private:
    Query write(const char* verb, const std::string& path, const std::vector<std::string>& values) const;
    bool isDone(const Query& query, const std::optional<Answer>& answer);
    std::optional<CMPIrc> codeOfGet(const std::string& path);
    void createAndDelete();
    void checkNew(const Query& creation, const std::string& path);
    void deleteAgain(const std::string& path);
    void modify();
    bool modifyTo(const std::string& path, const std::string& property, const std::string& value);
    void sendQueries();
    void require(bool isRight, const Query& query, const std::string& what);

    Client& client_;
    const std::vector<Result>& instances_;
    std::string absent_;
};

} // namespace oxahv::runner
