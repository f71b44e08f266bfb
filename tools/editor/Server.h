//===-- tools/editor/Server.h - the editor's HTTP server on loopback ------===//
//
// \file
// Serves the page's files and hands API requests to the Editor. It listens on 127.0.0.1
// only and answers only requests that name it by a loopback Host with its own port, so a
// web page elsewhere cannot reach it through a name that resolves to loopback (DNS
// rebinding). Changes must come as application/json from the page's own origin: a
// cross-site form cannot send that without a preflight, which is never granted. Bodies
// over 1 MB are refused before they reach the editor. The page's files are read once at
// start, so a request never names a file on disk.
//
//   VnTool::EditorServer server(editor);
//   if (!server.Load(shareFolder, error) || !server.Bind(0, error)) { report(error); }
//   std::thread serving([&] { server.Run(); });   // server.Stop() from anywhere ends it
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <map>
#include <memory>
#include <string>

namespace VnTool {

class Editor;

/// The largest request body taken.
inline constexpr std::size_t kMaxRequestBody = std::size_t{1} << 20;

class EditorServer {
public:
    explicit EditorServer(Editor& editor);
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
