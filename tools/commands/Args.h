//===-- tools/commands/Args.h - command-line options of the venlomer subcommands ---===//
//
// \file
// Each subcommand declares its options once; parsing, the --help text and the usage
// errors (exit status 2) all come from that one declaration, so the help can never
// drift from what is accepted.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <map>
#include <set>
#include <string>
#include <vector>

namespace VnTool {

/// Exit statuses of the tool.
enum ExitStatus : int { kExitOk = 0, kExitRefused = 1, kExitUsage = 2 };

struct OptionSyntax {
    std::string name;  ///< with the leading dashes, such as "--svg"
    std::string value; ///< placeholder of its value ("OUT"); empty for a flag
    std::string help;
    bool repeat = false; ///< may be given more than once; see ParsedArgs::Values
};

struct CommandSyntax {
    std::string name;
    std::string operands; ///< operand placeholders for the synopsis ("NGD NGC")
    std::string summary;
    std::vector<OptionSyntax> options;
    std::size_t minOperands = 0;
    std::size_t maxOperands = 0;
    std::string details; ///< printed after the options in --help
};

struct ParsedArgs {
    std::map<std::string, std::string> values;             ///< the last value of a repeated option
    std::map<std::string, std::vector<std::string>> lists; ///< every value, in order
    std::set<std::string> flags;
    std::vector<std::string> operands;
    bool help = false;
    bool verbose = false;

    bool Has(const std::string& name) const {
        return values.count(name) != 0 || flags.count(name) != 0;
    }
    std::string Value(const std::string& name, const std::string& fallback = "") const {
        auto it = values.find(name);
        return it == values.end() ? fallback : it->second;
    }
    std::vector<std::string> Values(const std::string& name) const {
        auto it = lists.find(name);
        return it == lists.end() ? std::vector<std::string>{} : it->second;
    }
};

/// Parses the arguments after the subcommand name. Accepts "--opt VALUE", "--opt=VALUE",
/// "--" before operands that start with a dash, and --help/-h and --verbose everywhere.
/// Returns false with a one-line reason when the arguments do not fit the syntax.
bool ParseArgs(const CommandSyntax& syntax, const std::vector<std::string>& args, ParsedArgs& out,
               std::string& error);

/// The --help text of a subcommand.
std::string HelpText(const CommandSyntax& syntax);

} // namespace VnTool
