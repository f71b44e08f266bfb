//===-- tools/editor/Server.cpp - the editor's HTTP server on loopback ----===//
#include "Server.h"

#include "Editor.h"

#include "Port/SafeFile.h"

#include <nlohmann/json.hpp>

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <map>
#include <optional>
#include <sstream>
#include <vector>

namespace VnTool {

namespace {

using Clock = std::chrono::steady_clock;

const char kLoopback[] = "127.0.0.1";

// The page is small; anything bigger in its folder is not ours to serve.
constexpr std::uint64_t kMaxPageFile = std::uint64_t{4} << 20;

// Answers not yet sent past this stop a connection's reading: a client that pipelines
// requests without reading the answers cannot make the server hold them all.
constexpr std::size_t kMaxPendingOut = std::size_t{8} << 20;

const char* MimeOf(const std::filesystem::path& path) {
    static const std::map<std::string, const char*> kTypes{
        {".html", "text/html; charset=utf-8"},
        {".css", "text/css; charset=utf-8"},
        {".js", "text/javascript; charset=utf-8"},
        {".mjs", "text/javascript; charset=utf-8"},
        {".svg", "image/svg+xml"},
        {".png", "image/png"}};
    auto it = kTypes.find(path.extension().string());
    return it == kTypes.end() ? nullptr : it->second;
}

const char* StatusText(int status) {
    static const std::map<int, const char*> kTexts{{200, "OK"},
                                                   {400, "Bad Request"},
                                                   {403, "Forbidden"},
                                                   {404, "Not Found"},
                                                   {405, "Method Not Allowed"},
                                                   {408, "Request Timeout"},
                                                   {409, "Conflict"},
                                                   {411, "Length Required"},
                                                   {413, "Content Too Large"},
                                                   {415, "Unsupported Media Type"},
                                                   {421, "Misdirected Request"},
                                                   {431, "Request Header Fields Too Large"},
                                                   {500, "Internal Server Error"},
                                                   {501, "Not Implemented"}};
    auto it = kTexts.find(status);
    return it == kTexts.end() ? "Status" : it->second;
}

std::string Lower(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return text;
}

std::string Trim(const std::string& text) {
    const auto first = text.find_first_not_of(" \t");
    const auto last = text.find_last_not_of(" \t");
    return first == std::string::npos ? "" : text.substr(first, last - first + 1);
}

struct Request {
    std::string method;
    std::string path; // the target without its query
    std::string version;
    std::map<std::string, std::string> headers; // by lower-case name
    std::string body;

    std::string Header(const std::string& name) const {
        auto it = headers.find(name);
        return it == headers.end() ? "" : it->second;
    }
    bool Has(const std::string& name) const { return headers.count(name) != 0; }
};

struct Response {
    int status = 200;
    std::string type = "application/json";
    std::string body;
    bool close = false; // the connection ends after this answer
};

Response Refusal(int status, const std::string& why, bool close = false) {
    Response response;
    response.status = status;
    response.body = nlohmann::json{{"error", why}}.dump(-1, ' ', false,
                                                        nlohmann::json::error_handler_t::replace);
    response.close = close;
    return response;
}

std::string Serialise(const Response& response) {
    std::string out =
        "HTTP/1.1 " + std::to_string(response.status) + " " + StatusText(response.status) + "\r\n";
    out += "Content-Type: " + response.type + "\r\n";
    out += "Content-Length: " + std::to_string(response.body.size()) + "\r\n";
    out += "Cache-Control: no-store\r\nX-Content-Type-Options: nosniff\r\n";
    out += "Content-Security-Policy: default-src 'self'; img-src 'self' data:; "
           "style-src 'self'\r\n";
    out += response.close ? "Connection: close\r\n\r\n" : "Connection: keep-alive\r\n\r\n";
    return out + response.body;
}

// Where a head stands while it arrives: its end, or a refusal once it breaks a bound.
enum class HeadState { Partial, Whole, TooLarge };

HeadState ScanHead(const std::string& in, const ServerLimits& limits, std::size_t& end) {
    end = in.find("\r\n\r\n");
    if (end != std::string::npos) {
        end += 4;
        const auto lines = static_cast<std::size_t>(
            std::count(in.begin(), in.begin() + static_cast<std::ptrdiff_t>(end), '\n'));
        return end > limits.headBytes || lines > limits.headLines + 2 ? HeadState::TooLarge
                                                                      : HeadState::Whole;
    }
    const auto lines = static_cast<std::size_t>(std::count(in.begin(), in.end(), '\n'));
    return in.size() > limits.headBytes || lines > limits.headLines + 2 ? HeadState::TooLarge
                                                                        : HeadState::Partial;
}

// The request line and headers; a reason when they are not HTTP/1.x.
bool ParseHead(const std::string& head, Request& request, std::string& why) {
    std::istringstream lines(head);
    std::string line;
    std::getline(lines, line);
    if (line.empty() || line.back() != '\r') {
        why = "the request line is malformed";
        return false;
    }
    line.pop_back();
    std::istringstream first(line);
    std::string target;
    first >> request.method >> target >> request.version;
    std::string extra;
    if (request.method.empty() || target.empty() || target[0] != '/' || (first >> extra) ||
        request.version.rfind("HTTP/1.", 0) != 0) {
        why = "the request line is malformed";
        return false;
    }
    request.path = target.substr(0, target.find('?'));
    while (std::getline(lines, line) && line != "\r") {
        const auto colon = line.find(':');
        if (line.empty() || line.back() != '\r' || colon == std::string::npos || colon == 0) {
            why = "a header line is malformed";
            return false;
        }
        line.pop_back();
        std::string name = Lower(line.substr(0, colon));
        std::string value = Trim(line.substr(colon + 1));
        auto [it, fresh] = request.headers.emplace(name, value);
        if (!fresh && it->second != value && (name == "content-length" || name == "host")) {
            why = "the request repeats " + name + " with another value";
            return false;
        }
    }
    return true;
}

// How many body bytes the head announces; a refusal when the framing is not taken.
std::optional<Response> BodyLength(const Request& request, const ServerLimits& limits,
                                   std::size_t& length) {
    length = 0;
    if (request.Has("transfer-encoding")) {
        return Refusal(411, "send the body with a Content-Length; other framings are not taken",
                       true);
    }
    if (!request.Has("content-length")) {
        if (request.method == "POST") {
            return Refusal(411, "a change needs a Content-Length", true);
        }
        return std::nullopt;
    }
    const std::string text = request.Header("content-length");
    if (text.empty() || text.size() > 12 ||
        text.find_first_not_of("0123456789") != std::string::npos) {
        return Refusal(400, "the Content-Length is no number", true);
    }
    length = std::stoull(text);
    if (length > limits.body) {
        return Refusal(413, "the body is larger than 1 MB", true);
    }
    return std::nullopt;
}

// A refused request's sender may still be sending: its bytes are read and dropped for a
// while after the answer, so that the answer is not lost to a reset.
constexpr std::size_t kMaxDrained = std::size_t{8} << 20;
constexpr auto kDrainTime = std::chrono::milliseconds(1000);

struct Connection {
    enum class Phase { Head, Body, Closing, Draining };
    int fd = -1;
    Phase phase = Phase::Head;
    std::string in;
    std::string out;
    Request request;
    std::size_t bodyLength = 0;
    Clock::time_point deadline;
    bool started = false; // a byte of the current request has come
    std::size_t drained = 0;
};

} // namespace

struct EditorServer::Imp {
    Imp(Editor& e, ServerLimits l) : editor(e), limits(l) {}
    Editor& editor;
    ServerLimits limits;
    struct File {
        std::string mime;
        std::string bytes;
    };
    std::map<std::string, File> files; // by URL path
    std::atomic<bool> stopped{false};
    int port = 0;
    int listener = -1;
    int wake[2] = {-1, -1}; // Stop() writes a byte to end the poll
    std::map<int, Connection> connections;

    ~Imp() {
        for (auto& [fd, connection] : connections) {
            ::close(fd);
        }
        for (int fd : {listener, wake[0], wake[1]}) {
            if (fd >= 0) {
                ::close(fd);
            }
        }
    }

    // A loopback name or address with our port; nothing else may name us.
    bool HostAllowed(const Request& request) const {
        const std::string host = request.Header("host");
        const std::string suffix = ":" + std::to_string(port);
        return host == kLoopback + suffix || host == "localhost" + suffix;
    }

    bool OriginAllowed(const Request& request) const {
        if (!request.Has("origin")) {
            return true; // not a browser's cross-origin request
        }
        const std::string origin = request.Header("origin");
        const std::string suffix = ":" + std::to_string(port);
        return origin == "http://127.0.0.1" + suffix || origin == "http://localhost" + suffix;
    }

    Response Api(const Request& request) const {
        if (request.method == "POST") {
            if (request.Header("content-type").rfind("application/json", 0) != 0) {
                return Refusal(415, "changes come as application/json");
            }
            if (!OriginAllowed(request)) {
                return Refusal(403, "requests from another origin are refused");
            }
        }
        EditorReply reply = editor.Handle(request.method, request.path, request.body);
        Response response;
        response.status = reply.status;
        response.type = std::move(reply.type);
        response.body = std::move(reply.body);
        return response;
    }

    Response Serve(const Request& request) const {
        if (!HostAllowed(request)) {
            return Refusal(421, "this server answers only to 127.0.0.1 and localhost with its "
                                "own port");
        }
        if (request.path.rfind("/api/", 0) == 0) {
            return Api(request);
        }
        if (request.method != "GET") {
            return Refusal(405, "the page's files are read with GET");
        }
        const std::string path = request.path == "/" ? "/index.html" : request.path;
        auto it = files.find(path);
        if (it == files.end()) {
            return Refusal(404, "no such page: " + ClipForMessage(request.path));
        }
        Response response;
        response.type = it->second.mime;
        response.body = it->second.bytes;
        return response;
    }

    void Answer(Connection& c, const Response& response) {
        c.out += Serialise(response);
        if (response.close || c.request.version == "HTTP/1.0" ||
            Lower(c.request.Header("connection")) == "close") {
            c.phase = Connection::Phase::Closing;
            c.in.clear();
            return;
        }
        c.phase = Connection::Phase::Head;
        c.request = Request{};
        c.started = false;
        c.deadline = Clock::now() + limits.idleTime;
    }

    // Takes what has come on `c` as far as it goes: heads, bodies, answers.
    void Advance(Connection& c) {
        while (c.phase != Connection::Phase::Closing && c.out.size() < kMaxPendingOut) {
            if (c.phase == Connection::Phase::Head) {
                if (!c.in.empty() && !c.started) {
                    c.started = true;
                    c.deadline = Clock::now() + limits.headTime;
                }
                if (!TakeHead(c)) {
                    return;
                }
                continue;
            }
            if (c.in.size() < c.bodyLength) {
                return;
            }
            c.request.body = c.in.substr(0, c.bodyLength);
            c.in.erase(0, c.bodyLength);
            Answer(c, Serve(c.request));
        }
    }

    // False when no whole head has come yet, or the connection is closing.
    bool TakeHead(Connection& c) {
        std::size_t end = 0;
        switch (ScanHead(c.in, limits, end)) {
        case HeadState::Partial:
            return false;
        case HeadState::TooLarge:
            Answer(c, Refusal(431,
                              "the request's head is over its limit of " +
                                  std::to_string(limits.headBytes) + " bytes or " +
                                  std::to_string(limits.headLines) + " lines",
                              true));
            return false;
        case HeadState::Whole:
            break;
        }
        std::string why;
        if (!ParseHead(c.in.substr(0, end), c.request, why)) {
            Answer(c, Refusal(400, why, true));
            return false;
        }
        c.in.erase(0, end);
        if (auto refused = BodyLength(c.request, limits, c.bodyLength)) {
            Answer(c, *refused);
            return false;
        }
        c.phase = Connection::Phase::Body;
        c.deadline = Clock::now() + limits.bodyTime;
        return true;
    }

    static std::string ClipForMessage(const std::string& text) {
        return text.size() <= 200 ? text : text.substr(0, 200) + "...";
    }

    void Accept() {
        for (;;) {
            const int fd = ::accept4(listener, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC);
            if (fd < 0) {
                return;
            }
            if (connections.size() >= limits.connections) {
                ::close(fd);
                continue;
            }
            // An answer is written whole in one go; no need to wait for acknowledgements.
            int yes = 1;
            ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof(yes));
            Connection& c = connections[fd];
            c.fd = fd;
            c.deadline = Clock::now() + limits.idleTime;
        }
    }

    // False when the connection is done with.
    bool Read(Connection& c) {
        char buffer[16384];
        const ssize_t got = ::recv(c.fd, buffer, sizeof buffer, 0);
        if (got == 0 || (got < 0 && errno != EAGAIN && errno != EINTR)) {
            return false;
        }
        if (c.phase == Connection::Phase::Draining) {
            c.drained += got > 0 ? static_cast<std::size_t>(got) : 0;
            return got < 0 || c.drained < kMaxDrained;
        }
        if (got > 0 && c.phase != Connection::Phase::Closing) {
            c.in.append(buffer, static_cast<std::size_t>(got));
            Advance(c);
        }
        return true;
    }

    bool Write(Connection& c) {
        const ssize_t sent = ::send(c.fd, c.out.data(), c.out.size(), MSG_NOSIGNAL);
        if (sent < 0) {
            return errno == EAGAIN || errno == EINTR;
        }
        c.out.erase(0, static_cast<std::size_t>(sent));
        if (c.out.empty() && c.phase == Connection::Phase::Closing) {
            ::shutdown(c.fd, SHUT_WR);
            c.phase = Connection::Phase::Draining;
            c.deadline = Clock::now() + kDrainTime;
            return true;
        }
        Advance(c); // requests held back while answers were pending
        return true;
    }

    // A connection past its deadline: a request that was coming gets 408, an idle one ends.
    void Expire(Connection& c) {
        if (c.phase == Connection::Phase::Closing || c.phase == Connection::Phase::Draining ||
            (!c.started && c.phase == Connection::Phase::Head)) {
            c.phase = Connection::Phase::Closing;
            c.out.clear();
            return;
        }
        Answer(c, Refusal(408, "the request did not come in time", true));
    }

    int PollTimeout() const {
        auto next = Clock::now() + std::chrono::seconds(1);
        for (const auto& [fd, c] : connections) {
            next = std::min(next, c.deadline);
        }
        auto wait = std::chrono::duration_cast<std::chrono::milliseconds>(next - Clock::now());
        return static_cast<int>(std::max<std::int64_t>(wait.count(), 0) + 1);
    }

    void Loop();
};

// Kept whole: one pass of the poll loop reads as one piece (what is watched, then what
// happened to each); cut apart, the index bookkeeping between the two halves would be
// shared state.
void EditorServer::Imp::Loop() {
    std::vector<pollfd> watched;
    while (!stopped) {
        watched.clear();
        watched.push_back({wake[0], POLLIN, 0});
        const bool room = connections.size() < limits.connections;
        watched.push_back({listener, static_cast<short>(room ? POLLIN : 0), 0});
        for (const auto& [fd, c] : connections) {
            const auto events = static_cast<short>(c.out.empty() ? POLLIN : POLLOUT);
            watched.push_back({fd, events, 0});
        }
        if (::poll(watched.data(), watched.size(), PollTimeout()) < 0 && errno != EINTR) {
            return;
        }
        if (watched[0].revents != 0 || stopped) {
            return;
        }
        const auto now = Clock::now();
        for (std::size_t i = 2; i < watched.size(); ++i) {
            Connection& c = connections[watched[i].fd];
            bool keep = true;
            if ((watched[i].revents & (POLLERR | POLLNVAL)) != 0) {
                keep = false;
            } else if ((watched[i].revents & POLLOUT) != 0) {
                keep = Write(c);
            } else if ((watched[i].revents & (POLLIN | POLLHUP)) != 0) {
                keep = Read(c);
            } else if (now >= c.deadline) {
                Expire(c);
                keep = !c.out.empty() && Write(c);
            }
            if (!keep) {
                ::close(c.fd);
                connections.erase(watched[i].fd);
            }
        }
        if ((watched[1].revents & POLLIN) != 0) {
            Accept();
        }
    }
}

EditorServer::EditorServer(Editor& editor, ServerLimits limits)
    : m_imp(std::make_unique<Imp>(editor, limits)) {
    if (::pipe2(m_imp->wake, O_CLOEXEC | O_NONBLOCK) != 0) {
        m_imp->wake[0] = m_imp->wake[1] = -1;
    }
}

EditorServer::~EditorServer() {
    Stop();
}

bool EditorServer::Load(const std::string& folder, std::string& error) {
    namespace fs = std::filesystem;
    std::error_code ec;
    for (auto it = fs::recursive_directory_iterator(folder, ec);
         !ec && it != fs::recursive_directory_iterator(); it.increment(ec)) {
        const char* mime = MimeOf(it->path());
        if (mime == nullptr || !it->is_regular_file(ec)) {
            continue;
        }
        std::string bytes;
        if (!Port::ReadRegularFile(it->path().string(), bytes, error, kMaxPageFile)) {
            return false;
        }
        std::string url = fs::relative(it->path(), folder, ec).generic_string();
        url.insert(url.begin(), '/');
        m_imp->files[url] = {mime, std::move(bytes)};
    }
    if (m_imp->files.count("/index.html") == 0) {
        error = "the editor's page is missing: no index.html in " + folder;
        return false;
    }
    return true;
}

bool EditorServer::Bind(int port, std::string& error) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    // Reusing an address in TIME_WAIT is all a restart needs; the port is never shared
    // (no SO_REUSEPORT), so no other program can take half of the page's requests.
    int yes = 1;
    ::setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof(yes));
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    ::inet_pton(AF_INET, kLoopback, &address.sin_addr);
    socklen_t size = sizeof(address);
    if (fd < 0 || port < 0 || port > 65535 || m_imp->wake[0] < 0 ||
        ::bind(fd, reinterpret_cast<sockaddr*>(&address), size) != 0 ||
        ::listen(fd, SOMAXCONN) != 0 ||
        ::getsockname(fd, reinterpret_cast<sockaddr*>(&address), &size) != 0) {
        error = "cannot listen on " + std::string(kLoopback) + ":" + std::to_string(port) +
                (port == 0 ? "" : " (in use? --port 0 takes a free port)");
        if (fd >= 0) {
            ::close(fd);
        }
        return false;
    }
    m_imp->listener = fd;
    m_port = m_imp->port = ntohs(address.sin_port);
    return true;
}

std::string EditorServer::Url() const {
    return "http://" + std::string(kLoopback) + ":" + std::to_string(m_port) + "/";
}

void EditorServer::Run() {
    if (m_imp->listener >= 0) {
        m_imp->Loop();
    }
}

void EditorServer::Stop() {
    m_imp->stopped = true;
    if (m_imp->wake[1] >= 0) {
        const char byte = 1;
        (void)!::write(m_imp->wake[1], &byte, 1);
    }
}

} // namespace VnTool
