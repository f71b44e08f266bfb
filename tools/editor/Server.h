//===-- tools/editor/Server.h - the editor's HTTP server on loopback ------===//
//
// \file
// Serves the page's files and hands API requests to the Editor. It listens on 127.0.0.1
// only and answers only requests that name it by a loopback Host with its own port, so a
// web page elsewhere cannot reach it through a name that resolves to loopback (DNS
// rebinding). Changes must come as application/json from the page's own origin: a
// cross-site form cannot send that without a preflight, which is never granted. The page's
// files are read once at start, so a request never names a file on disk.
//
// One thread reads every connection with poll(), so a client that sends slowly holds a
// socket, not a worker: a normal request is answered while hundreds drip a byte at a time.
// A request is taken only whole and within the limits below; the editor then serves it
// on the same thread, one request at a time, as its one lock would anyway.
//
//   VnTool::EditorServer server(editor);
//   if (!server.Load(shareFolder, error) || !server.Bind(0, error)) { report(error); }
//   std::thread serving([&] { server.Run(); });   // server.Stop() from anywhere ends it
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <chrono>
#include <cstddef>
#include <memory>
#include <string>

namespace VnTool {

class Editor;

/// The largest request body taken.
inline constexpr std::size_t kMaxRequestBody = std::size_t{1} << 20;

/// What a request may cost the server before it is refused or dropped.
struct ServerLimits {
    std::size_t headBytes = std::size_t{16} * 1024; ///< request line and headers (431 beyond)
    std::size_t headLines = 100;                    ///< header lines (431 beyond)
    std::size_t body = kMaxRequestBody;             ///< by Content-Length only (413 beyond)
    std::size_t connections = 1024;                 ///< open at once; more are closed at accept
    std::chrono::milliseconds headTime{10000};      ///< from the first byte to the head's end (408)
    std::chrono::milliseconds bodyTime{30000};      ///< from the head's end to the body's end (408)
    std::chrono::milliseconds idleTime{30000};      ///< a kept-alive connection sending nothing
};

class EditorServer {
public:
    explicit EditorServer(Editor& editor, ServerLimits limits = {});
    ~EditorServer();
    EditorServer(const EditorServer&) = delete;
    EditorServer& operator=(const EditorServer&) = delete;

    /// Reads the page's files (HTML, CSS, JS, images) from `folder`. False with a reason
    /// when it holds no index.html.
    bool Load(const std::string& folder, std::string& error);
    /// Binds 127.0.0.1:`port`; 0 takes a free port. False with a reason.
    bool Bind(int port, std::string& error);
    /// The bound port.
    int Port() const { return m_port; }
    /// "http://127.0.0.1:PORT/".
    std::string Url() const;
    /// Serves until Stop().
    void Run();
    /// Ends Run(); safe from any thread, also before Run() starts.
    void Stop();

private:
    struct Imp;
    std::unique_ptr<Imp> m_imp;
    int m_port = 0;
};

} // namespace VnTool
