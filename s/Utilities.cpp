//===-- s/Utilities.cpp ---------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/Utilities.h"

#include "Port/File.h"
#include "Port/MsgMan.h"
#include "designmodel/Nhlp_FileConv.h"
#include "designmodel/Nhlp_PartAnno.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"
#include "devdata/PM_PIC.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <optional>

namespace Vn::Eng {

namespace {

const char kDomain[] = "Venlomer";
const char kUnitPath[] = "../s/Utilities";
const char kRevision[] = "$Revision: 1.3 $";

// The lines that error messages of this unit are placed at. Hosts and their logs match
// messages by place, so these stay put when the code around them moves.
enum ErrorLine : int {
    kLineCannotRead = 131,
    kLineNotQdbReadable = 138,
    kLineNotRead = 150,
    kLineMoreThanOneDesign = 158,
    kLineNoDesign = 169,
    kLineNoExpandedView = 177,
    kLineNoPart = 185,
    kLineNoRootBlock = 194,
};

Port_MsgManData ErrorAt(ErrorLine line) {
    return Port_MsgManData::createObject(kDomain, kUnitPath, line, kRevision);
}

// The texts of CanRead's refusals. Formatted into a text first, which is then issued as
// an argument: a file name holding "%n" or "%s" is printed, never interpreted.
Port::StringBase<char> CannotReadText(int status, const char* ngdFile) {
    Port::StringBase<char> text;
    switch (status) {
    case Nhlp_FileConv::FILE_NOT_FOUND:
        text.Format("The ngd file \"%s\" was not found \n", ngdFile);
        break;
    case Nhlp_FileConv::FILE_NO_READ_PERMISSION:
        text.Format("The file \"%s\" cannot be read. Please check the file permission \n", ngdFile);
        break;
    case Nhlp_FileConv::FILE_NOT_NGD:
        text.Format("The file %s is not an ngd file \n", ngdFile);
        break;
    case Nhlp_FileConv::FILE_OBSOLETE:
        text.Format("The ngd file \"%s\" is obsolete \n", ngdFile);
        break;
    default:
        text.Format("An unknown error was returned reading the file \"%s\" \n", ngdFile);
        break;
    }
    return text;
}

// The three texts a stub carries, as read from an NGD.
struct NgdIdentity {
    Port::StringBase<char> designName;
    Port::StringBase<char> partName;
    Port::StringBase<char> blockName;
};

// The file checks before anything is read: CanRead's verdict, then the integrity test on
// a scratch model that lives only for the test. False after reporting the refusal.
bool NgdFileIsReadable(const Port::StringBase<char>& ngdFile) {
    const Nhlp_FileConv::FileStatus status = Nhlp_FileConv::CanRead(ngdFile.c_str());
    if (status != Nhlp_FileConv::FILE_READABLE) {
        const Port::StringBase<char> text = CannotReadText(status, ngdFile.c_str());
        ErrorAt(kLineCannotRead).issueError("%s", text.c_str());
        return false;
    }
    Nmod_Model scratch("TEST", "VAROSTE", "1.0", false);
    if (!Nmod_Model::IsQdbReadable(ngdFile.c_str())) {
        ErrorAt(kLineNotQdbReadable)
            .issueError("The ngd file \"%s\" is not QDB readable\n", ngdFile.c_str());
        return false;
    }
    return true;
}

// The only design of a model read from `ngdFile`; null after reporting why there is none
// or more than one.
Nmod_Design* OnlyDesign(Nmod_Model& model, const Port::StringBase<char>& ngdFile) {
    Nmod_DesignMgr* designs = model.GetDesignMgr();
    const unsigned int numDesigns = designs != nullptr ? designs->GetNumDesigns() : 0;
    if (numDesigns > 1) {
        ErrorAt(kLineMoreThanOneDesign)
            .issueError("The ngd file \"%s\" contains more than one design\n", ngdFile.c_str());
        return nullptr;
    }
    Nmod_Iterator<Nmod_Design*> designItr;
    if (designs != nullptr) {
        designItr = designs->GetDesignItr();
        designItr.First();
    }
    Nmod_Design* design = designItr.Current();
    if (numDesigns == 0 || design == nullptr) {
        ErrorAt(kLineNoDesign)
            .issueError("The ngd file \"%s\" does not contain a design\n", ngdFile.c_str());
        return nullptr;
    }
    return design;
}

// Design, part and root block names, in that order, each refusal reported as it is met.
// The part annotation is made in the caller's `partAnno`: it stays alive until the
// whole operation returns.
bool ReadIdentity(Nmod_Model& model, const Port::StringBase<char>& ngdFile,
                  std::optional<Nhlp_PartAnno>& partAnno, NgdIdentity& identity) {
    Nmod_Design* design = OnlyDesign(model, ngdFile);
    if (design == nullptr) {
        return false;
    }
    identity.designName = design->GetName();

    Nmod_View* view = design->GetViewByName("EXPANDED");
    if (view == nullptr) {
        ErrorAt(kLineNoExpandedView)
            .issueError("The ngd file \"%s\" does not contain an EXPANDED view\n", ngdFile.c_str());
        return false;
    }

    const PM_PIC* part = partAnno.emplace(view).GetPmPic();
    if (part == nullptr) {
        ErrorAt(kLineNoPart)
            .issueError("The ngd file \"%s\" does not name a part\n", ngdFile.c_str());
        return false;
    }
    identity.partName = part->getDatabookName();
    Port_MsgManData::debugStub("Parttype Databook format: %s\n", identity.partName.c_str());

    const Nmod_Block* block = view->GetBlock();
    if (block == nullptr) {
        ErrorAt(kLineNoRootBlock)
            .issueError("The ngd file \"%s\" does not contain a ROOT block\n", ngdFile.c_str());
        return false;
    }
    identity.blockName = block->GetName();
    return true;
}

} // namespace

bool Utilities::num_compare(const Port::StringBase<char>& a, const Port::StringBase<char>& b) {
    unsigned int valueA = 0;
    unsigned int valueB = 0;
    // The whole text is one number. For an empty text the range ends at 0xFFFFFFFF,
    // which reads no number, so it counts as 0 like any other text that is no number.
    a.GetUINT32(Port_Range{0, a.GetLength() - 1}, &valueA);
    b.GetUINT32(Port_Range{0, b.GetLength() - 1}, &valueB);
    return valueA < valueB;
}

bool Utilities::str_compare(const Port::StringBase<char>& a, const Port::StringBase<char>& b) {
    const unsigned int common = std::min(a.GetLength(), b.GetLength());
    // memcmp compares as unsigned char, which is the order wanted; lengths, not NULs,
    // end the texts.
    const int order = common != 0 ? std::memcmp(a.data(), b.data(), common) : 0;
    if (order != 0) {
        return order < 0;
    }
    return a.GetLength() < b.GetLength();
}

bool Utilities::CreateNGC(const Port::StringBase<char>& ngcFile,
                          const Port::StringBase<char>& designName,
                          const Port::StringBase<char>& partName,
                          const Port::StringBase<char>& blockName) {
    // Only this call's own stub counts: a file that another writer put under the same
    // name meanwhile does not hold this design, so its mere presence proves nothing.
    bool placed = false;
    try {
        // Owned here, so an exception in any step below still destroys the model, which
        // then throws its unfinished file away.
        auto model =
            std::make_unique<Nmod_Model>("STE_VARO_DUMMY_NGC_MODEL", "STE_VARO", kRevision, false);
        model->RecordPlacementIn(&placed);
        model->Create(ngcFile.c_str(), false, false);
        model->CreateTxn("txn", Nmod_Txn::NMOD_TXN_UPDATE);
        Nmod_Design* design = model->GetDesignMgr()->CreateDesign(designName.c_str());
        Nmod_View* view = design->CreateView("SOURCE", true);
        view->CreatePropertyString("VIEW_TYPE", "LOGICAL");
        view->CreatePropertyString("PART", partName.c_str());
        view->CreateBlock(blockName.c_str(), 0);
        // Destroying the model is what completes the stub.
        model.reset();
    } catch (const Nmod_Exception::Base& e) {
        e.Report();
        return false;
    }
    // The destructor that puts the stub in place cannot throw; when it fails it has
    // reported why, and `placed` stays false.
    return placed;
}

bool Utilities::CreateNGCFromNGD(const Port::StringBase<char>& ngdFile,
                                 const Port::StringBase<char>& ngcFile) {
    if (ngdFile.IsEmpty() || ngcFile.IsEmpty()) {
        Port_MsgManData::debugStub("No ngd or ngc file specified.\n");
        return false;
    }
    if (Port::File::exist(ngcFile.c_str())) {
        Port_MsgManData::debugStub("Specified ngc file %s exists.\n", ngcFile.c_str());
        return true;
    }

    if (!NgdFileIsReadable(ngdFile)) {
        return false;
    }

    Nmod_Model* readModel = nullptr;
    Nmod_Txn* transaction = nullptr;
    Nhlp_FileConv::ReadAsNmod(ngdFile.c_str(), readModel, transaction, false);
    // Ours to delete on every way out, including the refusals below.
    const std::unique_ptr<Nmod_Model> model(readModel);
    if (!model) {
        ErrorAt(kLineNotRead)
            .issueError("The ngd file \"%s\" could not be read\n", ngdFile.c_str());
        return false;
    }

    std::optional<Nhlp_PartAnno> partAnno;
    NgdIdentity identity;
    if (!ReadIdentity(*model, ngdFile, partAnno, identity)) {
        return false;
    }

    if (transaction != nullptr) {
        model->DeleteTxn();
        model->Close();
    }
    return CreateNGC(ngcFile, identity.designName, identity.partName, identity.blockName);
}

} // namespace Vn::Eng
