#include "serve/Connections.h"

#include <string_view>
#include <sys/socket.h>

namespace oxahv::runner {

namespace {

constexpr std::string_view timeoutResponse =
    "HTTP/1.1 408 Request Timeout\r\nConnection: close\r\nContent-Length: 0\r\n\r\n";

} // namespace

Connection* Connections::open(int socket) {
    const std::lock_guard<std::mutex> lock(mutex_);
    Connection& connection = open_.emplace_back();
    connection.socket = socket;
    connection.place = std::prev(open_.end());
    connection.deadline = std::chrono::steady_clock::now() + limit_;
    return &connection;
}

void Connections::change(Connection& connection, Connection::State state) {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (state != Connection::State::receiving) { // its time runs since the connection has been idle
        connection.deadline = std::chrono::steady_clock::now() + limit_;
    }
    connection.state = state;
}

void Connections::begin(Connection& connection) {
    change(connection, Connection::State::receiving);
}

void Connections::received(Connection& connection) {
    change(connection, Connection::State::answering);
}

void Connections::answered(Connection& connection) {
    change(connection, Connection::State::idle);
}

void Connections::close(Connection* connection) {
    const std::lock_guard<std::mutex> lock(mutex_);
    open_.erase(connection->place);
}

unsigned int Connections::endLateOnes() {
    const std::lock_guard<std::mutex> lock(mutex_); // keeps the sockets from being closed and used anew
    unsigned int requests = 0;
    const auto now = std::chrono::steady_clock::now();
    for (Connection& connection : open_) {
        if (connection.state == Connection::State::answering || connection.deadline > now) {
            continue;
        }
        if (connection.state == Connection::State::receiving) {
            ::send(connection.socket, timeoutResponse.data(), timeoutResponse.size(),
                   MSG_DONTWAIT | MSG_NOSIGNAL);
            ++requests;
        }
        // The library sees the end of the connection and closes the socket.
        ::shutdown(connection.socket, SHUT_RDWR);
        connection.state = Connection::State::answering;
    }
    return requests;
}

} // namespace oxahv::runner
