//===-- tools/device/DeviceOptions.h - which chip database a command opens ---===//
//
// \file
// Every subcommand that shows or plans a device takes the same three options and means
// the same by them:
//
//   --chipdb FILE   that chip database ("-" for standard input)
//   --device NAME   a part as nextpnr-ice40 names it (hx8k, up5k, ...), or
//                   chipdb-NAME.txt of the chip-database folder (8k, 5k, lm4k, ...)
//   --package NAME  the package whose pins are read
//
// With neither --chipdb nor --device the 8k device in ct256 is opened from the
// chip-database folder when it is installed, else the demo device bundled with venlomer,
// with a note saying so. The folder is /usr/share/fpga-icestorm/chipdb unless
// VENLOMER_CHIPDB_DIR names another.
//
//   VnTool::DeviceRequest request;            // filled from the command line
//   VnTool::DeviceSource source;
//   std::string error;
//   switch (VnTool::ResolveDevice(request, source, error)) { ... }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace VnTool {

/// The folder chipdb-NAME.txt files are looked up in when VENLOMER_CHIPDB_DIR is unset.
inline constexpr char kDefaultChipDbFolder[] = "/usr/share/fpga-icestorm/chipdb";

/// The device options as the user gave them; an option not given is empty.
struct DeviceRequest {
    std::string chipDb;  ///< --chipdb
    std::string device;  ///< --device
    std::string package; ///< --package
};

/// A part as nextpnr-ice40 names it, the chip database that describes it and the package
/// nextpnr takes when none is given.
struct PartInfo {
    const char* part;           ///< "hx8k"
    const char* chipDb;         ///< the NAME of chipdb-NAME.txt: "8k"
    const char* defaultPackage; ///< "ct256"
    const char* packageSuffix;  ///< ":4k" when the part's packages are listed so, else ""
    bool ultraPlus;             ///< takes -pullup_resistor and has the LED driver
};

/// The parts nextpnr-ice40 takes, in the order of its --help.
const std::vector<PartInfo>& Parts();

/// The part named `name`, or null.
const PartInfo* FindPart(const std::string& name);

/// The file and package to read.
struct DeviceSource {
    std::string chipDb;
    std::string package;   ///< empty: the first package of the file
    std::string note;      ///< why the device is not the one the user may expect; else empty
    std::string part = {}; ///< the nextpnr-ice40 part asked for; empty for a chip-database name
};

enum class DeviceResolution {
    Ok,
    BadUsage, ///< the options contradict each other or a name is malformed
    Missing,  ///< no chip database could be found
};

/// The chip-database folder: VENLOMER_CHIPDB_DIR, else kDefaultChipDbFolder.
std::string ChipDbFolder();

/// Decides which file and package a request means. On anything but Ok, `error` holds a
/// one-line reason and `source` is unspecified. Looks at the file system, reads nothing.
DeviceResolution ResolveDevice(const DeviceRequest& request, DeviceSource& source,
                               std::string& error);

/// A data file shipped with venlomer: looked up in the folders of VENLOMER_DATA_PATH,
/// then in share/venlomer beside the program's bin folder. Empty when not found.
std::string FindDataFile(const std::string& name);

/// This program's own file; empty when the system does not say.
std::filesystem::path ProgramFile();
/// The data folder that comes with this program, <program>/../share/venlomer, in a build
/// tree and an installed tree alike; empty when the program's file is not known.
std::filesystem::path OwnDataFolder();

} // namespace VnTool
