//===-- tools/commands/Netlist.cpp - venlomer ngc-stub, ngc-new and ngd-sample ---===//
//
// The stub creation reports through the library's messages; the tool adds only what the
// result means and leaves the reasons to them.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"

#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"
#include "s/Utilities.h"

#include <cstdio>
#include <filesystem>

namespace VnTool {

namespace {

bool Exists(const std::string& path) {
    std::error_code ec;
    return std::filesystem::exists(path, ec);
}

int RunStub(const ParsedArgs& args) {
    const std::string& ngd = args.operands[0];
    const std::string& ngc = args.operands[1];
    // The library tells these apart only in debug lines, which are not shown by default.
    if (ngd.empty() || ngc.empty()) {
        return Refused("ngc-stub", std::string("no stub made: the ") +
                                       (ngd.empty() ? "NGD" : "NGC") + " file name is empty");
    }
    bool existed = Exists(ngc);
    const int errorsBefore = LibraryErrorCount();
    if (!Vn::Eng::Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str())) {
        return Refused("ngc-stub", "no stub made from " + ngd +
                                       (LibraryErrorCount() > errorsBefore
                                            ? " (the library's message above says why)"
                                            : " (the library gave no reason)"));
    }
    if (existed) {
        std::printf("%s exists already and was left as it is; the library counts that as done\n",
                    ngc.c_str());
    } else {
        std::printf("Stub netlist database written to %s from %s\n", ngc.c_str(), ngd.c_str());
    }
    return kExitOk;
}

int RunNew(const ParsedArgs& args) {
    const auto& o = args.operands;
    if (o[0].empty()) {
        return Refused("ngc-new", "no stub made: the NGC file name is empty");
    }
    const bool existed = Exists(o[0]);
    const int errorsBefore = LibraryErrorCount();
    if (!Vn::Eng::Utilities::CreateNGC(o[0].c_str(), o[1].c_str(), o[2].c_str(), o[3].c_str())) {
        std::string why = existed ? " (the file exists already)"
                          : LibraryErrorCount() > errorsBefore
                              ? " (the library's message above says why)"
                              : " (the library gave no reason)";
        return Refused("ngc-new", "the design-model library refused to write " + o[0] + why);
    }
    std::printf("Stub netlist database written to %s: design %s, part %s, root block %s\n",
                o[0].c_str(), o[1].c_str(), o[2].c_str(), o[3].c_str());
    return kExitOk;
}

int RunSample(const ParsedArgs& args) {
    const std::string& out = args.operands[0];
    std::string design = args.Value("--design", "counter");
    std::string part = args.Value("--part", "iCE40HX8K-CT256");
    std::string block = args.Value("--block", "counter_root");
    if (Exists(out)) {
        return Refused("ngd-sample", out + " exists already; not overwritten");
    }
    try {
        // The shape the stub creation reads: one design with an EXPANDED view that names
        // its part and has a root block.
        Nmod_Model model("venlomer_sample", "venlomer", "1", false);
        model.Create(out.c_str(), true, false);
        model.CreateTxn("sample", Nmod_Txn::NMOD_TXN_UPDATE);
        Nmod_Design* d = model.GetDesignMgr()->CreateDesign(design.c_str());
        Nmod_View* view = d->CreateView("EXPANDED", true);
        view->CreatePropertyString("PART", part.c_str());
        view->CreateBlock(block.c_str(), 0);
        model.Close();
    } catch (const Nmod_Exception::Base& e) {
        return Refused("ngd-sample", std::string("cannot write ") + out + ": " + e.what());
    }
    std::printf("Sample netlist database written to %s: design %s, part %s, root block %s\n",
                out.c_str(), design.c_str(), part.c_str(), block.c_str());
    return kExitOk;
}

} // namespace

const Command& NgcStubCommand() {
    static const Command command{
        {"ngc-stub",
         "NGD NGC",
         "create a stub netlist database NGC from the netlist NGD",
         {},
         2,
         2,
         "The stub carries the NGD's design name, part and root block name and no logic.\n"
         "An existing NGC counts as done and is left as it is.\n"
         "Example: venlomer ngd-sample top.ngd && venlomer ngc-stub top.ngd top.ngc\n"},
        RunStub};
    return command;
}

const Command& NgcNewCommand() {
    static const Command command{
        {"ngc-new",
         "NGC DESIGN PART BLOCK",
         "create a stub netlist database NGC from four names",
         {},
         4,
         4,
         "Example: venlomer ngc-new top.ngc top iCE40HX8K-CT256 top_root\n"},
        RunNew};
    return command;
}

const Command& NgdSampleCommand() {
    static const Command command{
        {"ngd-sample",
         "OUT",
         "write a small valid NGD file to try ngc-stub on",
         {{"--design", "NAME", "design name (default: counter)"},
          {"--part", "NAME", "part, as a databook name (default: iCE40HX8K-CT256)"},
          {"--block", "NAME", "root block name (default: counter_root)"}},
         1,
         1,
         ""},
        RunSample};
    return command;
}

} // namespace VnTool
