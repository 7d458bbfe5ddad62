// A provider's answer as plain values, to be kept and compared when the request is gone.
#pragma once

#include <EmbeddedBroker.h>
#include <Names.h>

#include <map>
#include <string>
#include <vector>

namespace oxahv::runner {

struct PlainData {
    CMPIType type = CMPI_null;
    bool isNull = true;
    bool isUtf8 = true;                  // whether all its texts are
    std::string text;                    // as MOF writes it
    std::string identity;                // of a reference: the identity of the path, else the text
    std::string referredClass{};         // of a reference: the class of the path
    std::string referredPath{};          // and the path, as a command line takes it
    std::vector<std::string> elements{}; // of numbers and texts, of arrays too: each as it is, without quotes
};

bool operator==(const PlainData& a, const PlainData& b);

using NamedData = std::map<std::string, PlainData, encoding::NameLess>;

// An instance or an object path.
struct Result {
    std::string className;
    std::string nameSpace{};
    std::string path;     // as a command line takes it
    std::string identity; // the same for all paths of one instance, whatever their order of keys
    bool isInstance = false;
    NamedData keys;
    NamedData properties; // of an instance
};

struct Answer {
    CMPIrc code = CMPI_RC_OK;
    std::string message;
    bool isDone = false;
    std::vector<Result> results;
    std::vector<PlainData> data; // a method's return value
    NamedData out;               // and its output arguments

    bool ok() const { return code == CMPI_RC_OK; }
};

// Copies a reply. A namespace that is missing or `nameSpace` is no part of an identity.
Answer answerOf(const Reply& reply, const std::string& nameSpace);

// Whether there is a value of that name that is not NULL.
bool hasValue(const NamedData& values, const std::string& name);

// "uint8", "uint8[]"
std::string typeText(CMPIType type);

// "CMPI_RC_ERR_FAILED: text"
std::string wordsOf(const Answer& answer);

} // namespace oxahv::runner
