//===-- s/SelectionManager.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/SelectionManager.h"

#include "VnI/ITreeNode.h"
#include "s/PropertyHolderItr.h"
#include "s/internal/Shapes.h"

#include "s/internal/PointerIndex.h"
#include "s/internal/Spill.h"

#include <cstdint>
#include <deque>
#include <memory>
#include <new>
#include <vector>

namespace Vn::Eng {

namespace SelectionManagerImp {

using List = PropertyHolderList;

class SelectionManager_ISelectionManager final
    : public detail::InterfaceObject<SelectionManager, VnI::ISelectionManager> {
public:
    using InterfaceObject::InterfaceObject;
    int GetNumCategories() const override { return m_owner->GetNumCategories(); }
    CommonI::RefCountPtr<VnI::IPropertyHolderItr> GetSelectedItems(int category) override {
        return m_owner->GetSelectedItems(category);
    }
    CommonI::RefCountPtr<VnI::IPropertyHolderItr> GetAllSelectedItems() override {
        return m_owner->GetAllSelectedItems();
    }
    std::int64_t AddSelectedItem(VnI::IPropertyHolder* holder, bool withChildren) override {
        return m_owner->AddSelectedItem(holder, withChildren);
    }
    std::int64_t RemoveSelectedItem(VnI::IPropertyHolder* holder, bool withChildren) override {
        return m_owner->RemoveSelectedItem(holder, withChildren);
    }
    std::int64_t RemoveAll() override { return m_owner->RemoveAll(); }
};

// One selection of a holder: its node in its category list and in the overall list.
// A removal takes the category node and the oldest overall node, so the two can be
// gone at different times.
struct Entry {
    int category = -1;
    List::iterator inCategory{};
    List::iterator inAll{};
    bool hasCategory = false;
    bool hasAll = false;
    bool Used() const { return hasCategory || hasAll; }
};

// Where a holder stands when it needs more than one plain entry: it was selected again
// after a host cleared its flag by hand, or its entry is part taken.
using Positions = detail::Spill<VnI::IPropertyHolder, Entry>;

// One holder in the index, in sixteen bytes. A holder selected once keeps its two list
// nodes here, each beside 16 bits: the category's low 16 bits above the overall node,
// its high 4 bits and 12 bits of the address's hash above the category node (a node
// holds the holder, read only when the hash bits match). Any other holder has its
// Positions, marked by the low bit of the first word.
class Slot {
public:
    using Bits = detail::IteratorBits<List::iterator>;

    bool Empty() const { return m_all == 0; }
    bool Boxed() const { return (m_all & 1) != 0; }
    // The first word doubles as the boxed positions' pointer with the low bit set, so it
    // must be rebuilt from the integer.
    Positions* Box() const {
        return reinterpret_cast<Positions*>( // NOLINT(performance-no-int-to-ptr)
            m_all & ~std::uint64_t{1});
    }
    Entry Only() const {
        const auto category = static_cast<int>((m_all >> 48) | ((m_inCategory >> 48) & 0xF) << 16);
        return Entry{category, Bits::From(m_inCategory), Bits::From(m_all), true, true};
    }
    const VnI::IPropertyHolder* KeyOf() const {
        return Boxed() ? Box()->GetKey() : *Bits::From(m_all);
    }
    bool Holds(const VnI::IPropertyHolder* key, std::uint64_t hash) const {
        if (Boxed()) {
            return Box()->GetKey() == key;
        }
        return (m_inCategory >> 52) == (hash >> 52) && *Bits::From(m_all) == key;
    }

    /// Whether a whole entry packs into a slot.
    static bool Packs(const Entry& e) {
        return e.hasCategory && e.hasAll && e.category >= 0 && e.category < (1 << 20) &&
               Bits::Packs(e.inCategory) && Bits::Packs(e.inAll);
    }
    void SetOnly(const Entry& e, std::uint64_t hash) {
        const auto category = static_cast<std::uint64_t>(e.category);
        m_all = Bits::Of(e.inAll) | category << 48;
        m_inCategory = Bits::Of(e.inCategory) | (category >> 16) << 48 | (hash >> 52) << 52;
    }
    void SetBox(Positions* box) {
        m_all = reinterpret_cast<std::uintptr_t>(box) | 1;
        m_inCategory = 0;
    }

private:
    std::uint64_t m_all = 0;
    std::uint64_t m_inCategory = 0;
};
static_assert(sizeof(Slot) == 16);
static_assert(SelectionManager::kMaxCategories <= (1 << 20), "a category packs into 20 bits");

using Index = detail::PointerIndex<VnI::IPropertyHolder, Slot>;

struct Record {
    explicit Record(SelectionManager* owner) : m_selectedItems(12), m_interface(owner) {}
    ~Record() { FreeBoxes(); }
    Record(const Record&) = delete;
    Record& operator=(const Record&) = delete;

    // A deque keeps each category list where it is when categories are added, so
    // iterators handed out over one category survive another category's creation.
    std::deque<List> m_selectedItems;
    List m_allSelectedItems;
    SelectionManager_ISelectionManager m_interface;
    Index m_index;

    void FreeBoxes() {
        m_index.ForEach([](Slot& slot) {
            if (slot.Boxed()) {
                delete slot.Box();
            }
        });
    }
    // Takes the entry out of the index once its holder has no entry left in any list.
    void Forget(Slot* slot) {
        if (slot->Boxed()) {
            delete slot->Box();
        }
        m_index.Erase(slot);
    }
    void EraseEntry(const Entry& e) {
        m_selectedItems[static_cast<size_t>(e.category)].erase(e.inCategory);
        m_allSelectedItems.erase(e.inAll);
    }

    // Files holder under its type unless it is null, refused or already flagged.
    // True when it was selected now (so its subtree is to be visited).
    bool Select(VnI::IPropertyHolder* holder);
    // Takes back the newest selection, the last of the overall list, while a failed
    // AddSelectedItem unwinds. Allocates nothing.
    void UnselectNewest();
    // Select, then with withChildren the holders below, depth first.
    void SelectWithChildren(VnI::IPropertyHolder* holder, bool withChildren);
    // Takes holder out of its category and once out of the overall list. Allocates
    // nothing but its note for a holder that is not selected.
    void Unselect(VnI::IPropertyHolder* holder);
};

bool Record::Select(VnI::IPropertyHolder* holder) {
    if (holder == nullptr) {
        return false;
    }
    m_index.Prefetch(holder);
    const int type = holder->GetType();
    if (type < 0) {
        Port_MsgManData::debugStub("Cannot select an item of negative type %d\n", type);
        return false;
    }
    if (type >= SelectionManager::kMaxCategories) {
        Port_MsgManData::debugStub("Cannot select an item of type %d: at most %d categories\n",
                                   type, SelectionManager::kMaxCategories);
        return false;
    }
    if (static_cast<size_t>(type) >= m_selectedItems.size()) {
        m_selectedItems.resize(static_cast<size_t>(type) + 1);
    }
    if (holder->IsSelected()) {
        return false;
    }
    // Everything that can fail to allocate happens before the lists change: the two list
    // nodes are made in lists of their own and spliced in (which cannot fail) once the
    // index holds the entry, and the flag is set last. A failure leaves lists, index and
    // flag as they were.
    List inCategory;
    List inAll;
    inCategory.push_back(holder);
    inAll.push_back(holder);
    const Entry entry{type, inCategory.begin(), inAll.begin(), true, true};
    if (Slot* slot = m_index.Find(holder)) {
        if (slot->Boxed()) {
            slot->Box()->Append(entry);
        } else {
            auto box = std::make_unique<Positions>(holder, slot->Only());
            box->Append(entry);
            slot->SetBox(box.release());
        }
    } else {
        // An entry that cannot be packed (never seen on the platforms we build for) is
        // kept in a box of its own.
        auto box = Slot::Packs(entry) ? nullptr : std::make_unique<Positions>(holder, entry);
        Slot& added = m_index.Add(holder);
        if (box) {
            added.SetBox(box.release());
        } else {
            added.SetOnly(entry, Index::Hash(holder));
        }
    }
    List& category = m_selectedItems[static_cast<size_t>(type)];
    category.splice(category.end(), inCategory);
    m_allSelectedItems.splice(m_allSelectedItems.end(), inAll);
    holder->SetSelected(true);
    return true;
}

void Record::UnselectNewest() {
    VnI::IPropertyHolder* holder = m_allSelectedItems.back();
    Slot* slot = m_index.Find(holder);
    if (!slot->Boxed()) {
        EraseEntry(slot->Only());
        m_index.Erase(slot);
    } else {
        Positions* at = slot->Box();
        EraseEntry(at->Newest());
        if (!at->DropNewest()) {
            Forget(slot);
        }
    }
    holder->SetSelected(false);
}

void Record::SelectWithChildren(VnI::IPropertyHolder* holder, bool withChildren) {
    if (!Select(holder) || !withChildren) {
        return;
    }
    // Depth first, each holder before the holders below it, as a recursive walk would
    // visit them; the work list holds one child iterator per level. Every level stands on
    // a holder selected just now, so the walk ends even if tree links loop.
    struct Level {
        CommonI::RefCountPtr<VnI::ITreeNode> node; // keeps the iterator's tree alive
        CommonI::RefCountPtr<VnI::ITreeNodeItr> children;
    };
    std::vector<Level> work;
    const auto descend = [&work](VnI::IPropertyHolder* from) {
        if (auto node = from->GetParentTreeNode()) {
            auto children = node->GetChildren();
            if (children) {
                work.push_back({std::move(node), std::move(children)});
            }
        }
    };
    descend(holder);
    while (!work.empty()) {
        VnI::ITreeNodeItr& children = *work.back().children;
        if (children.IsEnd()) {
            work.pop_back();
            continue;
        }
        const auto child = children.CurrentItem();
        children.Next();
        // A child without a holder is a group node: it is skipped with its subtree.
        VnI::IPropertyHolder* below = child ? child->GetDataRef() : nullptr;
        if (below != nullptr && Select(below)) {
            descend(below);
        }
    }
}

void Record::Unselect(VnI::IPropertyHolder* holder) {
    const int type = holder->GetType();
    Slot* slot = m_index.Find(holder);
    bool listed = false;
    if (slot != nullptr && type >= 0 && static_cast<size_t>(type) < m_selectedItems.size()) {
        if (slot->Boxed()) {
            slot->Box()->ForEach(
                [&](const Entry& e) { listed = listed || (e.hasCategory && e.category == type); });
        } else {
            listed = slot->Only().category == type;
        }
    }
    if (!listed) {
        // Only a note for the developer: losing it to a failed allocation must not stop a
        // removal that is half done.
        try {
            Port_MsgManData::debugStub("Trying to remove an item that doesn't exist");
        } catch (const std::bad_alloc&) {
        }
        return;
    }
    holder->SetSelected(false);
    if (!slot->Boxed()) {
        EraseEntry(slot->Only());
        m_index.Erase(slot);
        return;
    }
    Positions* at = slot->Box();
    List& category = m_selectedItems[static_cast<size_t>(type)];
    // Out of its category wholly, out of the overall list once (its oldest place).
    bool allTaken = false;
    at->ForEach([&](Entry& e) {
        if (e.hasCategory && e.category == type) {
            category.erase(e.inCategory);
            e.hasCategory = false;
        }
        if (!allTaken && e.hasAll) {
            m_allSelectedItems.erase(e.inAll);
            e.hasAll = false;
            allTaken = true;
        }
    });
    // Keeps the oldest entry still in use in front.
    if (!at->DropOldestWhile([](const Entry& e) { return !e.Used(); })) {
        Forget(slot);
    }
}

} // namespace SelectionManagerImp

using SelectionManagerImp::Record;

SelectionManager::SelectionManager() : m_imp(new Record(this)) {}

SelectionManager::~SelectionManager() {
    for (const auto& category : m_imp->m_selectedItems) {
        for (VnI::IPropertyHolder* holder : category) {
            if (holder != nullptr) {
                holder->SetSelected(false);
            }
        }
    }
    delete m_imp;
}

CitI::IInterface* SelectionManager::GetInterface(const Port::XUID& id) {
    if (id == VnI::IID_ISelectionManager || id == CitI::IID_IInterface) {
        return &m_imp->m_interface;
    }
    return nullptr;
}

int SelectionManager::GetNumCategories() const {
    return static_cast<int>(m_imp->m_selectedItems.size());
}

std::int64_t SelectionManager::AddSelectedItem(VnI::IPropertyHolder* holder, bool withChildren) {
    // A failure part way leaves the selection as it was: the categories added and every
    // holder selected by this call are taken back, newest first. Each holder selected
    // here stands at the end of the overall list, so its length before the call tells
    // them apart from older selections.
    const std::size_t categoriesBefore = m_imp->m_selectedItems.size();
    const std::size_t selectedBefore = m_imp->m_allSelectedItems.size();
    try {
        m_imp->SelectWithChildren(holder, withChildren);
    } catch (...) {
        while (m_imp->m_allSelectedItems.size() > selectedBefore) {
            m_imp->UnselectNewest();
        }
        m_imp->m_selectedItems.resize(categoriesBefore);
        throw;
    }
    return 1;
}

std::int64_t SelectionManager::RemoveSelectedItem(VnI::IPropertyHolder* holder, bool withChildren) {
    if (holder == nullptr) {
        return 1;
    }
    // The children's iterator is the one allocation here, so it is taken before anything
    // changes: if it cannot be made, the selection stays as it was.
    CommonI::RefCountPtr<VnI::ITreeNode> node;
    CommonI::RefCountPtr<VnI::ITreeNodeItr> children;
    if (withChildren) {
        node = holder->GetParentTreeNode();
        if (node) {
            children = node->GetChildren();
        }
    }
    m_imp->Unselect(holder);
    for (; children && !children->IsEnd(); children->Next()) {
        const auto child = children->CurrentItem();
        if (VnI::IPropertyHolder* below = child ? child->GetDataRef() : nullptr) {
            m_imp->Unselect(below);
        }
    }
    return 1;
}

std::int64_t SelectionManager::RemoveAll() {
    for (auto& category : m_imp->m_selectedItems) {
        for (VnI::IPropertyHolder* holder : category) {
            holder->SetSelected(false);
        }
        category.clear();
    }
    m_imp->m_allSelectedItems.clear();
    m_imp->FreeBoxes();
    m_imp->m_index.Clear();
    return 1;
}

CommonI::RefCountPtr<VnI::IPropertyHolderItr> SelectionManager::GetSelectedItems(int category) {
    if (category < 0 || category >= GetNumCategories()) {
        return nullptr;
    }
    return PropertyHolderItr::CreateInstance(
        &m_imp->m_selectedItems[static_cast<size_t>(category)]);
}

CommonI::RefCountPtr<VnI::IPropertyHolderItr> SelectionManager::GetAllSelectedItems() {
    return PropertyHolderItr::CreateInstance(&m_imp->m_allSelectedItems);
}

} // namespace Vn::Eng
