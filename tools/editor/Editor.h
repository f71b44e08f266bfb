//===-- tools/editor/Editor.h - the pin-planning editor's engine ----------===//
//
// \file
// One object holds everything a browser session edits: the design's ports as holders,
// the constraint file, the device, the selection and the highlight, and the undo
// history. The HTTP server hands it every API request as (method, path, body) and sends
// back what it answers; nothing else touches the library, and Handle() takes the one
// lock, because the library's colour manager changes state on look-up and the managers
// keep plain pointers.
//
// The JSON API (every body is a JSON object; errors are {"error": "why"} with a 4xx):
//
//   GET  /api/state       the whole state: the plan and the marks below.
//                         The plan: revision, saved, canUndo, canRedo, files (names
//                         only), ports [{id,name,bus,bit,direction,clock,pin,bank}],
//                         assignments {pin: port}, problems [{severity,port,pin,message}],
//                         errors, problemPins, problemPorts.
//                         The marks: revision, selected ids, highlighted pins {pin:
//                         colour}, matches (ids of the last search), matchColor.
//   GET  /api/ping        {revision}: cheap, for the page to see that the server is there.
//   GET  /api/device      the device once: name, package, width, height, tiles
//                         [{name,x,y,type,site,color}], pins [{id,name,bank,x,y,block,
//                         gbuf,color}], bank colours, selected-path colours.
//   GET  /api/tree        {roots: [node]}, node = {label, id (absent for groups),
//                         children}; the device's and the design's trees as the library's
//                         tree models give them.
//   POST /api/search      {property, value, flags: ["exact", "ignore-case", "substring",
//                         "regexp", "less", "greater", "within-5-percent", "any"]}: the
//                         pins and ports whose property matches; matched pins become the
//                         highlight. {clear: true} drops the search. Answers the marks.
//   POST /api/select      {id, mode: "replace" | "toggle" | "add", descend}: a click,
//                         a shift-click, a tree node with the holders below it;
//                         {clear: true} empties the selection. Answers the marks.
//   GET  /api/properties  the properties of the holder selected last: {id, kind,
//                         properties: [{name, type, value}]}; {id: null} when none.
//   POST /api/assign      {port, pin}: puts the port on the pin.
//   POST /api/unassign    {port}: takes the port off its pin.
//   POST /api/auto        {}: gives every port without a pin a free one.
//   POST /api/undo        {step}: step is the revision the page shows; a stale one is
//   POST /api/redo        refused (409), so two tabs cannot undo each other's work.
//   POST /api/save        {}: writes the constraint file through the safe writer. When
//                         the file on disk is no longer what was read or last saved, the
//                         save is refused (409, changedOnDisk: true) and nothing is written.
//   POST /api/take-disk   {reapply}: takes the constraint file as it is on disk now; with
//                         reapply true this editor's edits go on top, port by port, and a
//                         port whose lines the file changed too is refused (409,
//                         changedOnDisk: true, conflicts: ["top.pcf:4: set_io ...", ...]).
//                         Undo starts over from the file taken.
//
// Every change writes the recovery file before it answers; the plan's recoveryError says
// why when that failed. Bodies nested deeper than 32 levels, fields of the wrong type and
// invalid regular expressions are refused with 400; quoted input is cut to 200 bytes.
//
// The other changes answer the plan. An answer holds every field of its part, so laying it
// over the state held before gives the state after. An assignment that would add an error
// of the checks is refused (409, the messages) and changes nothing, as `pins assign`
// refuses it. Unknown ports, pins and ids are 404, malformed requests 400.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "DeviceModel.h"
#include "DeviceOptions.h"
#include "Pcf.h"
#include "PinPlan.h"
#include "YosysPorts.h"

#include <memory>
#include <mutex>
#include <string>

namespace VnTool {

struct EditorFiles {
    std::string design;  ///< yosys JSON netlist
    std::string pcf;     ///< constraint file; created by the first save when missing
    DeviceSource device; ///< chip database and package
};

struct EditorReply {
    int status = 200;
    std::string body;                      ///< JSON, but for the plan table
    std::string type = "application/json"; ///< what `body` is
};

class Editor {
public:
    Editor();
    ~Editor();
    Editor(const Editor&) = delete;
    Editor& operator=(const Editor&) = delete;

    /// Reads the three files. False with a one-line reason naming file and line; a netlist
    /// whose port names hold control bytes is refused.
    bool Open(const EditorFiles& files, std::string& error);
    /// The same with the device opened already (as the commands open it).
    bool Open(const EditorFiles& files, std::unique_ptr<DeviceModel> device, std::string& error);

    /// Where unsaved work goes: beside the constraint file, "P.recovery", or for names too
    /// long for that a cut of the name with a hash of it.
    std::string RecoveryPath() const;
    /// Whether a recovery file from an earlier session exists.
    bool HasRecovery() const;
    /// Takes the recovery file's constraints as unsaved work. False with a reason when it
    /// cannot be read or parsed; nothing changes then.
    bool LoadRecovery(std::string& error);
    /// Writes the recovery file when there is unsaved work it does not hold yet. False
    /// with a reason when the write failed.
    bool WriteRecovery(std::string& error);
    /// Whether there is work the constraint file does not hold.
    bool Unsaved() const;
    /// Bytes the undo and redo history holds.
    std::size_t HistoryBytes() const;

    /// Serves one API request under the lock.
    EditorReply Handle(const std::string& method, const std::string& path, const std::string& body);

private:
    struct State;
    std::unique_ptr<State> m_state;
    mutable std::mutex m_lock;
};

} // namespace VnTool
