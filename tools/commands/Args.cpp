//===-- tools/commands/Args.cpp - command-line options of the venlomer subcommands ---===//
#include "Args.h"

namespace VnTool {

namespace {

const OptionSyntax* FindOption(const CommandSyntax& syntax, const std::string& name) {
    for (const auto& option : syntax.options) {
        if (option.name == name) {
            return &option;
        }
    }
    return nullptr;
}

// One option at args[i] (with its value, which may be the next argument: i moves past it)
// into `out`.
bool TakeOption(const CommandSyntax& syntax, const std::vector<std::string>& args, std::size_t& i,
                ParsedArgs& out, std::string& error) {
    const std::string& arg = args[i];
    std::string name = arg;
    std::string value;
    bool inlineValue = false;
    if (auto eq = arg.find('='); eq != std::string::npos && arg.rfind("--", 0) == 0) {
        name = arg.substr(0, eq);
        value = arg.substr(eq + 1);
        inlineValue = true;
    }
    const OptionSyntax* option = FindOption(syntax, name);
    if (option == nullptr) {
        error = "unknown option " + name;
        return false;
    }
    if (out.Has(name) && !option->repeat) {
        error = "option " + name + " given twice";
        return false;
    }
    if (option->value.empty()) {
        if (inlineValue) {
            error = "option " + name + " takes no value";
            return false;
        }
        out.flags.insert(name);
        return true;
    }
    if (!inlineValue) {
        if (i + 1 >= args.size()) {
            error = "option " + name + " needs a value (" + option->value + ")";
            return false;
        }
        value = args[++i];
    }
    out.values[name] = value;
    out.lists[name].push_back(value);
    return true;
}

} // namespace

bool ParseArgs(const CommandSyntax& syntax, const std::vector<std::string>& args, ParsedArgs& out,
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
        if (!TakeOption(syntax, args, i, out, error)) {
            return false;
        }
    }
    if (out.help) {
        return true;
    }
    if (out.operands.size() < syntax.minOperands) {
        error = "missing operand" + std::string(syntax.operands.empty() ? "" : ": expected ") +
                syntax.operands;
        return false;
    }
    if (out.operands.size() > syntax.maxOperands) {
        error = "unexpected operand " + out.operands[syntax.maxOperands];
        return false;
    }
    return true;
}

std::string HelpText(const CommandSyntax& syntax) {
    std::string text = "usage: venlomer " + syntax.name;
    if (!syntax.options.empty()) {
        text += " [options]";
    }
    if (!syntax.operands.empty()) {
        text += " " + syntax.operands;
    }
    text += "\n\n" + syntax.summary + "\n\noptions:\n";
    std::vector<OptionSyntax> all = syntax.options;
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
    if (!syntax.details.empty()) {
        text += "\n" + syntax.details;
        if (text.back() != '\n') {
            text += "\n";
        }
    }
    return text;
}

} // namespace VnTool
