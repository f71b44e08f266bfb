//===-- tools/editor/EditLock.cpp - one editor per constraint file --------===//
#include "EditLock.h"

#include "PlanSession.h"

#include "Port/SafeFile.h"

#include <cerrno>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

namespace VnTool {

namespace {

// Whether `pid` is a live venlomer. Where /proc cannot tell the program, a live process
// is taken to be one.
bool LiveEditor(long pid) {
    if (pid <= 0 || (::kill(static_cast<pid_t>(pid), 0) != 0 && errno != EPERM)) {
        return false;
    }
    std::ifstream command("/proc/" + std::to_string(pid) + "/cmdline", std::ios::binary);
    if (!command) {
        return true;
    }
    std::string first;
    std::getline(command, first, '\0');
    return std::filesystem::path(first).filename().string().find("venlomer") != std::string::npos;
}

} // namespace

EditLock::~EditLock() {
    if (!m_held) {
        return;
    }
    // Only our own lock: a later editor may have taken it over after all.
    std::string text;
    std::string error;
    if (Port::ReadRegularFile(m_path, text, error, 4096) && text == m_text) {
        ::unlink(m_path.c_str());
    }
}

bool EditLock::Take(const std::string& pcf, int port, std::string& error) {
    m_path = SideFilePath(pcf, ".lock");
    m_text = std::to_string(::getpid()) + " " + std::to_string(port) + "\n";
    m_stale = false;
    std::string why;
    for (int attempt = 0; attempt < 3; ++attempt) {
        Port::SafeWriter writer;
        if (writer.Open(m_path, why, {pcf}, Port::SafeWriter::Mode::CreateOnly) &&
            writer.Write(m_text, why) && writer.Commit(why)) {
            m_held = true;
            return true;
        }
        std::string held;
        std::string unread;
        if (!Port::ReadRegularFile(m_path, held, unread, 4096)) {
            continue; // gone between the two looks: try again
        }
        long pid = 0;
        long theirPort = 0;
        std::istringstream(held) >> pid >> theirPort;
        if (LiveEditor(pid)) {
            error = pcf + " is being edited by another venlomer edit (pid " + std::to_string(pid) +
                    ", http://127.0.0.1:" + std::to_string(theirPort) +
                    "/); stop it first, or edit there";
            return false;
        }
        // Stale: its editor is gone. Removing and retaking races only with another
        // starter, and then only one of the two create-only writes wins.
        m_stale = true;
        ::unlink(m_path.c_str());
    }
    error = "cannot take the lock " + m_path + ": " + why;
    return false;
}

} // namespace VnTool
