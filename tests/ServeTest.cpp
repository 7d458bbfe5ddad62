// The verb serve as a process: with a client that nobody here wrote, with clients that behave badly, and its
// end.
#include "Command.h"

#include <chrono>
#include <csignal>
#include <memory>
#include <netinet/in.h>
#include <pty.h>
#include <regex>
#include <sys/socket.h>
#include <thread>
#include <vector>

namespace {

const std::string kept = std::string(" --library " KEPT_PROVIDER " --mof " MOF_FIXTURES "/Kept.mof ");

// A serving command, which is ended with its test.
class Server {
public:
    explicit Server(const std::string& options = kept, const std::string& serveOptions = "") {
        // On a terminal of its own, where both output streams end.
        process_ = ::forkpty(&output_, nullptr, nullptr, nullptr);
        if (process_ == 0) {
            const std::string command =
                "exec " RUNNER + options + " serve --listen 127.0.0.1:0 " + serveOptions;
            ::execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
            ::_exit(127);
        }
        const std::string address = line();
        port_ = static_cast<in_port_t>(std::atoi(address.c_str() + address.find(':') + 1));
        EXPECT_EQ(address, "127.0.0.1:" + std::to_string(port_));
    }
    ~Server() {
        if (process_ > 0) {
            end(SIGKILL);
        }
    }
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    in_port_t port() const { return port_; }
    std::string url() const { return "http://localhost:" + std::to_string(port_) + "/root/cimv2:"; }

    // The next line of its output.
    std::string line() const {
        std::string text;
        for (char c = 0; ::read(output_, &c, 1) == 1 && c != '\n';) {
            text += c;
        }
        return text.substr(0, text.find('\r'));
    }

    // Its exit status; -1 when a signal has ended it.
    int end(int signal) {
        ::kill(process_, signal);
        int status = 0;
        ::waitpid(process_, &status, 0);
        ::close(output_);
        process_ = 0;
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

private:
    int output_ = -1;
    pid_t process_ = 0;
    in_port_t port_ = 0;
};

// A connection of a client.
class Client {
public:
    explicit Client(const Server& server) : socket_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_in address = {};
        address.sin_family = AF_INET;
        address.sin_port = htons(server.port());
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        isConnected_ = ::connect(socket_, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0;
    }
    ~Client() { ::close(socket_); }
    Client(const Client&) = delete;
    Client& operator=(const Client&) = delete;

    bool isConnected() const { return isConnected_; }
    bool send(const std::string& text) const {
        return ::send(socket_, text.data(), text.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(text.size());
    }
    // All that comes until the server ends the connection.
    std::string receiveAll() const {
        std::string text;
        char buffer[4096];
        for (ssize_t size = 0; (size = ::recv(socket_, buffer, sizeof buffer, 0)) > 0;) {
            text.append(buffer, static_cast<std::size_t>(size));
        }
        return text;
    }

private:
    int socket_;
    bool isConnected_ = false;
};

const std::string body =
    R"(<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ>)"
    R"(<IMETHODCALL NAME="EnumerateClassNames"><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/>)"
    R"(<NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH></IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>)";

const std::string header = "POST /cimom HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n"
                           "Content-Type: application/xml\r\nCIMOperation: MethodCall\r\n"
                           "CIMMethod: EnumerateClassNames\r\nCIMObject: root/cimv2\r\n";

std::string goodRequest() {
    return header + "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

std::string statusOf(const std::string& response) {
    return response.substr(0, response.find("\r\n"));
}

std::string answerTo(const Server& server, const std::string& request) {
    const Client client(server);
    client.send(request);
    return client.receiveAll();
}

TEST(ServeTest, TalksToAClientOfTheField) {
    if (shell("command -v wbemcli").status != 0) {
        GTEST_SKIP() << "wbemcli is not installed";
    }
    const Server server;
    struct Row {
        std::string verb;
        std::string target;
        std::string operands;
        std::string output; // NS is the server and namespace
    };
    const std::string a = "Kept_Thing.Id=\"a\"";
    const std::string b = "Kept_Special.Id=\"b\"";
    const std::string link = "Kept_Link.Earlier=root/cimv2:" + a + ",Later=root/cimv2:" + b;
    const auto error = [](const std::string& text) { return "*\n* wbemcli: Cim: " + text + "\n*"; };
    const std::vector<Row> rows = {
        {"ein", "Kept_Thing", "", ""},
        {"ci", a,
         "'Id=\"a\",Text=\"Grün &amp; &lt;b>\",U8=200,S64=-9223372036854775808,R64=2.5,Flag=TRUE,"
         "When=20260329013000.000250+060,Numbers=1,2,3,Texts=\"x\",\"ü\"'",
         "NS" + a},
        {"ci", a, "'Id=\"a\"'", error("(11) CIM_ERR_ALREADY_EXISTS: there is a thing a")},
        {"ci", b, "'Id=\"b\",Extra=\"more\"'", "NS" + b},
        {"ein", "Kept_Thing", "", "NS" + a + "\nNS" + b},
        {"ei", "Kept_Special", "Id,Extra", "NS" + b + " Id=\"b\",Extra=\"more\""},
        {"gi", a, "Text,U8,S64,R64,Flag,When,Numbers,Texts",
         "NS" + a +
             " Flag=TRUE,U8=200,S64=-9223372036854775808,R64=2.5,Text=\"Grün & <b>\","
             "When=20260329013000.000250+060,Numbers=1,2,3,Texts=\"x\",\"ü\""},
        {"mi", a, "'Text=\"neu\",U8=7'", ""},
        {"sp", a, "'U16=9'", ""},
        {"gi", a, "Text,U8,U16", "NS" + a + " U8=7,U16=9,Text=\"neu\""},
        {"gp", a, "Text", "neu"},
        {"gi", "'Kept_Thing.Id=\"c\"'", "",
         error("(6) CIM_ERR_NOT_FOUND: there is no such instance of class Kept_Thing")},
        {"ain", a, "", "NS" + b},
        {"ain -ac Kept_Link -ar Earlier", a, "", "NS" + b},
        {"ain -ar Later", a, "", ""},
        {"ain -arc Kept_Special -arr Later", a, "", "NS" + b},
        {"ai", b, "Id,U8", "NS" + a + " Id=\"a\",U8=7"},
        {"rin", b, "", "NS" + link},
        {"ri -ar Later", b, "", "NS" + link + " Earlier=root/cimv2:" + a + ",Later=root/cimv2:" + b},
        {"cm", a,
         "'Exchange.Flag=TRUE,Number=5,Long=-3,Real=0.5,Text=\"Höhe\",Texts=\"p\",\"q\","
         "When=20260329013000.000250+060,Letter=x'",
         "NS" + a +
             " Exchange: 5, Flag (boolean): FALSE, Letter (char16): x, Number (uint8): 5, Long (sint64): -3, "
             "Real (real64): 0.5, Text (string): Höhe, Texts (string): p,q, "
             "When (datetime): 20260329013000.000250+060"},
        {"cm", a, "Refuse", error("(2) CIM_ERR_ACCESS_DENIED: nöt <this>")},
        {"cm", a, "Odd", error("(17) CIM_ERR_METHOD_NOT_FOUND: class Kept_Thing has no method Odd")},
        {"ecn", "", "", "NSKept_Link\nNSKept_Part\nNSKept_Special\nNSKept_Thing"},
        {"gc", "Kept_Part", "", "NSKept_Part Name=,Sizes="},
        {"di", a, "", ""},
        {"di", a, "", error("(6) CIM_ERR_NOT_FOUND: there is no such thing")},
        {"ein", "Kept_Thing", "", "NS" + b},
        {"ein", "No_Such", "", error("(5) CIM_ERR_INVALID_CLASS: class No_Such is not declared")},
    };
    const std::string place = server.url().substr(std::string("http://").size());
    for (const Row& row : rows) {
        std::string target = row.target;
        target.erase(std::remove(target.begin(), target.end(), '\''), target.end());
        const std::string command =
            "timeout 60 wbemcli " + row.verb + " '" + server.url() + target + "' " + row.operands + " 2>&1";
        std::string expected = row.output;
        for (std::size_t at = 0; (at = expected.find("NSKept", at)) != std::string::npos;) {
            expected.replace(at, 2, place);
        }
        std::string output = shell(command).output;
        output.resize(output.find_last_not_of('\n') + 1);
        EXPECT_EQ(output, expected) << command;
    }
}

TEST(ServeTest, ShowsEachRequestOnATerminal) {
    const Server server;
    const std::string response = answerTo(server, goodRequest());
    EXPECT_EQ(statusOf(response), "HTTP/1.1 200 OK");
    EXPECT_NE(response.find("\r\nCIMOperation: MethodResponse\r\n"), std::string::npos) << response;
    EXPECT_NE(response.find("<CLASSNAME NAME=\"Kept_Thing\"/>"), std::string::npos);
    EXPECT_EQ(statusOf(answerTo(server, "GET / HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n")),
              "HTTP/1.1 405 Method Not Allowed");
    const std::string time = "[0-9]{2}:[0-9]{2}:[0-9]{2} ";
    const std::string first = server.line();
    EXPECT_TRUE(std::regex_match(first, std::regex(time + "EnumerateClassNames, [0-9]+ ms"))) << first;
    const std::string second = server.line();
    EXPECT_TRUE(std::regex_match(second, std::regex(time + "refused with status 405: only POST and M-POST "
                                                           "requests carry CIM operations, [0-9]+ ms")))
        << second;
}

TEST(ServeTest, EndsWithTheProvidersCleanup) {
    for (const int signal : {SIGINT, SIGTERM}) {
        const File ended;
        Server server(kept + "--context KeptEndFile=" + ended.path());
        const Client idle(server);
        answerTo(server, goodRequest());
        EXPECT_EQ(server.end(signal), 0);
        std::ifstream file(ended.path());
        EXPECT_EQ(std::string(std::istreambuf_iterator<char>(file), {}), "ended");
        EXPECT_EQ(idle.receiveAll(), "");
    }
}

TEST(ServeTest, SurvivesClientsThatBehaveBadly) {
    const Server server(kept, "--timeout 1");
    struct Row {
        std::string request;
        std::string status;
    };
    const std::string long32 = std::string(40'000, 'x');
    const std::vector<Row> rows = {
        {"\x16\x03\x01\x02\x01\xFF\r\n\r\n", ""},
        {"POST / HTTP/1.1\r\nno header\r\n\r\n", "HTTP/1.1 400 Bad Request"},
        {header + "X: " + long32 + "\r\n\r\n", "HTTP/1.1 431 Request Header Fields Too Large"},
        {header + "Content-Length: 4194305\r\n\r\n", "HTTP/1.1 413 Content Too Large"},
        {header + "Content-Length: 99999999999999999999\r\n\r\n", "HTTP/1.1 413 Content Too Large"},
        {header + "Content-Length: x\r\n\r\n", "HTTP/1.1 400 Bad Request"},
        {header + "Content-Length: 100\r\n\r\nhalf", "HTTP/1.1 408 Request Timeout"},
        {header, "HTTP/1.1 408 Request Timeout"},
        {"PO", ""},
        {header + "Content-Length: 1\r\n\r\nx", "HTTP/1.1 400 Bad Request"},
        {"FLY" + goodRequest().substr(4), "HTTP/1.1 405 Method Not Allowed"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(statusOf(answerTo(server, row.request)), row.status) << row.request.substr(0, 300);
    }
    const Client slow(server); // never silent for long, and never done
    slow.send(header + "Content-Length: 100000\r\n\r\n");
    while (slow.send("x")) {
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    EXPECT_EQ(statusOf(slow.receiveAll()), "HTTP/1.1 408 Request Timeout");
    EXPECT_EQ(statusOf(answerTo(server, goodRequest())), "HTTP/1.1 200 OK");
}

TEST(ServeTest, SurvivesClientsThatWantTooMuch) {
    const Server server;
    const Client large(server); // announces no size
    large.send(header + "Transfer-Encoding: chunked\r\n\r\n");
    for (int i = 0; i < 65; ++i) {
        large.send("10000\r\n" + std::string(0x10000, ' ') + "\r\n");
    }
    large.send("0\r\n\r\n");
    EXPECT_EQ(statusOf(large.receiveAll()), "HTTP/1.1 413 Content Too Large");

    std::vector<std::unique_ptr<Client>> idle; // more than the server holds
    for (int i = 0; i < 600; ++i) {
        idle.push_back(std::make_unique<Client>(server));
        if (i % 2 == 0) {
            idle.back()->send(goodRequest().substr(0, static_cast<std::size_t>(i)));
        }
    }
    idle.resize(500); // the server learns of it soon
    std::string response;
    for (int i = 0; i < 100 && response.empty(); ++i) {
        response = answerTo(server, goodRequest());
        std::this_thread::sleep_for(std::chrono::milliseconds(response.empty() ? 100 : 0));
    }
    EXPECT_EQ(statusOf(response), "HTTP/1.1 200 OK");
}

TEST(ServeTest, AnswersSeveralClientsAtOnce) {
    Server server;
    std::vector<std::thread> clients;
    for (int i = 0; i < 8; ++i) {
        clients.emplace_back([&server] {
            for (int request = 0; request < 50; ++request) {
                EXPECT_EQ(statusOf(answerTo(server, goodRequest())), "HTTP/1.1 200 OK");
            }
        });
    }
    for (std::thread& client : clients) {
        client.join();
    }
    EXPECT_EQ(server.end(SIGINT), 0);
}

TEST(ServeTest, ListensOnThisMachineAlone) {
    const std::string own =
        ": only this machine's own addresses are served, 127.0.0.1 and [::1]: requests are "
        "not authenticated";
    const std::string form = ": write it as 127.0.0.1:5988, port 0 for any free one";
    const std::string port = ": the port is a number from 0 to 65535";
    const auto refuses = [](const std::string& address, const std::string& why) {
        expectFailure(kept + "serve --listen '" + address + "'", 2,
                      "cannot listen on '" + address + '\'' + why);
    };
    refuses("0.0.0.0:5988", own);
    refuses("[::]:5988", own);
    refuses("192.168.1.1:5988", own);
    refuses("example.com:5988", own);
    refuses("localhost", form);
    refuses("localhost:", port);
    refuses("localhost:65536", port);
    refuses("localhost:5988x", port);
    const Server server;
    const std::string taken = "127.0.0.1:" + std::to_string(server.port());
    expectFailure(kept + "serve --listen " + taken, 2,
                  "cannot listen on " + taken + ": Address already in use");
    expectFailure(kept + "--fault getKey:1 serve", 2, "--fault is for single requests; serve takes none");
}

} // namespace
