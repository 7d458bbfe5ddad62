#include "serve/Address.h"

#include <arpa/inet.h>
#include <charconv>
#include <cstring>
#include <netinet/in.h>
#include <stdexcept>

namespace oxahv::runner {

namespace {

[[noreturn]] void refuse(const std::string& text, const char* why) {
    throw std::runtime_error("cannot listen on '" + text + "': " + why);
}

template <class SocketAddress>
Address addressWith(const SocketAddress& address) {
    Address result;
    std::memcpy(&result.storage, &address, sizeof address);
    result.size = sizeof address;
    return result;
}

template <class SocketAddress>
SocketAddress as(const Address& address) {
    SocketAddress result{};
    std::memcpy(&result, &address.storage, sizeof result);
    return result;
}

in_port_t portIn(const std::string& text, const std::string& digits) {
    unsigned short port = 0;
    const char* const end = digits.data() + digits.size();
    const auto [rest, error] = std::from_chars(digits.data(), end, port);
    if (error != std::errc() || rest != end) {
        refuse(text, "the port is a number from 0 to 65535");
    }
    return htons(port);
}

constexpr const char* onlyLoopback =
    "only this machine's own addresses are served, 127.0.0.1 and [::1]: requests are not authenticated";

Address fourBytes(const std::string& text, const in_addr& host, in_port_t port) {
    if (ntohl(host.s_addr) >> 24U != 127) {
        refuse(text, onlyLoopback);
    }
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_port = port;
    address.sin_addr = host;
    return addressWith(address);
}

Address sixteenBytes(const std::string& text, const in6_addr& host, in_port_t port) {
    if (!IN6_IS_ADDR_LOOPBACK(&host)) {
        refuse(text, onlyLoopback);
    }
    sockaddr_in6 address = {};
    address.sin6_family = AF_INET6;
    address.sin6_port = port;
    address.sin6_addr = host;
    return addressWith(address);
}

} // namespace

std::string Address::text() const {
    char host[INET6_ADDRSTRLEN] = "";
    if (storage.ss_family == AF_INET6) {
        const auto address = as<sockaddr_in6>(*this);
        ::inet_ntop(AF_INET6, &address.sin6_addr, host, sizeof host);
        return '[' + std::string(host) + "]:" + std::to_string(ntohs(address.sin6_port));
    }
    const auto address = as<sockaddr_in>(*this);
    ::inet_ntop(AF_INET, &address.sin_addr, host, sizeof host);
    return std::string(host) + ':' + std::to_string(ntohs(address.sin_port));
}

Address addressFrom(const std::string& text) {
    const std::size_t colon = text.rfind(':');
    if (colon == std::string::npos) {
        refuse(text, "write it as 127.0.0.1:5988, port 0 for any free one");
    }
    std::string host = text.substr(0, colon);
    const in_port_t port = portIn(text, text.substr(colon + 1));
    if (host.size() > 2 && host.front() == '[' && host.back() == ']') {
        host = host.substr(1, host.size() - 2);
    }
    if (host == "localhost") {
        host = "127.0.0.1";
    }
    in_addr four = {};
    if (::inet_pton(AF_INET, host.c_str(), &four) == 1) {
        return fourBytes(text, four, port);
    }
    in6_addr six = {};
    if (::inet_pton(AF_INET6, host.c_str(), &six) == 1) {
        return sixteenBytes(text, six, port);
    }
    refuse(text, onlyLoopback);
}

Address addressOf(int socket) {
    Address address;
    address.size = sizeof address.storage;
    ::getsockname(socket, reinterpret_cast<sockaddr*>(&address.storage), &address.size);
    return address;
}

} // namespace oxahv::runner
