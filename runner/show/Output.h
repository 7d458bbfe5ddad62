// How instances, object paths and methods' results are printed.
#pragma once

#include <EmbeddedBroker.h>

#include <ostream>
#include <string>
#include <vector>

namespace oxahv::runner {

enum class Format { mof, json };

// Prints instances and object paths, one as soon as it comes: as MOF-like text and a path a line, or as one
// JSON array of objects, where a path's properties are its keys.
class ResultPrinter {
public:
    // Keeps the reference.
    ResultPrinter(std::ostream& out, Format format) : out_(out), format_(format) {}

    void print(const CMPIInstance* instance);
    void print(const CMPIObjectPath* path);
    // Ends the array, also of a request that has failed in the middle.
    void end();
    bool isEmpty() const { return count_ == 0; }

private:
    std::string& begin();
    void write();

    std::ostream& out_;
    Format format_;
    std::size_t count_ = 0;
    std::string text_; // of the result that is being printed
};

// As MOF-like lines, the return value first, or as a JSON array of one object.
void printMethodResult(std::ostream& out, Format format, const CMPIObjectPath* path,
                       const std::string& method, const Reply& reply);

} // namespace oxahv::runner
