#include "serve/HttpServer.h"

#include "serve/Connections.h"
#include "serve/Workers.h"

#include <Descriptor.h>

#include <atomic>
#include <cerrno>
#include <charconv>
#include <chrono>
#include <condition_variable>
#include <cstring>
#include <microhttpd.h>
#include <mutex>
#include <stdexcept>

namespace oxahv::runner {

namespace {

using cimxml::HttpRequest;
using cimxml::HttpResponse;

// One request and its response, from the header's arrival until the response is sent.
struct Exchange {
    HttpRequest request;
    HttpResponse response;
    Connection* connection = nullptr;
    bool isTooLarge = false;
    bool isStarted = false;  // whether it has been handed to a worker
    bool isAnswered = false; // set by the worker before it resumes the connection
};

HttpResponse plainResponse(int status, const std::string& text) {
    HttpResponse response;
    response.status = status;
    response.headers = {{"Content-Type", "text/plain; charset=\"utf-8\""}, {"Connection", "close"}};
    response.body = text + '\n';
    response.summary = "refused with status " + std::to_string(status) + ": " + text;
    return response;
}

MHD_Result takeHeader(void* request, MHD_ValueKind /*kind*/, const char* name, const char* value) {
    static_cast<HttpRequest*>(request)->headers.emplace_back(name, value != nullptr ? value : "");
    return MHD_YES;
}

// The announced length of the body; 0 where none is announced, or no number.
unsigned long long announcedLength(const HttpRequest& request) {
    const std::string* const text = request.find("Content-Length");
    unsigned long long length = 0;
    if (text != nullptr && std::from_chars(text->data(), text->data() + text->size(), length).ec ==
                               std::errc::result_out_of_range) {
        return ~0ULL;
    }
    return length;
}

int listeningSocket(const Address& address, unsigned int backlog) {
    const auto require = [&](bool succeeded) {
        if (!succeeded) {
            throw std::runtime_error("cannot listen on " + address.text() + ": " + std::strerror(errno));
        }
    };
    files::Descriptor socket(::socket(address.storage.ss_family, SOCK_STREAM | SOCK_CLOEXEC, 0));
    require(socket.isOpen());
    const int yes = 1; // else the port stays taken for a minute after the last server's end
    require(::setsockopt(socket.get(), SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes) == 0);
    require(::bind(socket.get(), address.get(), address.size) == 0);
    require(::listen(socket.get(), static_cast<int>(backlog)) == 0);
    return socket.release();
}

} // namespace

// The functions that the HTTP library calls run on its one thread, and must not throw.
class HttpServer::Impl {
public:
    Impl(const Address& address, const HttpLimits& limits, Handler handler, Observer observer)
        : limits_(limits), handler_(std::move(handler)), observer_(std::move(observer)),
          connections_(std::chrono::seconds(limits.seconds)),
          workers_(limits.threads, limits.waitingRequests) {
        socket_ = listeningSocket(address, limits.connections);
        address_ = addressOf(socket_);
        daemon_ = MHD_start_daemon(MHD_USE_AUTO | MHD_USE_INTERNAL_POLLING_THREAD | MHD_USE_ITC |
                                       MHD_ALLOW_SUSPEND_RESUME,
                                   0, nullptr, nullptr, take, this,                        //
                                   MHD_OPTION_LISTEN_SOCKET, socket_,                      //
                                   MHD_OPTION_CONNECTION_LIMIT, limits.connections,        //
                                   MHD_OPTION_CONNECTION_MEMORY_LIMIT, limits.headerBytes, //
                                   MHD_OPTION_CONNECTION_TIMEOUT, 2 * limits.seconds,      //
                                   MHD_OPTION_NOTIFY_CONNECTION, connectionChanged, this,  //
                                   MHD_OPTION_URI_LOG_CALLBACK, requestBegun, this,        //
                                   MHD_OPTION_NOTIFY_COMPLETED, requestCompleted, this,    //
                                   MHD_OPTION_END);
        if (daemon_ == nullptr) {
            ::close(socket_);
            throw std::runtime_error("cannot start the HTTP server on " + address.text());
        }
    }

    ~Impl() {
        isEnding_ = true;
        const int socket = MHD_quiesce_daemon(daemon_);
        if (socket >= 0) {
            ::close(socket);
        }
        workers_.finish();
        {
            // What has been answered is sent now, unless a client does not read it.
            std::unique_lock<std::mutex> lock(mutex_);
            allSent_.wait_for(lock, std::chrono::seconds(2), [this] { return answering_ == 0; });
        }
        MHD_stop_daemon(daemon_);
    }

    Impl(const Impl&) = delete;
    Impl& operator=(const Impl&) = delete;

    const Address& address() const { return address_; }

    void endLateConnections() {
        for (unsigned int count = connections_.endLateOnes(); count > 0; --count) {
            observer_("refused with status 408: the request did not come within " +
                      std::to_string(limits_.seconds) + " seconds");
        }
    }

private:
    static Connection* connectionOf(MHD_Connection* connection) {
        const MHD_ConnectionInfo* const info =
            MHD_get_connection_info(connection, MHD_CONNECTION_INFO_SOCKET_CONTEXT);
        return info != nullptr ? static_cast<Connection*>(info->socket_context) : nullptr;
    }

    static void connectionChanged(void* self, MHD_Connection* connection, void** context,
                                  MHD_ConnectionNotificationCode code) {
        Connections& connections = static_cast<Impl*>(self)->connections_;
        if (code == MHD_CONNECTION_NOTIFY_CLOSED) {
            if (*context != nullptr) {
                connections.close(static_cast<Connection*>(*context));
            }
            return;
        }
        try {
            const MHD_ConnectionInfo* const info =
                MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD);
            *context = info != nullptr ? connections.open(info->connect_fd) : nullptr;
        } catch (const std::bad_alloc&) {
            *context = nullptr; // refused when its request comes
        }
    }

    // What it returns is what the next function finds as its context.
    static void* requestBegun(void* self, const char* /*uri*/, MHD_Connection* connection) {
        if (Connection* const known = connectionOf(connection)) {
            static_cast<Impl*>(self)->connections_.begin(*known);
        }
        return nullptr;
    }

    static MHD_Result take(void* self, MHD_Connection* connection, const char* /*url*/, const char* method,
                           const char* /*version*/, const char* data, std::size_t* size, void** context) {
        try {
            return static_cast<Impl*>(self)->take(connection, method, data, size, context);
        } catch (const std::bad_alloc&) {
            return MHD_NO; // closes the connection
        }
    }

    // Called when the header has come, then with every part of the body, at its end, and once more when the
    // connection goes on after its request has been answered.
    MHD_Result take(MHD_Connection* connection, const char* method, const char* data, std::size_t* size,
                    void** context) {
        auto* exchange = static_cast<Exchange*>(*context);
        if (exchange == nullptr) {
            return begin(connection, method, context);
        }
        if (*size != 0) {
            append(*exchange, data, *size);
            *size = 0;
            return MHD_YES;
        }
        if (exchange->isAnswered) {
            return send(connection, exchange->response);
        }
        connections_.received(*exchange->connection);
        if (exchange->isTooLarge) {
            return refuseSize(connection, *exchange);
        }
        return start(connection, *exchange);
    }

    MHD_Result begin(MHD_Connection* connection, const char* method, void** context) {
        Connection* const known = connectionOf(connection);
        if (known == nullptr) {
            return MHD_NO;
        }
        auto exchange = std::make_unique<Exchange>();
        exchange->connection = known;
        exchange->request.method = method;
        MHD_get_connection_values(connection, MHD_HEADER_KIND, takeHeader, &exchange->request);
        exchange->isTooLarge = announcedLength(exchange->request) > limits_.bodyBytes;
        const bool isRefused = exchange->isTooLarge || isEnding_;
        Exchange& taken = *exchange;
        *context = exchange.release();
        if (!isRefused) {
            return MHD_YES; // the body comes next
        }
        connections_.received(*known);
        return taken.isTooLarge ? refuseSize(connection, taken)
                                : refuse(connection, taken, 503, "the server is ending");
    }

    void append(Exchange& exchange, const char* data, std::size_t size) const {
        std::string& body = exchange.request.body;
        exchange.isTooLarge = exchange.isTooLarge || size > limits_.bodyBytes - body.size();
        if (exchange.isTooLarge) {
            body.clear(); // the rest is read, since HTTP allows no answer in the middle, but not kept
        } else {
            body.append(data, size);
        }
    }

    // Hands a whole request to a worker. The connection rests until that has the response.
    MHD_Result start(MHD_Connection* connection, Exchange& exchange) {
        {
            const std::lock_guard<std::mutex> lock(mutex_);
            ++answering_;
            exchange.isStarted = true;
        }
        MHD_suspend_connection(connection);
        const bool isTaken = workers_.add([this, connection, &exchange] {
            try {
                exchange.response = handler_(exchange.request);
            } catch (const std::bad_alloc&) {
                exchange.response = HttpResponse();
                exchange.response.status = 503;
            }
            exchange.isAnswered = true;
            MHD_resume_connection(connection);
        });
        if (!isTaken) {
            exchange.response = plainResponse(503, "too many requests are waiting");
            observer_(exchange.response.summary);
            exchange.isAnswered = true;
            MHD_resume_connection(connection);
        }
        return MHD_YES;
    }

    MHD_Result refuseSize(MHD_Connection* connection, Exchange& exchange) {
        return refuse(connection, exchange, 413,
                      "the body is larger than " + std::to_string(limits_.bodyBytes) + " bytes");
    }

    MHD_Result refuse(MHD_Connection* connection, Exchange& exchange, int status, const std::string& text) {
        exchange.response = plainResponse(status, text);
        observer_(exchange.response.summary);
        return send(connection, exchange.response);
    }

    // The response's texts live as long as its exchange, which ends after they are sent.
    static MHD_Result send(MHD_Connection* connection, HttpResponse& response) {
        MHD_Response* const made = MHD_create_response_from_buffer(response.body.size(), response.body.data(),
                                                                   MHD_RESPMEM_PERSISTENT);
        if (made == nullptr) {
            return MHD_NO;
        }
        for (const auto& [name, value] : response.headers) {
            MHD_add_response_header(made, name.c_str(), value.c_str());
        }
        const MHD_Result result =
            MHD_queue_response(connection, static_cast<unsigned int>(response.status), made);
        MHD_destroy_response(made);
        return result;
    }

    static void requestCompleted(void* self, MHD_Connection* /*connection*/, void** context,
                                 MHD_RequestTerminationCode /*code*/) {
        const std::unique_ptr<Exchange> exchange(static_cast<Exchange*>(*context));
        *context = nullptr;
        if (exchange == nullptr) {
            return;
        }
        Impl& impl = *static_cast<Impl*>(self);
        impl.connections_.answered(*exchange->connection);
        if (exchange->isStarted) {
            const std::lock_guard<std::mutex> lock(impl.mutex_);
            --impl.answering_;
            impl.allSent_.notify_all();
        }
    }

    const HttpLimits limits_;
    const Handler handler_;
    const Observer observer_;
    Address address_;
    Connections connections_;
    std::atomic<bool> isEnding_{false};
    std::mutex mutex_;
    std::condition_variable allSent_;
    unsigned int answering_ = 0; // exchanges from their start until they are over
    Workers workers_;
    int socket_ = -1;
    MHD_Daemon* daemon_ = nullptr;
};

HttpServer::HttpServer(const Address& address, const HttpLimits& limits, Handler handler, Observer observer)
    : impl_(std::make_unique<Impl>(address, limits, std::move(handler), std::move(observer))) {}

HttpServer::~HttpServer() = default;

Address HttpServer::address() const {
    return impl_->address();
}

void HttpServer::endLateConnections() {
    impl_->endLateConnections();
}

} // namespace oxahv::runner
