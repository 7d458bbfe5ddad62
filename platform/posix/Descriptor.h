// An open file descriptor and its owner.
#pragma once

#include <unistd.h>

// Not posix, the name of the folder: C++ reserves that namespace.
namespace files {

// Closes the descriptor at its end. A negative number, such as a failed open() returns, is no open file.
class Descriptor {
public:
    explicit Descriptor(int number) : number_(number) {}
    ~Descriptor() { close(); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    bool isOpen() const { return number_ >= 0; }
    int get() const { return number_; }

    // Leaves it open, for the caller to close.
    int release() {
        const int number = number_;
        number_ = -1;
        return number;
    }

    // Closes it early. Returns false when that fails: some file systems report a failed write only now.
    bool close() {
        const int number = number_;
        number_ = -1;
        return number < 0 || ::close(number) == 0;
    }

private:
    int number_;
};

} // namespace files
