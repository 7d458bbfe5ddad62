// Addresses to listen on, of this machine alone.
#pragma once

#include <string>
#include <sys/socket.h>

namespace oxahv::runner {

// Of the loopback interface, numeric, with a port.
struct Address {
    sockaddr_storage storage{};
    socklen_t size = 0;

    const sockaddr* get() const { return reinterpret_cast<const sockaddr*>(&storage); }
    // "127.0.0.1:5988" or "[::1]:5988".
    std::string text() const;
};

// The address of a text "HOST:PORT": HOST is localhost, a numeric address, or one in brackets. Throws
// std::runtime_error for any other text, and for an address that other machines reach.
Address addressFrom(const std::string& text);

// The address that a socket is bound to.
Address addressOf(int socket);

} // namespace oxahv::runner
