// An open file descriptor and its owner.
#pragma once

#include <unistd.h>

// NOLINTNEXTLINE(cert-dcl58-cpp): a namespace of our own, not one of the standard
namespace posix {

// Closes the descriptor at its end. A negative number, such as a failed open() returns, is no open file.
class Descriptor {
public:
    explicit Descriptor(int number) : number_(number) {}
    ~Descriptor() { close(); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    bool isOpen() const { return number_ >= 0; }
    int get() const { return number_; }

    // Closes it early. Returns false when that fails: some file systems report a failed write only now.
    bool close() {
        const int number = number_;
        number_ = -1;
        return number < 0 || ::close(number) == 0;
    }

private:
    int number_;
};

} // namespace posix
