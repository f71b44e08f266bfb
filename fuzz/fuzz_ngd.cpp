//===-- fuzz/fuzz_ngd.cpp - arbitrary bytes as a netlist database ---------------===//
//
// Whatever a file handed over as an NGD holds, telling it apart, checking it and reading
// it must neither crash nor leak nor write beside it: each either answers or throws the
// library's error.
// Every object a read hands out is walked so that bad records surface here and not in a
// caller.
//
//===------------------------------------------------------------------------------===//
#include "designmodel/Nhlp_FileConv.h"
#include "designmodel/Nhlp_PartAnno.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"
#include "devdata/PM_PIC.h"

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>
#include <unistd.h>

namespace {

const std::string& FuzzFile() {
    static const std::string path = [] {
        std::string name = (std::filesystem::temp_directory_path() /
                            ("fuzz_ngd-" + std::to_string(::getpid()) + ".ngd"))
                               .string();
        static std::string removeAtExit = name;
        std::atexit([] { std::remove(removeAtExit.c_str()); });
        return name;
    }();
    return path;
}

// A read model holds no duplicates: every name finds the object it belongs to.
size_t Walk(Nmod_Model& model) {
    size_t seen = 0;
    for (auto designs = model.GetDesignMgr()->GetDesignItr(); !designs.IsEnd(); designs.Next()) {
        Nmod_Design* design = designs.Current();
        if (model.GetDesignMgr()->GetDesignByName(design->GetName()) != design) {
            std::abort();
        }
        seen += std::string(design->GetName()).size();
        for (auto views = design->GetViewItr(); !views.IsEnd(); views.Next()) {
            Nmod_View* view = views.Current();
            if (design->GetViewByName(view->GetName()) != view) {
                std::abort();
            }
            seen += view->GetNumProperties();
            if (const Nmod_Block* block = view->GetBlock()) {
                seen += std::string(block->GetName()).size() + block->GetType();
            }
            Nhlp_PartAnno part(view);
            if (const PM_PIC* pic = part.GetPmPic()) {
                seen += pic->getDatabookName().GetLength();
            }
        }
    }
    return seen;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string& path = FuzzFile();
    if (FILE* file = std::fopen(path.c_str(), "wb")) {
        const bool written = size == 0 || std::fwrite(data, 1, size, file) == size;
        if (std::fclose(file) != 0 || !written) {
            return 0;
        }
    } else {
        return 0;
    }

    (void)Nhlp_FileConv::CanRead(path.c_str());
    (void)Nmod_Model::IsQdbReadable(path.c_str());
    for (const bool checkIntegrity : {false, true}) {
        Nmod_Model* raw = nullptr;
        Nmod_Txn* txn = nullptr;
        try {
            Nhlp_FileConv::ReadAsNmod(path.c_str(), raw, txn, checkIntegrity);
        } catch (const Nmod_Exception::Base&) {
            if (raw != nullptr || txn != nullptr) {
                std::abort(); // a failed read must hand out nothing
            }
            continue;
        }
        const std::unique_ptr<Nmod_Model> model(raw);
        if (!model || txn != model->GetTxn()) {
            std::abort();
        }
        (void)Walk(*model);
    }
    // Reading never writes beside the file, whatever its journal mode says.
    std::error_code ignored;
    if (std::filesystem::exists(path + "-wal", ignored) ||
        std::filesystem::exists(path + "-shm", ignored) ||
        std::filesystem::exists(path + "-journal", ignored)) {
        std::abort();
    }
    return 0;
}
