//===-- s/SelectionManager.h - the editor's current selection -------------------===//
//
// \file
// Holders are filed by category (their holder type) and in one overall list, each in
// order of selection, and their own selected flags are kept in step. The manager keeps
// plain pointers and owns nothing: a holder must be deselected (or the selection cleared)
// before it is destroyed.
//
// Beside the lists the manager keeps an index from each holder to its list positions,
// so deselecting one holder costs the same with ten holders selected as with a million.
// Descending into the tree uses an explicit work list, so a chain of any depth is safe.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IManagers.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace SelectionManagerImp {
struct Record;
}

class VENLOMER_API SelectionManager {
public:
    /// Categories beyond this are refused (a holder type of 2^31 would otherwise ask for
    /// two billion category lists).
    static constexpr int kMaxCategories = 1 << 20;

    SelectionManager();
    /// Clears the selected flag of every holder still selected.
    virtual ~SelectionManager();
    SelectionManager(const SelectionManager&) = delete;
    SelectionManager& operator=(const SelectionManager&) = delete;

    /// VnI::ISelectionManager and CitI::IInterface give the interface object; others null.
    CitI::IInterface* GetInterface(const Port::XUID& id);
    int GetNumCategories() const;
    /// Selects holder and, with withChildren, every holder below its tree node, depth
    /// first. A holder already flagged selected is not visited. Returns 1.
    std::int64_t AddSelectedItem(VnI::IPropertyHolder* holder, bool withChildren);
    /// Deselects holder and, with withChildren, the holders of its node's direct children.
    /// Returns 1.
    std::int64_t RemoveSelectedItem(VnI::IPropertyHolder* holder, bool withChildren);
    /// Deselects every holder; the categories remain. Returns 1.
    std::int64_t RemoveAll();
    /// An iterator over one category in order of selection; null for no such category.
    CommonI::RefCountPtr<VnI::IPropertyHolderItr> GetSelectedItems(int category);
    /// An iterator over every selected holder in order of selection.
    CommonI::RefCountPtr<VnI::IPropertyHolderItr> GetAllSelectedItems();

private:
    SelectionManagerImp::Record* m_imp;
};

} // namespace Vn::Eng
