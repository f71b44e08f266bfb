//===-- tools/editor/Server.cpp - the editor's HTTP server on loopback ----===//
#include "Server.h"

#include "Editor.h"

#include "Port/SafeFile.h"

#include <httplib.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <sstream>
#include <thread>

namespace VnTool {

namespace {

const char kLoopback[] = "127.0.0.1";

// Connections served at once; more wait for a free worker.
constexpr std::size_t kWorkers = 64;

// The page is small; anything bigger in its folder is not ours to serve.
constexpr std::uint64_t kMaxPageFile = std::uint64_t{4} << 20;

const char* MimeOf(const std::filesystem::path& path) {
    std::string ext = path.extension().string();
    if (ext == ".html") {
        return "text/html; charset=utf-8";
    }
    if (ext == ".css") {
        return "text/css; charset=utf-8";
    }
    if (ext == ".js" || ext == ".mjs") {
        return "text/javascript; charset=utf-8";
    }
    if (ext == ".svg") {
        return "image/svg+xml";
    }
    if (ext == ".png") {
        return "image/png";
    }
    return nullptr;
}

std::string ErrorBody(const std::string& why) {
    std::string escaped;
    for (char c : why) {
        if (c == '"' || c == '\\') {
            escaped += '\\';
        }
        escaped += c;
    }
    return "{\"error\":\"" + escaped + "\"}";
}

} // namespace

struct EditorServer::Imp {
    explicit Imp(Editor& e) : editor(e) {}
    Editor& editor;
    httplib::Server server;
    struct File {
        std::string mime;
        std::string bytes;
    };
    std::map<std::string, File> files; // by URL path
    std::atomic<bool> stopped{false};
    std::atomic<int> phase{0}; // 0 before Run, 1 in Run, 2 after
    int port = 0;
    int socket = -1; // the listening socket, once bound

    // A loopback name or address with our port; nothing else may name us.
    bool HostAllowed(const httplib::Request& request) const {
        std::string host = request.get_header_value("Host");
        std::string suffix = std::to_string(port);
        suffix.insert(suffix.begin(), ':');
        for (const char* name : {"127.0.0.1", "localhost"}) {
            if (host == name + suffix) {
                return true;
            }
        }
        return false;
    }

    bool OriginAllowed(const httplib::Request& request) const {
        if (!request.has_header("Origin")) {
            return true; // not a browser's cross-origin request
        }
        std::string origin = request.get_header_value("Origin");
        std::string suffix = std::to_string(port);
        suffix.insert(suffix.begin(), ':');
        return origin == "http://127.0.0.1" + suffix || origin == "http://localhost" + suffix;
    }

    static void Refuse(httplib::Response& response, int status, const std::string& why) {
        response.status = status;
        response.set_content(ErrorBody(why), "application/json");
    }

    void Api(const httplib::Request& request, httplib::Response& response) {
        if (request.method == "POST") {
            std::string type = request.get_header_value("Content-Type");
            if (type.rfind("application/json", 0) != 0) {
                Refuse(response, 415, "changes come as application/json");
                return;
            }
            if (!OriginAllowed(request)) {
                Refuse(response, 403, "requests from another origin are refused");
                return;
            }
        }
        EditorReply reply = editor.Handle(request.method, request.path, request.body);
        response.status = reply.status;
        response.set_content(reply.body, "application/json");
    }
};

EditorServer::EditorServer(Editor& editor) : m_imp(std::make_unique<Imp>(editor)) {
    httplib::Server& server = m_imp->server;
    server.set_payload_max_length(kMaxRequestBody);
    // A worker stays with a kept-alive connection until it idles out; with the library's
    // few default workers, a few open tabs or scripts would starve the rest. Workers only
    // wait for the editor's lock, so many are cheap.
    server.new_task_queue = [] { return new httplib::ThreadPool(kWorkers); };
    // The library's default shares the port (SO_REUSEPORT): a second server, or another
    // program of the same user, could then take half of the page's requests. Reusing an
    // address in TIME_WAIT is all a restart needs.
    //
    // An answer goes out as two writes, headers then body. With Nagle's algorithm the body
    // waits for the headers' acknowledgement, which the browser delays by 40 ms: every
    // click would cost that wait, fifty times the editor's own work. Accepted connections
    // inherit the listening socket's setting.
    server.set_socket_options([this](int sock) {
        int yes = 1;
        setsockopt(sock, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof(yes));
        setsockopt(sock, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof(yes));
        m_imp->socket = sock;
    });
    server.set_pre_routing_handler(
        [this](const httplib::Request& request, httplib::Response& response) {
            response.set_header("Cache-Control", "no-store");
            response.set_header("X-Content-Type-Options", "nosniff");
            response.set_header("Content-Security-Policy",
                                "default-src 'self'; img-src 'self' data:; style-src 'self'");
            if (!m_imp->HostAllowed(request)) {
                Imp::Refuse(response, 421,
                            "this server answers only to 127.0.0.1 and localhost "
                            "with its own port");
                return httplib::Server::HandlerResponse::Handled;
            }
            return httplib::Server::HandlerResponse::Unhandled;
        });
    auto api = [this](const httplib::Request& request, httplib::Response& response) {
        m_imp->Api(request, response);
    };
    server.Get("/api/.*", api);
    server.Post("/api/.*", api);
    server.Get("/.*", [this](const httplib::Request& request, httplib::Response& response) {
        std::string path = request.path == "/" ? "/index.html" : request.path;
        auto it = m_imp->files.find(path);
        if (it == m_imp->files.end()) {
            Imp::Refuse(response, 404, "no such page: " + request.path);
            return;
        }
        response.set_content(it->second.bytes, it->second.mime.c_str());
    });
    server.set_error_handler([](const httplib::Request&, httplib::Response& response) {
        if (response.body.empty()) {
            std::string why = response.status == 413
                                  ? "the body is larger than 1 MB"
                                  : "refused (" + std::to_string(response.status) + ")";
            Imp::Refuse(response, response.status, why);
        }
    });
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
        Port::InputFile in;
        if (!in.Open(it->path().string(), error, kMaxPageFile)) {
            return false;
        }
        std::ostringstream bytes;
        bytes << in.Stream().rdbuf();
        std::string failure;
        if (in.Failed(failure)) {
            error = failure;
            return false;
        }
        std::string url = fs::relative(it->path(), folder, ec).generic_string();
        url.insert(url.begin(), '/');
        m_imp->files[url] = {mime, bytes.str()};
    }
    if (m_imp->files.count("/index.html") == 0) {
        error = "the editor's page is missing: no index.html in " + folder;
        return false;
    }
    return true;
}

bool EditorServer::Bind(int port, std::string& error) {
    httplib::Server& server = m_imp->server;
    if (port == 0) {
        m_port = server.bind_to_any_port(kLoopback);
    } else {
        m_port = server.bind_to_port(kLoopback, port) ? port : -1;
    }
    if (m_port <= 0) {
        error = "cannot listen on " + std::string(kLoopback) + ":" + std::to_string(port) +
                (port == 0 ? "" : " (in use? --port 0 takes a free port)");
        return false;
    }
    m_imp->port = m_port;
    // The library listens with a backlog of 5: fifty clients connecting at once would
    // overflow it and some would see their connection reset. Listening again only
    // deepens the queue.
    if (m_imp->socket >= 0) {
        ::listen(m_imp->socket, SOMAXCONN);
    }
    return true;
}

std::string EditorServer::Url() const {
    return "http://" + std::string(kLoopback) + ":" + std::to_string(m_port) + "/";
}

void EditorServer::Run() {
    m_imp->phase = 1;
    if (!m_imp->stopped) {
        m_imp->server.listen_after_bind();
    }
    m_imp->phase = 2;
}

void EditorServer::Stop() {
    m_imp->stopped = true;
    // The server ignores a stop that comes before it runs: wait until it runs or is done.
    while (m_imp->phase == 1 && !m_imp->server.is_running()) {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    m_imp->server.stop();
}

} // namespace VnTool
