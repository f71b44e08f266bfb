//===-- tools/Args.cpp - command-line options of the venlomer subcommands -------===//
#include "Args.h"

namespace VnTool {

namespace {

const OptionSpec* FindOption(const CommandSpec& spec, const std::string& name) {
    for (const auto& option : spec.options) {
        if (option.name == name) {
            return &option;
        }
    }
    return nullptr;
}

} // namespace

bool ParseArgs(const CommandSpec& spec, const std::vector<std::string>& args, ParsedArgs& out,
               std::string& error) {
    out = ParsedArgs{};
    bool operandsOnly = false;
    for (std::size_t i = 0; i < args.size(); ++i) {
        const std::string& arg = args[i];
        if (operandsOnly || arg.size() < 2 || arg[0] != '-') {
            out.operands.push_back(arg);
            continue;
        }
        if (arg == "--") {
            operandsOnly = true;
            continue;
        }
        if (arg == "--help" || arg == "-h") {
            out.help = true;
            continue;
        }
        if (arg == "--verbose" || arg == "-v") {
            out.verbose = true;
            continue;
        }
        std::string name = arg;
        std::string value;
        bool inlineValue = false;
        if (auto eq = arg.find('='); eq != std::string::npos && arg.rfind("--", 0) == 0) {
            name = arg.substr(0, eq);
            value = arg.substr(eq + 1);
            inlineValue = true;
        }
        const OptionSpec* option = FindOption(spec, name);
        if (option == nullptr) {
            error = "unknown option " + name;
            return false;
        }
        if (out.Has(name)) {
            error = "option " + name + " given twice";
            return false;
        }
        if (option->value.empty()) {
            if (inlineValue) {
                error = "option " + name + " takes no value";
                return false;
            }
            out.flags.insert(name);
            continue;
        }
        if (!inlineValue) {
            if (i + 1 >= args.size()) {
                error = "option " + name + " needs a value (" + option->value + ")";
                return false;
            }
            value = args[++i];
        }
        out.values[name] = value;
    }
    if (out.help) {
        return true;
    }
    if (out.operands.size() < spec.minOperands) {
        error = "missing operand" + std::string(spec.operands.empty() ? "" : ": expected ") +
                spec.operands;
        return false;
    }
    if (out.operands.size() > spec.maxOperands) {
        error = "unexpected operand " + out.operands[spec.maxOperands];
        return false;
    }
    return true;
}

std::string HelpText(const CommandSpec& spec) {
    std::string text = "usage: venlomer " + spec.name;
    if (!spec.options.empty()) {
        text += " [options]";
    }
    if (!spec.operands.empty()) {
        text += " " + spec.operands;
    }
    text += "\n\n" + spec.summary + "\n\noptions:\n";
    std::vector<OptionSpec> all = spec.options;
    all.push_back({"--verbose", "", "show the library's debug messages too"});
    all.push_back({"--help", "", "show this help and exit"});
    for (const auto& option : all) {
        std::string left = "  " + option.name + (option.value.empty() ? "" : " " + option.value);
        if (left.size() < 26) {
            left.resize(26, ' ');
        } else {
            left += "\n" + std::string(26, ' ');
        }
        text += left + option.help + "\n";
    }
    if (!spec.details.empty()) {
        text += "\n" + spec.details;
        if (text.back() != '\n') {
            text += "\n";
        }
    }
    return text;
}

} // namespace VnTool
