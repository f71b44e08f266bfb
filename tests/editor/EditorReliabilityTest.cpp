//===-- tests/editor/EditorReliabilityTest.cpp - no work lost, no request fatal -----===//
//
// The editor against what people and programs do around it: a file changed on disk
// while it is open, edits undone several steps deep, names too long for a recovery
// file's suffix, requests built to crash it (deep nesting, wrong types) and clients that
// frame, size or pace their requests to hold it. Raw sockets speak HTTP where a client
// library would tidy the request up.
//
//===------------------------------------------------------------------------------===//
#include "EditorFixture.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>

#include <chrono>
#include <malloc.h>

namespace {

using namespace editortest;
using Clock = std::chrono::steady_clock;

// A connected loopback socket, or -1.
int Connect(int port) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    ::inet_pton(AF_INET, "127.0.0.1", &address.sin_addr);
    if (::connect(fd, reinterpret_cast<sockaddr*>(&address), sizeof(address)) != 0) {
        ::close(fd);
        return -1;
    }
    return fd;
}

// Sends `bytes` (as far as the server takes them) and reads until the server closes or
// `wait` passes.
std::string Exchange(int port, const std::string& bytes,
                     std::chrono::milliseconds wait = std::chrono::milliseconds(5000)) {
    const int fd = Connect(port);
    if (fd < 0) {
        return "";
    }
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const ssize_t n = ::send(fd, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
        if (n <= 0) {
            break; // refused early and closed: the answer is what counts
        }
        sent += static_cast<std::size_t>(n);
    }
    std::string answer;
    const auto end = Clock::now() + wait;
    char buffer[4096];
    while (Clock::now() < end) {
        pollfd one{fd, POLLIN, 0};
        if (::poll(&one, 1, 50) <= 0) {
            continue;
        }
        const ssize_t n = ::recv(fd, buffer, sizeof buffer, 0);
        if (n <= 0) {
            break;
        }
        answer.append(buffer, static_cast<std::size_t>(n));
    }
    ::close(fd);
    return answer;
}

int StatusOf(const std::string& answer) {
    return answer.rfind("HTTP/1.1 ", 0) == 0 ? std::stoi(answer.substr(9, 3)) : 0;
}

json BodyOf(const std::string& answer) {
    const auto start = answer.find("\r\n\r\n");
    return start == std::string::npos ? json()
                                      : json::parse(answer.substr(start + 4), nullptr, false);
}

std::string Head(int port, const std::string& method, const std::string& path) {
    return method + " " + path + " HTTP/1.1\r\nHost: 127.0.0.1:" + std::to_string(port) +
           "\r\nContent-Type: application/json\r\n";
}

class Reliability : public EditorApi {};

TEST_F(Reliability, UndoAndRedoWalkSeveralStepsAndEveryStepRestoresItsOwnPlan) {
    const fs::path pcf = m_dir / "top.pcf";
    std::vector<std::string> texts{kPcf};
    json state = Post("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
    texts.push_back("# keep me\nset_io led[0] 1\nset_io led[1] 10\n");
    state = Post("/api/assign", {{"port", "clk"}, {"pin", "11"}});
    texts.push_back(texts.back() + "set_io clk 11\n");
    state = Post("/api/assign", {{"port", "led[0]"}, {"pin", "12"}});
    texts.push_back("# keep me\nset_io led[0] 12\nset_io led[1] 10\nset_io clk 11\n");
    // Save each state the walk reaches and compare the file: the file is what counts.
    auto fileNow = [&] {
        Post("/api/save", json::object());
        return ReadAll(pcf);
    };
    EXPECT_EQ(fileNow(), texts[3]);
    for (int back = 2; back >= 0; --back) {
        state = Post("/api/undo", {{"step", state["revision"]}});
        EXPECT_EQ(fileNow(), texts[static_cast<std::size_t>(back)]) << "undo to " << back;
    }
    EXPECT_EQ(state["canUndo"], false);
    Post("/api/undo", {{"step", state["revision"]}}, 409);
    for (std::size_t forward = 1; forward <= 3; ++forward) {
        state = Post("/api/redo", {{"step", state["revision"]}});
        EXPECT_EQ(fileNow(), texts[forward]) << "redo to " << forward;
    }
    EXPECT_EQ(state["canRedo"], false);
    EXPECT_EQ(PortPin(state, "led[0]"), "12");
    EXPECT_EQ(PortPin(state, "clk"), "11");
}

TEST_F(Reliability, SaveRefusesAFileChangedOnDiskAndReappliesTheEditsOnTheNewOne) {
    const fs::path pcf = m_dir / "top.pcf";
    Post("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
    // Someone adds a line by hand; the content changes, the size and second may not.
    std::ofstream(pcf, std::ios::app) << "set_io clk 11\n";
    const std::string theirs = ReadAll(pcf);
    json refused = Post("/api/save", json::object(), 409);
    EXPECT_EQ(refused["changedOnDisk"], true);
    EXPECT_NE(refused["error"].get<std::string>().find("changed on disk"), std::string::npos);
    EXPECT_EQ(ReadAll(pcf), theirs);

    json state = Post("/api/take-disk", {{"reapply", true}});
    EXPECT_EQ(state["saved"], false);
    EXPECT_EQ(PortPin(state, "clk"), "11");    // theirs
    EXPECT_EQ(PortPin(state, "led[1]"), "10"); // ours
    Post("/api/save", json::object());
    EXPECT_EQ(ReadAll(pcf), theirs + "set_io led[1] 10\n");

    // Both sides move the same port: nothing is taken, and the line in conflict is named.
    Post("/api/assign", {{"port", "clk"}, {"pin", "12"}});
    std::ofstream(pcf, std::ios::trunc) << "# keep me\nset_io led[0] 1\nset_io clk 13\n";
    Post("/api/save", json::object(), 409);
    const std::string before = Get("/api/state").dump();
    json conflict = Post("/api/take-disk", {{"reapply", true}}, 409);
    ASSERT_EQ(conflict["conflicts"].size(), 1u) << conflict.dump();
    const std::string line = conflict["conflicts"][0];
    EXPECT_NE(line.find("top.pcf:3: set_io clk 13"), std::string::npos) << line;
    EXPECT_NE(line.find("on 12"), std::string::npos) << line;
    EXPECT_EQ(Get("/api/state").dump(), before);
    // Dropping this editor's edits takes the file as it is.
    state = Post("/api/take-disk", {{"reapply", false}});
    EXPECT_EQ(state["saved"], true);
    EXPECT_EQ(PortPin(state, "clk"), "13");
    EXPECT_EQ(PortPin(state, "led[1]"), "");
    Post("/api/take-disk", {{"reapply", "yes"}}, 400);
}

TEST_F(Reliability, EveryChangeReachesTheRecoveryFileAtOnceWhateverTheNameLength) {
    for (std::size_t length : {7u, 246u, 247u, 255u}) {
        Stop();
        m_pcfName = std::string(length - 4, 'p') + ".pcf";
        std::ofstream(m_dir / m_pcfName) << kPcf;
        Start();
        const fs::path recovery = m_editor->RecoveryPath();
        EXPECT_LE(recovery.filename().string().size(), 255u);
        EXPECT_EQ(recovery.parent_path(), m_dir);
        Post("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
        // No timer, no stop: the change itself wrote it.
        EXPECT_EQ(ReadAll(recovery), std::string(kPcf) + "set_io led[1] 10\n") << length;
        json state = Post("/api/assign", {{"port", "clk"}, {"pin", "11"}});
        EXPECT_EQ(state["recoveryError"], "");
        EXPECT_NE(ReadAll(recovery).find("set_io clk 11"), std::string::npos) << length;
        // A later start finds it under the same name.
        Stop();
        Start();
        ASSERT_TRUE(m_editor->HasRecovery()) << length;
        std::string error;
        ASSERT_TRUE(m_editor->LoadRecovery(error)) << error;
        EXPECT_EQ(PortPin(Get("/api/state"), "clk"), "11");
        fs::remove(recovery);
    }
}

// Heap bytes in use; zero where the allocator cannot say (under the sanitizer).
std::size_t HeapInUse() {
#if defined(__SANITIZE_ADDRESS__)
    return 0;
#else
    return ::mallinfo2().uordblks;
#endif
}

TEST_F(Reliability, UndoHoldsTheChangedLinesNotCopiesOfTheFile) {
    // A 2 MB file of comments (a board's ball list kept in it, say). Every edit is checked
    // against the whole file, so a debug build runs a few dozen of them, not a thousand:
    // each step must cost at most a kilobyte, so a thousand stay within one megabyte.
    Stop();
    std::string big(kPcf);
    while (big.size() < (std::size_t{2} << 20)) {
        big += "# ball A" + std::to_string(big.size()) + ": reserved for the expansion header\n";
    }
    std::ofstream(m_dir / "top.pcf") << big;
    Start();
    const std::size_t heapBefore = HeapInUse();
    constexpr int kSteps = 8;
    for (int step = 0; step < kSteps; ++step) {
        const std::size_t before = m_editor->HistoryBytes();
        const char* pin = step % 2 == 0 ? "10" : "11";
        auto reply =
            m_editor->Handle("POST", "/api/assign", json{{"port", "led[1]"}, {"pin", pin}}.dump());
        ASSERT_EQ(reply.status, 200) << reply.body;
        EXPECT_LE(m_editor->HistoryBytes() - before, 1024u) << "step " << step;
    }
    // Measured, not counted: whole copies would hold 8 times the file's model.
    if (heapBefore != 0) {
        EXPECT_LT(HeapInUse() - std::min(HeapInUse(), heapBefore), std::size_t{16} << 20);
    }
    // Undo walks back through all of them to the file as read.
    json state = Get("/api/state");
    for (int step = 0; step < kSteps; ++step) {
        state = Post("/api/undo", {{"step", state["revision"]}});
    }
    EXPECT_EQ(state["saved"], true);
}

TEST_F(Reliability, AStartIsLinearInPorts) {
    Stop();
    // One 40,000-bit bus: a look-up per port that walked the ports would take minutes.
    json bits = json::array();
    for (int bit = 0; bit < 40000; ++bit) {
        bits.push_back(bit + 2);
    }
    json design{{"creator", "Yosys"},
                {"modules",
                 {{"top",
                   {{"attributes", {{"top", "1"}}},
                    {"ports", {{"wide", {{"direction", "output"}, {"bits", bits}}}}},
                    {"cells", json::object()},
                    {"netnames", json::object()}}}}}};
    std::ofstream(m_dir / "top.json") << design.dump();
    std::ofstream(m_dir / "top.pcf") << "";
    const auto started = Clock::now();
    m_editor = std::make_unique<VnTool::Editor>();
    std::string error;
    ASSERT_TRUE(m_editor->Open(Files(), error)) << error;
    const auto took = std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - started);
    // A second in an optimised build; a debug or sanitizer build gets room, still far
    // below what a look-up per port through all ports costs (minutes).
#if defined(NDEBUG) && !defined(__SANITIZE_ADDRESS__)
    EXPECT_LT(took.count(), 1000);
#else
    EXPECT_LT(took.count(), 15000);
#endif
    m_editor.reset();
}

TEST_F(Reliability, APortNameWithAControlByteIsRefusedAtStart) {
    Stop();
    std::string design = kDesign;
    design.replace(design.find("\"clk\""), 5, "\"c\\u0000lk\"");
    std::ofstream(m_dir / "top.json") << design;
    m_editor = std::make_unique<VnTool::Editor>();
    std::string error;
    EXPECT_FALSE(m_editor->Open(Files(), error));
    EXPECT_NE(error.find("control byte"), std::string::npos) << error;
    EXPECT_NE(error.find("\\x00"), std::string::npos) << error;
    m_editor.reset();
}

TEST_F(Reliability, MalformedRequestsGetABoundedFourHundredAndTheEditorGoesOn) {
    const std::string before = Snapshot();
    // 100,000 levels of nesting in a field that is quoted back when wrong.
    std::string deep = R"({"property": "Name", "value": "x", "flags": )" +
                       std::string(100000, '[') + std::string(100000, ']') + "}";
    json refused = PostRaw("/api/search", deep, 400);
    EXPECT_LT(refused.dump().size(), 400u);
    // Fields of the wrong type are the client's fault.
    Post("/api/search", {{"clear", "yes"}}, 400);
    Post("/api/select", {{"id", "pin:1"}, {"descend", "deep"}}, 400);
    Post("/api/select", {{"id", "pin:1"}, {"mode", 3}}, 400);
    Post("/api/undo", {{"step", "1"}}, 400);
    json regexp =
        Post("/api/search", {{"property", "Name"}, {"value", "led[("}, {"flags", {"regexp"}}}, 400);
    EXPECT_NE(regexp["error"].get<std::string>().find("no valid regular expression"),
              std::string::npos);
    // A path with control bytes and a long one: valid JSON back, the quote cut short.
    const std::string raw =
        Exchange(m_server->Port(),
                 Head(m_server->Port(), "GET", "/api/\x01\x7f" + std::string(3000, 'a')) + "\r\n",
                 std::chrono::milliseconds(500));
    EXPECT_EQ(StatusOf(raw), 404) << raw.substr(0, 200);
    json answer = BodyOf(raw);
    ASSERT_TRUE(answer.is_object()) << raw.substr(0, 300);
    EXPECT_LT(answer["error"].get<std::string>().size(), 300u);
    EXPECT_EQ(Snapshot(), before);
    EXPECT_EQ(Get("/api/ping")["revision"], Get("/api/state")["revision"]);
}

TEST_F(Reliability, TheBodyAndTheHeadAreBoundedHoweverTheyAreFramed) {
    const int port = m_server->Port();
    // A chunked body, and one with no length at all: neither is read to its end.
    std::string chunked = Head(port, "POST", "/api/assign") + "Transfer-Encoding: chunked\r\n\r\n";
    for (int i = 0; i < 64; ++i) {
        chunked += "100000\r\n" + std::string(0x100000, ' ') + "\r\n";
    }
    EXPECT_EQ(StatusOf(Exchange(port, chunked)), 411);
    EXPECT_EQ(StatusOf(Exchange(port, Head(port, "POST", "/api/assign") + "\r\n{}")), 411);
    EXPECT_EQ(StatusOf(Exchange(port, Head(port, "POST", "/api/assign") +
                                          "Content-Length: 99999999999\r\n\r\n")),
              413);
    // Many headers, and one long one.
    std::string many = Head(port, "GET", "/api/state");
    for (int i = 0; i < 2000; ++i) {
        many += "X-Filler-" + std::to_string(i) + ": 1\r\n";
    }
    EXPECT_EQ(StatusOf(Exchange(port, many + "\r\n")), 431);
    EXPECT_EQ(StatusOf(Exchange(port, Head(port, "GET", "/api/state") +
                                          "X-Long: " + std::string(100000, 'x') + "\r\n\r\n")),
              431);
    EXPECT_EQ(StatusOf(Exchange(port, "NONSENSE\r\n\r\n")), 400);
    EXPECT_EQ(Get("/api/state")["ports"].size(), 3u); // and it goes on
}

TEST_F(Reliability, AHeadThatComesTooSlowlyIsCutOff) {
    Stop();
    m_limits.headTime = std::chrono::milliseconds(600);
    Start();
    const auto started = Clock::now();
    const std::string answer =
        Exchange(m_server->Port(), "GET /api/state HTTP/1.1\r\n", std::chrono::milliseconds(5000));
    const auto took = Clock::now() - started;
    EXPECT_EQ(StatusOf(answer), 408) << answer;
    EXPECT_LT(took, std::chrono::milliseconds(3000));
}

TEST_F(Reliability, ANormalClientIsAnsweredWhileTwoHundredSlowOnesDrip) {
    const int port = m_server->Port();
    std::vector<int> slow;
    slow.reserve(200);
    for (int i = 0; i < 200; ++i) {
        const int fd = Connect(port);
        ASSERT_GE(fd, 0) << i;
        slow.push_back(fd);
    }
    const std::string head = Head(port, "GET", "/api/state");
    for (std::size_t drip = 0; drip < 3; ++drip) {
        for (int fd : slow) {
            (void)::send(fd, head.data() + drip, 1, MSG_NOSIGNAL);
        }
        const auto asked = Clock::now();
        httplib::Client normal("127.0.0.1", port);
        normal.set_read_timeout(2, 0);
        auto result = normal.Get("/api/state");
        ASSERT_TRUE(result) << "no answer while " << slow.size() << " clients drip";
        EXPECT_EQ(result->status, 200);
        EXPECT_LT(Clock::now() - asked, std::chrono::milliseconds(1500));
        std::this_thread::sleep_for(std::chrono::milliseconds(300));
    }
    for (int fd : slow) {
        ::close(fd);
    }
}

} // namespace
