//===-- ModelImp.h - a model's private state, shared by the library's own units -===//
//
// The model's units (Nmod_Model.cpp, the objects and Access) all reach this record; no
// other code sees it.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Store.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"

#include <memory>
#include <string>

namespace Nmod_Detail {

/// A text argument the caller must give: null is refused as misuse, never read.
inline std::string Required(const char* text, const char* what) {
    if (text == nullptr) {
        throw Nmod_Exception::Usage(std::string("no ") + what + " given (null)");
    }
    return text;
}

} // namespace Nmod_Detail

struct Nmod_Model::Imp {
    std::string modelName;
    std::string toolName;
    std::string toolVersion;
    bool readOnly = false;
    std::string fileName;
    bool ngd = false;
    bool closed = false;
    // Exceptions in flight when writing began: more of them at destruction means the
    // writer is being unwound, and its file must not be finished.
    int uncaughtAtCreate = 0;
    // Where to record that this model's own file went into place; may be null.
    bool* placed = nullptr;
    std::unique_ptr<Nmod_Detail::Store> store;
    std::unique_ptr<Nmod_DesignMgr> designMgr;
    std::unique_ptr<Nmod_Txn> txn;
};
