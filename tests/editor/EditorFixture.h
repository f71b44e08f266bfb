//===-- tests/editor/EditorFixture.h - an editor served on a free loopback port ----===//
//
// A server on a free loopback port over the bundled demo device (package dq50) and a
// three-bit design; tests talk to it through cpp-httplib's client as the page does.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "Editor.h"
#include "Server.h"

#include <gtest/gtest.h>
#include <httplib.h>
#include <nlohmann/json.hpp>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>
#include <unistd.h>

namespace editortest {

namespace fs = std::filesystem;
using json = nlohmann::json;

inline const char kDesign[] = R"({"creator": "Yosys", "modules": {"top": {
  "attributes": {"top": "00000000000000000000000000000001"},
  "ports": {"clk": {"direction": "input", "bits": [2]},
            "led": {"direction": "output", "bits": [3, 4]}},
  "cells": {"q": {"type": "SB_DFF", "connections": {"C": [2], "D": [4], "Q": [3]}}},
  "netnames": {}}}})";

inline const char kPcf[] = "# keep me\nset_io led[0] 1\n";

inline std::string ReadAll(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

class EditorApi : public ::testing::Test {
protected:
    void SetUp() override {
        // A server that refuses a body may close before the client has sent it all.
        std::signal(SIGPIPE, SIG_IGN);
        m_dir = fs::temp_directory_path() /
                ("venlomer-editor-" + std::to_string(getpid()) + "-" +
                 ::testing::UnitTest::GetInstance()->current_test_info()->name());
        fs::remove_all(m_dir);
        fs::create_directories(m_dir);
        std::ofstream(m_dir / "top.json") << kDesign;
        std::ofstream(m_dir / "top.pcf") << kPcf;
        Start();
    }

    void TearDown() override {
        Stop();
        fs::remove_all(m_dir);
    }

    void Start() {
        m_editor = std::make_unique<VnTool::Editor>();
        std::string error;
        ASSERT_TRUE(m_editor->Open(Files(), error)) << error;
        m_server = std::make_unique<VnTool::EditorServer>(*m_editor, m_limits);
        ASSERT_TRUE(m_server->Load(VENLOMER_EDITOR_PAGE, error)) << error;
        ASSERT_TRUE(m_server->Bind(0, error)) << error;
        m_thread = std::thread([this] { m_server->Run(); });
        m_client = std::make_unique<httplib::Client>("127.0.0.1", m_server->Port());
    }

    void Stop() {
        if (m_server) {
            m_server->Stop();
            m_thread.join();
        }
        m_client.reset();
        m_server.reset();
        m_editor.reset();
    }

    VnTool::EditorFiles Files() const {
        VnTool::EditorFiles files;
        files.design = (m_dir / "top.json").string();
        files.pcf = (m_dir / m_pcfName).string();
        files.device.chipDb = VENLOMER_DEMO_CHIPDB;
        files.device.package = "dq50";
        return files;
    }

    json Get(const std::string& path, int expected = 200) {
        auto result = m_client->Get(path.c_str());
        EXPECT_TRUE(result) << path;
        if (!result) {
            return {};
        }
        EXPECT_EQ(result->status, expected) << path << ": " << result->body;
        return json::parse(result->body, nullptr, false);
    }

    json Post(const std::string& path, const json& body, int expected = 200) {
        return PostRaw(path, body.dump(), expected);
    }

    json PostRaw(const std::string& path, const std::string& body, int expected,
                 const char* type = "application/json") {
        auto result = m_client->Post(path.c_str(), body, type);
        EXPECT_TRUE(result) << path;
        if (!result) {
            return {};
        }
        EXPECT_EQ(result->status, expected) << path << ": " << result->body;
        return json::parse(result->body, nullptr, false);
    }

    // What must not move when a request is refused.
    std::string Snapshot() {
        json state = Get("/api/state");
        return state.dump() + ReadAll(m_dir / "top.pcf");
    }

    std::string PortPin(const json& state, const std::string& port) {
        for (const json& p : state["ports"]) {
            if (p["name"] == port) {
                return p["pin"];
            }
        }
        return "(no such port)";
    }

    fs::path m_dir;
    VnTool::ServerLimits m_limits;
    std::string m_pcfName = "top.pcf";
    std::unique_ptr<VnTool::Editor> m_editor;
    std::unique_ptr<VnTool::EditorServer> m_server;
    std::thread m_thread;
    std::unique_ptr<httplib::Client> m_client;
};

} // namespace editortest
