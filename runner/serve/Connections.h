// The connections of an HTTP server, and how long each may take to send a request.
#pragma once

#include <chrono>
#include <list>
#include <mutex>

namespace oxahv::runner {

// One connection. Nobody but Connections looks into it.
class Connection {
    friend class Connections;
    enum class State { idle, receiving, answering };

    int socket = -1;
    State state = State::idle;
    std::chrono::steady_clock::time_point deadline;
    std::list<Connection>::iterator place;
};

// Thread-safe. The library that reads the sockets limits how long one may be silent; a client that sends a
// byte now and then needs a limit for its whole request.
class Connections {
public:
    explicit Connections(std::chrono::seconds limit) : limit_(limit) {}

    Connection* open(int socket);
    // The first line of a request has come.
    void begin(Connection& connection);
    // The whole request has come: the time for its answer is the provider's.
    void received(Connection& connection);
    // The answer is sent, and another request may come.
    void answered(Connection& connection);
    void close(Connection* connection);

    // Answers requests that take too long with status 408 and ends their connections, and those on which
    // nothing comes. Returns how many requests there were. To be called every second or so.
    unsigned int endLateOnes();

private:
    void change(Connection& connection, Connection::State state);

    const std::chrono::seconds limit_;
    std::mutex mutex_;
    std::list<Connection> open_;
};

} // namespace oxahv::runner
