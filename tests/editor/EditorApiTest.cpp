//===-- tests/editor/EditorApiTest.cpp - the editor's API and its refusals ---------===//
//
// Every test talks to a served editor through cpp-httplib's client as the page does, and
// every refusal is checked to leave the plan and the file as they were.
//
//===------------------------------------------------------------------------------===//
#include "EditorFixture.h"

namespace {

using namespace editortest;

TEST_F(EditorApi, ServesThePageTheDeviceTheStateAndTheTrees) {
    auto page = m_client->Get("/");
    ASSERT_TRUE(page);
    EXPECT_EQ(page->status, 200);
    EXPECT_NE(page->body.find("venlomer edit"), std::string::npos);
    EXPECT_EQ(m_client->Get("/js/main.js")->status, 200);
    EXPECT_EQ(m_client->Get("/../top.pcf")->status, 404);
    EXPECT_EQ(m_client->Get("/nothing.html")->status, 404);

    VnTool::ChipDb db;
    std::string error;
    ASSERT_TRUE(VnTool::ReadChipDbFile(VENLOMER_DEMO_CHIPDB, "dq50", db, error)) << error;
    json device = Get("/api/device");
    EXPECT_EQ(device["name"], "demo");
    EXPECT_EQ(device["pins"].size(), db.pins.size());
    EXPECT_EQ(device["tiles"].size(), db.tiles.size());
    EXPECT_EQ(device["selectedPath"].size(), 4u);

    json state = Get("/api/state");
    EXPECT_EQ(state["ports"].size(), 3u);
    EXPECT_EQ(state["assignments"], json({{"1", "led[0]"}}));
    EXPECT_EQ(state["saved"], true);
    EXPECT_EQ(state["canUndo"], false);
    EXPECT_EQ(PortPin(state, "led[0]"), "1");

    json tree = Get("/api/tree");
    ASSERT_EQ(tree["roots"].size(), 2u);
    EXPECT_EQ(tree["roots"][0]["label"], "demo");
    EXPECT_EQ(tree["roots"][0]["children"][0]["id"], "bank:0");
    const json& design = tree["roots"][1];
    EXPECT_EQ(design["label"], "top");
    ASSERT_EQ(design["children"].size(), 2u); // clk, and the led bus as one group
    EXPECT_EQ(design["children"][0]["id"], "port:clk");
    EXPECT_EQ(design["children"][1]["label"], "led");
    EXPECT_EQ(design["children"][1]["children"][1]["id"], "port:led[1]");
}

TEST_F(EditorApi, AnswersOnlyLoopbackHostsWithItsOwnPort) {
    std::string port = std::to_string(m_server->Port());
    std::string other = std::to_string(m_server->Port() + 1);
    for (const std::string& host :
         std::vector<std::string>{"evil.example:" + port, "evil.example", "127.0.0.1:" + other,
                                  "localhost", "127.0.0.1.evil.example:" + port, "[::1]:" + port}) {
        auto result = m_client->Get("/api/state", {{"Host", host}});
        ASSERT_TRUE(result);
        EXPECT_EQ(result->status, 421) << host;
    }
    for (const std::string& host : {"localhost:" + port, "127.0.0.1:" + port}) {
        auto result = m_client->Get("/api/state", {{"Host", host}});
        ASSERT_TRUE(result);
        EXPECT_EQ(result->status, 200) << host;
    }
}

TEST_F(EditorApi, ASecondServerCannotShareTheBoundPort) {
    VnTool::EditorServer second(*m_editor);
    std::string error;
    EXPECT_FALSE(second.Bind(m_server->Port(), error));
    EXPECT_NE(error.find("cannot listen"), std::string::npos) << error;
}

TEST_F(EditorApi, RefusesBadRequestsAndChangesNothing) {
    std::string before = Snapshot();
    PostRaw("/api/assign", std::string(VnTool::kMaxRequestBody + 1, ' '), 413);
    PostRaw("/api/assign", "{\"port\": \"led[1]\", ", 400);
    PostRaw("/api/assign", "[\"led[1]\", \"10\"]", 400);
    PostRaw("/api/assign", R"({"port": "led[1]", "pin": "10"})", 415, "text/plain");
    {
        auto result = m_client->Post("/api/assign", {{"Origin", "http://evil.example"}},
                                     R"({"port": "led[1]", "pin": "10"})", "application/json");
        ASSERT_TRUE(result);
        EXPECT_EQ(result->status, 403);
    }
    json unknownPort = Post("/api/assign", {{"port", "nope"}, {"pin", "10"}}, 404);
    EXPECT_NE(unknownPort["error"].get<std::string>().find("nope"), std::string::npos);
    json unknownPin = Post("/api/assign", {{"port", "led[1]"}, {"pin", "Z99"}}, 404);
    EXPECT_NE(unknownPin["error"].get<std::string>().find("Z99"), std::string::npos);
    Post("/api/assign", {{"port", "led[1]"}, {"pin", 10}}, 400);
    Post("/api/unassign", {{"port", "clk"}}, 409); // it has no pin
    Post("/api/select", {{"id", "pin:Z99"}}, 404);
    Post("/api/select", {{"id", "bank:9"}}, 404);
    Post("/api/select", {{"id", "pin:1"}, {"mode", "sideways"}}, 400);
    Get("/api/nothing", 404);
    Post("/api/state", json::object(), 405);
    Get("/api/save", 405);
    EXPECT_EQ(Snapshot(), before);
}

TEST_F(EditorApi, RefusesAnAssignmentThatAddsAnErrorAndSaysWhy) {
    std::string before = Snapshot();
    json refused = Post("/api/assign", {{"port", "led[1]"}, {"pin", "1"}}, 409);
    EXPECT_NE(refused["error"].get<std::string>().find("led[0]"), std::string::npos)
        << refused.dump();
    EXPECT_EQ(Snapshot(), before);
}

TEST_F(EditorApi, UndoAndRedoTakeTheStepThePageShowsAndRefuseStaleOnes) {
    json state = Post("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
    long revision = state["revision"];
    EXPECT_EQ(PortPin(state, "led[1]"), "10");
    EXPECT_EQ(state["canUndo"], true);
    EXPECT_EQ(state["saved"], false);

    std::string before = Snapshot();
    Post("/api/undo", {{"step", revision - 1}}, 409);
    Post("/api/undo", json::object(), 400);
    Post("/api/redo", {{"step", revision}}, 409); // nothing to redo
    EXPECT_EQ(Snapshot(), before);

    state = Post("/api/undo", {{"step", revision}});
    EXPECT_EQ(PortPin(state, "led[1]"), "");
    EXPECT_EQ(state["saved"], true); // back where the file is
    EXPECT_EQ(state["canRedo"], true);
    Post("/api/redo", {{"step", revision}}, 409); // the page saw an older plan
    state = Post("/api/redo", {{"step", state["revision"]}});
    EXPECT_EQ(PortPin(state, "led[1]"), "10");

    // A new change drops what could be redone.
    state = Post("/api/undo", {{"step", state["revision"]}});
    state = Post("/api/assign", {{"port", "led[1]"}, {"pin", "11"}});
    EXPECT_EQ(state["canRedo"], false);
}

TEST_F(EditorApi, SaveWritesOnlyTheLinesItOwnsAndShowsSaved) {
    Post("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
    Post("/api/assign", {{"port", "led[0]"}, {"pin", "11"}});
    EXPECT_EQ(ReadAll(m_dir / "top.pcf"), kPcf); // nothing written before Save
    json state = Post("/api/save", json::object());
    EXPECT_EQ(state["saved"], true);
    EXPECT_EQ(ReadAll(m_dir / "top.pcf"), "# keep me\nset_io led[0] 11\nset_io led[1] 10\n");
    for (const auto& entry : fs::directory_iterator(m_dir)) {
        EXPECT_NE(entry.path().extension(), ".tmp") << "a temporary was left: " << entry.path();
    }
    state = Post("/api/undo", {{"step", state["revision"]}});
    EXPECT_EQ(state["saved"], false);
}

TEST_F(EditorApi, SearchHighlightsMatchedPinsAndFindsPortsThroughTheLibrary) {
    VnTool::ChipDb db;
    std::string error;
    ASSERT_TRUE(VnTool::ReadChipDbFile(VENLOMER_DEMO_CHIPDB, "dq50", db, error)) << error;
    // The bank of pin 1, where led[0] sits.
    int bank = -1;
    for (const VnTool::Pin& pin : db.pins) {
        bank = pin.name == "1" ? pin.bank : bank;
    }
    int inBank = 0;
    for (const VnTool::Pin& pin : db.pins) {
        inBank += pin.bank == bank ? 1 : 0;
    }
    ASSERT_GT(inBank, 1);
    json device = Get("/api/device");

    json state =
        Post("/api/search",
             {{"property", "Bank"}, {"value", std::to_string(bank)}, {"flags", {"exact"}}});
    EXPECT_EQ(state["highlighted"].size(), static_cast<std::size_t>(inBank));
    for (const auto& [pin, colour] : state["highlighted"].items()) {
        EXPECT_EQ(colour, device["selectedPath"][0]) << pin;
    }
    // led[0] sits on pin 1 in that bank, so the port matches too.
    EXPECT_NE(std::find(state["matches"].begin(), state["matches"].end(), "port:led[0]"),
              state["matches"].end());

    state = Post("/api/search",
                 {{"property", "Name"}, {"value", "LED"}, {"flags", {"substring", "ignore-case"}}});
    EXPECT_EQ(state["matches"], json({"port:led[0]", "port:led[1]"}));
    EXPECT_TRUE(state["highlighted"].empty());
    state = Post("/api/search", {{"property", "Clock"}, {"value", "no"}});
    EXPECT_EQ(state["matches"], json({"port:led[0]", "port:led[1]"}));
    state = Post("/api/search", {{"property", "Direction"}, {"value", "output"}});
    EXPECT_EQ(state["matches"], json({"port:led[0]", "port:led[1]"}));

    std::string before = Snapshot();
    Post("/api/search", {{"property", "Bank"}, {"value", "zero"}}, 400);
    Post("/api/search", {{"property", "Colour"}, {"value", "red"}}, 400);
    Post("/api/search", {{"property", "Bank"}, {"value", "0"}, {"flags", {"sideways"}}}, 400);
    Post("/api/search", {{"property", "Bank"}}, 400);
    EXPECT_EQ(Snapshot(), before);

    state = Post("/api/search", {{"clear", true}});
    EXPECT_TRUE(state["highlighted"].empty());
    EXPECT_TRUE(state["matches"].empty());
}

TEST_F(EditorApi, SelectionFollowsClicksShiftClicksAndBankNodes) {
    json device = Get("/api/device");
    std::vector<std::string> bankZero;
    for (const json& pin : device["pins"]) {
        if (pin["bank"] == 0) {
            bankZero.push_back(pin["id"]);
        }
    }
    json state = Post("/api/select", {{"id", "bank:0"}, {"descend", true}});
    std::vector<std::string> selected = state["selected"];
    ASSERT_EQ(selected.size(), bankZero.size() + 1);
    EXPECT_EQ(selected[0], "bank:0");
    EXPECT_EQ(std::vector<std::string>(selected.begin() + 1, selected.end()), bankZero);

    state = Post("/api/select", {{"id", bankZero[0]}, {"mode", "toggle"}});
    EXPECT_EQ(state["selected"].size(), bankZero.size());
    state = Post("/api/select", {{"id", "port:led[0]"}, {"mode", "toggle"}});
    EXPECT_EQ(state["selected"].back(), "port:led[0]");

    json properties = Get("/api/properties");
    EXPECT_EQ(properties["id"], "port:led[0]");
    EXPECT_EQ(properties["kind"], "port");
    std::map<std::string, json> byName;
    for (const json& p : properties["properties"]) {
        byName[p["name"]] = p["value"];
    }
    EXPECT_EQ(byName["Name"], "led[0]");
    EXPECT_EQ(byName["Direction"], "output");
    EXPECT_EQ(byName["Pin"], "1");
    EXPECT_EQ(byName["Bank"], 2); // pin 1 lies on the bottom edge

    // Every node of the trees can be selected by the id the tree gives it.
    json tree = Get("/api/tree");
    std::vector<const json*> work{&tree["roots"][0], &tree["roots"][1]};
    int ids = 0;
    while (!work.empty()) {
        const json* node = work.back();
        work.pop_back();
        if (node->contains("id")) {
            json selectedNow = Post("/api/select", {{"id", (*node)["id"]}})["selected"];
            EXPECT_EQ(selectedNow, json({(*node)["id"]}));
            ++ids;
        }
        for (const json& child : (*node)["children"]) {
            work.push_back(&child);
        }
    }
    EXPECT_GT(ids, static_cast<int>(device["tiles"].size()));

    state = Post("/api/select", {{"id", "pin:1"}});
    EXPECT_EQ(state["selected"], json({"pin:1"}));
    EXPECT_EQ(Get("/api/properties")["kind"], "pin");
    state = Post("/api/select", {{"clear", true}});
    EXPECT_TRUE(state["selected"].empty());
    EXPECT_TRUE(Get("/api/properties")["id"].is_null());
}

TEST_F(EditorApi, EveryAnswerLaidOverTheStateBeforeGivesTheStateAfter) {
    // The page keeps the state it was given and lays each answer over it; an answer that
    // left out a field its request changed would leave the page showing the old one.
    json held = Get("/api/state");
    auto step = [&](const std::string& path, const json& body) {
        json answer = Post(path, body);
        EXPECT_TRUE(answer.is_object()) << path;
        if (answer.is_object()) {
            held.update(answer);
        }
        EXPECT_EQ(held, Get("/api/state")) << path << " " << body.dump();
        return answer;
    };
    json marks =
        step("/api/search", {{"property", "Name"}, {"value", "led"}, {"flags", {"substring"}}});
    // A search touches neither the plan nor its checks, so it does not carry them.
    EXPECT_FALSE(marks.contains("ports"));
    EXPECT_FALSE(marks.contains("problems"));
    step("/api/select", {{"id", "port:led[1]"}});
    step("/api/select", {{"id", "bank:0"}, {"descend", true}, {"mode", "add"}});
    json plan = step("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
    EXPECT_FALSE(plan.contains("selected"));
    // Matches found before the assignment stay what the search found.
    step("/api/search", {{"property", "Pin"}, {"value", "10"}});
    step("/api/unassign", {{"port", "led[0]"}});
    step("/api/undo", {{"step", held["revision"]}});
    step("/api/redo", {{"step", held["revision"]}});
    step("/api/auto", json::object());
    step("/api/save", json::object());
    step("/api/search", {{"clear", true}});
    step("/api/select", {{"clear", true}});
}

TEST_F(EditorApi, AutoGivesEveryPortAPinOnce) {
    json state = Post("/api/auto", json::object());
    for (const json& port : state["ports"]) {
        EXPECT_NE(port["pin"], "") << port["name"];
    }
    EXPECT_EQ(PortPin(state, "led[0]"), "1"); // kept
    std::string before = Snapshot();
    Post("/api/auto", json::object(), 409);
    EXPECT_EQ(Snapshot(), before);
}

TEST_F(EditorApi, UnsavedWorkSurvivesInTheRecoveryFileUntilSaved) {
    fs::path recovery = m_dir / "top.pcf.recovery";
    std::string error;
    ASSERT_TRUE(m_editor->WriteRecovery(error)) << error;
    EXPECT_FALSE(fs::exists(recovery)); // nothing unsaved yet

    Post("/api/assign", {{"port", "led[1]"}, {"pin", "10"}});
    ASSERT_TRUE(m_editor->WriteRecovery(error)) << error;
    EXPECT_EQ(ReadAll(recovery), "# keep me\nset_io led[0] 1\nset_io led[1] 10\n");
    EXPECT_EQ(ReadAll(m_dir / "top.pcf"), kPcf);

    // The next session finds it and, asked to, takes it as unsaved work.
    Stop();
    Start();
    EXPECT_TRUE(m_editor->HasRecovery());
    ASSERT_TRUE(m_editor->LoadRecovery(error)) << error;
    json state = Get("/api/state");
    EXPECT_EQ(PortPin(state, "led[1]"), "10");
    EXPECT_EQ(state["saved"], false);
    EXPECT_TRUE(m_editor->Unsaved());

    // Undone back to the file: nothing is left to recover.
    state = Post("/api/undo", {{"step", state["revision"]}});
    EXPECT_EQ(state["saved"], true);
    ASSERT_TRUE(m_editor->WriteRecovery(error)) << error;
    EXPECT_FALSE(fs::exists(recovery));

    // Saving drops it too.
    state = Post("/api/redo", {{"step", state["revision"]}});
    ASSERT_TRUE(m_editor->WriteRecovery(error)) << error;
    EXPECT_TRUE(fs::exists(recovery));
    Post("/api/save", json::object());
    EXPECT_FALSE(fs::exists(recovery));
    EXPECT_FALSE(m_editor->Unsaved());
}

TEST_F(EditorApi, ARecoveryFileThatIsNoConstraintFileIsRefusedWhole) {
    std::ofstream(m_dir / "top.pcf.recovery") << "set_io\n";
    std::string error;
    std::string before = Snapshot();
    EXPECT_FALSE(m_editor->LoadRecovery(error));
    EXPECT_NE(error.find("recovery"), std::string::npos) << error;
    EXPECT_EQ(Snapshot(), before);
}

TEST_F(EditorApi, ConcurrentClientsAreServedOneAtATime) {
    std::atomic<int> failures{0};
    std::vector<std::thread> clients;
    // Fifty at once, as many as the load benchmark runs: more than the library's default
    // listen queue and worker count would take.
    for (int c = 0; c < 50; ++c) {
        clients.emplace_back([&, c] {
            httplib::Client client("127.0.0.1", m_server->Port());
            for (int i = 0; i < 6; ++i) {
                std::string body = i % 2 == 0
                                       ? R"({"property": "Bank", "value": "0"})"
                                       : R"({"id": "bank:0", "descend": true, "mode": "toggle"})";
                auto result = client.Post(i % 2 == 0 ? "/api/search" : "/api/select", body,
                                          "application/json");
                if (!result || result->status != 200) {
                    ++failures;
                }
                if (c == 0) {
                    auto state = client.Get("/api/state");
                    failures += !state || state->status != 200 ? 1 : 0;
                }
            }
        });
    }
    for (auto& client : clients) {
        client.join();
    }
    EXPECT_EQ(failures, 0);
}

} // namespace

TEST_F(EditorApi, ServesTheCompareFlagsItTakesAndThePlanAsATable) {
    // The page offers what the server lists; every word listed must be one the search takes.
    json flags = Get("/api/flags")["flags"];
    ASSERT_TRUE(flags.is_array());
    EXPECT_NE(std::find(flags.begin(), flags.end(), "any"), flags.end());
    for (const json& flag : flags) {
        Post("/api/search", {{"property", "Name"}, {"value", "1"}, {"flags", {flag}}});
    }

    // The same table as `pins export --csv`, with led[0] on the pin the fixture gave it.
    auto table = m_client->Get("/api/export.csv");
    ASSERT_TRUE(table);
    EXPECT_EQ(table->status, 200);
    EXPECT_EQ(table->get_header_value("Content-Type").rfind("text/csv", 0), 0u);
    EXPECT_EQ(table->body.rfind("port,direction,pin,bank,", 0), 0u) << table->body;
    EXPECT_NE(table->body.find("\nled[0],output,1,"), std::string::npos) << table->body;
}
