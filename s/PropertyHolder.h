//===-- s/PropertyHolder.h - the base of every object that carries properties ---===//
//
// \file
// A holder keeps its properties by position: the property stored under the n-th name of
// the holder's name list sits in slot n, and its index is n. The concrete holder supplies
// the name list, its name and its holder type; this base does the storage, the look-ups,
// the property iterator, the counted link to the tree node that shows the holder and the
// selected flag the selection manager keeps.
//
// A holder is not reference counted: whoever creates one deletes it. It owns one
// reference on each property it stores and one on its tree node; it does not own its
// name list.
//
//   MyResource r;                                   // GetPropertyNames() gives its schema
//   r.AddProperty("Bank", PropertyFactory::CreateIntProperty(12));
//   auto bank = r.GetPropertyByName("Bank");        // one name look-up, one vector index
//
// A property index is 8 bits wide, so a holder stores properties under the first 128
// names of its list only; AddProperty refuses (returns 0) beyond that.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"
#include "VnI/ITreeNode.h"
#include "s/Export.h"

namespace Vn::Eng {

class PropertyHolder;
class TreeNode;

namespace PropertyHolderImp {
struct Record;
}

namespace detail {
// Where the nodes that show a holder are listed, so a dying holder can tell them.
TreeNode*& NodesShowing(PropertyHolder& holder);
// The last slot a holder stores into: slot numbers travel as a property's 8-bit index.
inline constexpr int kMaxSlot = 127;
// Stores property (not null) in slot index of holder, whose name list now has numNames
// names, growing the slots as AddProperty does. Returns 1.
std::int64_t StoreProperty(PropertyHolder& holder, int index, int numNames,
                           const CommonI::RefCountPtr<VnI::IProperty>& property);
// A hint for a walk over many holders (s/internal/Lookahead.h): the holder's record.
void HintRecord(const PropertyHolder& holder);
} // namespace detail

class VENLOMER_API PropertyHolder : public VnI::IPropertyHolder {
public:
    PropertyHolder();
    /// Releases the properties and the tree node. Nodes that still show this holder
    /// answer null from GetDataRef afterwards.
    ~PropertyHolder() override;
    PropertyHolder(const PropertyHolder&) = delete;
    PropertyHolder& operator=(const PropertyHolder&) = delete;

    /// VnI::IPropertyHolder and CitI::IInterface give this holder; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// GetName() unless a concrete holder says otherwise.
    Port::StringBase<char> GetDisplayName() override;
    /// A new iterator (one reference) on this holder's slots, standing on slot 0; call
    /// First before reading. It skips empty slots and hidden properties.
    CommonI::RefCountPtr<VnI::IPropertyItr> GetProperties() override;
    /// Number of occupied slots.
    int GetNumProperties() override;
    /// The property stored under name (one new reference); null for an unknown name, a
    /// name beyond this holder's slots, an empty slot or no name list.
    CommonI::RefCountPtr<VnI::IProperty>
    GetPropertyByName(const Port::StringBase<char>& name) override;
    /// Stores property under name, adding the name to the list (with `visible`) when it
    /// is new. Returns 1 when stored; 0 with nothing changed for a null property, no name
    /// list, or a name that would sit beyond position 127.
    std::int64_t AddProperty(const Port::StringBase<char>& name,
                             const CommonI::RefCountPtr<VnI::IProperty>& property,
                             bool visible) override;
    /// Empties the slot of name; the name stays in the list. 0 without a name list, else 1.
    std::int64_t RemoveProperty(const Port::StringBase<char>& name) override;
    /// The tree node that shows this holder (one new reference), or null.
    CommonI::RefCountPtr<VnI::ITreeNode> GetParentTreeNode() override;
    /// AddRef's node, then Release's the node held before. Returns 0.
    std::int64_t SetParentTreeNode(const CommonI::RefCountPtr<VnI::ITreeNode>& node) override;
    bool IsSelected() override;
    /// Stores the flag. Returns 0.
    std::int64_t SetSelected(bool selected) override;

    /// AddProperty(name, property, true).
    virtual std::int64_t AddProperty(const Port::StringBase<char>& name,
                                     const CommonI::RefCountPtr<VnI::IProperty>& property);

    /// "Name": the standard property name of a holder's name.
    static Port::StringBase<char> GetNameTitle();
    /// "Bridge ID": the standard property name of a holder's bridge identifier.
    static Port::StringBase<char> GetBridgeIDTitle();
    /// "Highlight Color": the standard property name of a holder's highlight colour.
    static Port::StringBase<char> GetHighlightColorTitle();

    void Dump() const;

private:
    friend TreeNode*& detail::NodesShowing(PropertyHolder& holder);
    friend std::int64_t detail::StoreProperty(PropertyHolder& holder, int index, int numNames,
                                              const CommonI::RefCountPtr<VnI::IProperty>& property);
    friend void detail::HintRecord(const PropertyHolder& holder);

    PropertyHolderImp::Record* m_imp;
};

} // namespace Vn::Eng
