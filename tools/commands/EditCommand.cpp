//===-- tools/commands/EditCommand.cpp - venlomer edit: the editor in a browser ---===//
//
// Options, the lock, the recovery file's offer and signals: everything around the
// engine and the server that a command needs and a test does not.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"
#include "EditLock.h"
#include "Editor.h"
#include "Server.h"

#include "DeviceOptions.h"

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <pthread.h>
#include <thread>

namespace VnTool {

namespace {

const char kCommand[] = "edit";

// The port to listen on from --port; -1 after a usage error has been reported.
int PortOption(const ParsedArgs& args) {
    if (!args.Has("--port")) {
        return 0;
    }
    std::string text = args.Value("--port");
    char* end = nullptr;
    long value = std::strtol(text.c_str(), &end, 10);
    if (text.empty() || *end != '\0' || value < 0 || value > 65535) {
        UsageError(kCommand, "--port wants 0..65535, got \"" + text + "\"");
        return -1;
    }
    return static_cast<int>(value);
}

// What an earlier session left: loaded, dropped, or a refusal to start over it.
int TakeRecovery(const ParsedArgs& args, Editor& editor, const std::string& pcf) {
    std::string error;
    if (!editor.HasRecovery()) {
        if (args.Has("--recover")) {
            std::printf("No unsaved changes to recover (%s does not exist)\n",
                        editor.RecoveryPath().c_str());
        }
        return kExitOk;
    }
    if (args.Has("--recover")) {
        if (!editor.LoadRecovery(error)) {
            return Refused(kCommand, error);
        }
        std::printf("Loaded the unsaved changes of %s; Save writes them to %s\n",
                    editor.RecoveryPath().c_str(), pcf.c_str());
        return kExitOk;
    }
    if (args.Has("--discard-recovery")) {
        std::error_code ec;
        std::filesystem::remove(editor.RecoveryPath(), ec);
        std::printf("Dropped the unsaved changes of an earlier session (%s)\n",
                    editor.RecoveryPath().c_str());
        return kExitOk;
    }
    // Starting over it would overwrite that work with this session's.
    return Refused(kCommand, editor.RecoveryPath() +
                                 " holds unsaved changes of an earlier session: start with "
                                 "--recover to load them, or --discard-recovery to drop them");
}

// Serves until SIGINT or SIGTERM, then says where unsaved work is.
int Serve(Editor& editor, EditorServer& server, const EditorFiles& files) {
    // Signals are taken by one thread with sigwait, so no handler runs inside the server
    // or the library; every thread started below inherits the mask.
    sigset_t stopSignals;
    sigemptyset(&stopSignals);
    sigaddset(&stopSignals, SIGINT);
    sigaddset(&stopSignals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &stopSignals, nullptr);

    std::thread serving([&] { server.Run(); });
    std::printf("Editing %s with %s on %s\nOpen %s in a browser; Ctrl-C stops.\n",
                files.pcf.c_str(), files.design.c_str(), files.device.chipDb.c_str(),
                server.Url().c_str());
    std::fflush(stdout);

    int signal = 0;
    sigwait(&stopSignals, &signal);
    server.Stop();
    serving.join();
    std::string error;
    if (!editor.WriteRecovery(error)) {
        return Refused(kCommand, "the unsaved changes were not kept: " + error);
    }
    if (editor.Unsaved()) {
        std::printf("Stopped; unsaved changes kept in %s (start with --recover to load them)\n",
                    editor.RecoveryPath().c_str());
    } else {
        std::printf("Stopped; nothing unsaved\n");
    }
    return kExitOk;
}

int Run(const ParsedArgs& args) {
    EditorFiles files;
    files.design = args.Value("--design");
    files.pcf = args.Value("--pcf");
    if (files.design.empty() || files.pcf.empty()) {
        return UsageError(kCommand, "--design and --pcf are required");
    }
    if (args.Value("--chipdb") == "-") {
        return UsageError(kCommand, "the editor reads its chip database from a file, not "
                                    "standard input");
    }
    const int port = PortOption(args);
    if (port < 0) {
        return kExitUsage;
    }
    if (args.Has("--recover") && args.Has("--discard-recovery")) {
        return UsageError(kCommand, "--recover and --discard-recovery exclude each other");
    }
    std::unique_ptr<DeviceModel> device;
    if (int status = OpenDevice(kCommand, args, files.device, device); status != kExitOk) {
        return status;
    }
    std::string page = FindDataFile("editor/index.html");
    if (page.empty()) {
        return Refused(kCommand, "the editor's page (share/venlomer/editor) was not found; set "
                                 "VENLOMER_DATA_PATH to the folder that holds it");
    }
    if (!files.device.note.empty()) {
        std::printf("Note: %s\n", files.device.note.c_str());
    }
    Editor editor;
    std::string error;
    if (!editor.Open(files, std::move(device), error)) {
        return Refused(kCommand, error);
    }
    // The lock comes before the recovery file: that file is the running editor's work.
    EditorServer server(editor);
    EditLock lock;
    if (!server.Load(std::filesystem::path(page).parent_path().string(), error) ||
        !server.Bind(port, error) || !lock.Take(files.pcf, server.Port(), error)) {
        return Refused(kCommand, error);
    }
    if (lock.TookOverStale()) {
        std::printf("Took over %s: the editor that left it is gone\n", lock.Path().c_str());
    }
    if (int status = TakeRecovery(args, editor, files.pcf); status != kExitOk) {
        return status;
    }
    return Serve(editor, server, files);
}

} // namespace

const Command& EditCommand() {
    static const Command command{
        {kCommand,
         "",
         "plan pins in a browser: a local editor served on 127.0.0.1",
         {
             {"--design", "FILE", "yosys JSON netlist of the design (required)"},
             {"--pcf", "FILE", "constraint file to edit; created by the first Save (required)"},
             {"--chipdb", "FILE", "chip database (default: chipdb-8k.txt of fpga-icestorm-chipdb)"},
             {"--device", "NAME", "chipdb-NAME.txt of the chip-database folder"},
             {"--package", "NAME", "package whose pins to plan (default: the device's usual)"},
             {"--port", "N", "port to listen on (default: 0, a free port)"},
             {"--recover", "", "load the unsaved changes an earlier session left"},
             {"--discard-recovery", "", "drop the unsaved changes an earlier session left"},
         },
         0,
         0,
         "The server listens on 127.0.0.1 only and prints the address to open. Unsaved\n"
         "changes go to FILE.recovery beside the constraint file after every change; a\n"
         "later start refuses to run over them until told --recover or\n"
         "--discard-recovery. One editor per constraint file: a second is refused with\n"
         "the first one's pid and port (FILE.lock); a lock left by a killed editor is\n"
         "taken over. Save refuses to write over a file changed on disk meanwhile.\n"
         "Example: venlomer edit --design top.json --pcf top.pcf --device 8k\n"},
        Run};
    return command;
}

} // namespace VnTool
