//===-- tools/editor/PlanSession.h - one constraint file being edited -----===//
//
// \file
// The plan the editor changes: the constraint file's lines, the checks of them (run once
// per change), undo and redo as line changes, the save that refuses to write over a file
// someone else changed, the take-over of that file with this session's edits laid on top,
// and the recovery file that holds unsaved work after every change. Nothing here knows
// HTTP or JSON; a refusal is thrown as a PlanRefusal and changes nothing.
//
//   VnTool::PlanSession plan;
//   if (!plan.Open(db, design, "top.json", "top.pcf", error)) { report(error); }
//   plan.Edit([](VnTool::PcfFile& next) { next.Assign("led[0]", "B5"); });
//   plan.Save({"top.json", "chipdb.txt"});
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "Pcf.h"
#include "PinPlan.h"
#include "YosysPorts.h"

#include <functional>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace VnTool {

/// A request the plan refuses: `status` as HTTP would say it, `what` for the person, and
/// for a conflict with the file on disk the lines in conflict.
struct PlanRefusal {
    PlanRefusal(int code, std::string why) : status(code), what(std::move(why)) {}
    int status;
    std::string what;
    bool changedOnDisk = false;
    std::vector<std::string> conflicts;
};

/// The name of a file kept beside `path` with `suffix` appended; for names too long for
/// that, a cut of the name, a hash of the whole of it and the suffix, so that every legal
/// name has one, and the same one each time.
std::string SideFilePath(const std::string& path, const std::string& suffix);

class PlanSession {
public:
    /// Reads the constraint file (missing is an empty plan) and checks it.
    bool Open(const ChipDb& db, const Design& design, const std::string& designPath,
              const std::string& pcfPath, std::string& error);

    const PcfFile& Pcf() const { return m_pcf; }
    const std::vector<PinProblem>& Problems() const { return m_problems; }
    /// The pin of every port with a set_io line: the one place the editor reads it from.
    const std::map<std::string, std::string>& PinOfPort() const { return m_pinOfPort; }
    long Revision() const { return m_revision; }
    bool CanUndo() const { return !m_undo.empty(); }
    bool CanRedo() const { return !m_redo.empty(); }
    /// Whether there is work the constraint file does not hold (by text, so that undoing
    /// back to the saved plan counts as saved).
    bool Unsaved() const;
    /// Bytes the undo and redo steps hold.
    std::size_t HistoryBytes() const;

    /// Applies `change` to a copy and keeps it unless it adds an error of the checks.
    void Edit(const std::function<void(PcfFile&)>& change);
    /// `step` is the revision the page shows; a stale one is refused.
    void Undo(long step);
    void Redo(long step);

    /// Writes the plan, refusing when the file on disk is no longer what was read or last
    /// saved. `inputs` are files the write must never replace.
    void Save(const std::vector<std::string>& inputs);
    /// Takes the file on disk as it is now; with `reapply`, this session's edits are laid
    /// on top, port by port, and a port the file changed too is refused as a conflict.
    void TakeDisk(bool reapply);

    std::string RecoveryPath() const { return SideFilePath(m_pcfPath, ".recovery"); }
    /// Makes the recovery file hold the unsaved work (or removes it when there is none).
    bool WriteRecovery(std::string& error);
    /// Takes the recovery file's constraints as unsaved work.
    bool LoadRecovery(std::string& error);

private:
    struct Step {
        std::size_t at = 0;               // first line changed
        std::vector<std::string> removed; // lines (with their ends) the change took out
        std::vector<std::string> added;   // lines it put in their place
    };
    static Step Diff(const PcfFile& before, const PcfFile& after);
    void Travel(std::vector<Step>& from, std::vector<Step>& to, long step, const char* what);
    void Adopt(PcfFile next, std::vector<PinProblem> problems);
    bool ReadDisk(std::string& text, bool& exists, std::string& error) const;
    PcfFile Reapplied(const PcfFile& disk) const;

    const ChipDb* m_db = nullptr;
    const Design* m_design = nullptr;
    std::string m_designPath;
    std::string m_pcfPath;
    PcfFile m_pcf;
    std::string m_text; // m_pcf.Text(), kept: every answer asks whether it is saved
    std::vector<PinProblem> m_problems;
    std::map<std::string, std::string> m_pinOfPort;
    std::vector<Step> m_undo;
    std::vector<Step> m_redo;
    long m_revision = 0;
    std::string m_diskText;     // what the file held when read or last saved
    bool m_diskExisted = false; // whether it existed then
    std::string m_recoveredText;
    bool m_ownsRecovery = false;
};

} // namespace VnTool
