//===-- s/SelectionManager.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/SelectionManager.h"

#include "VnI/ITreeNode.h"
#include "s/PropertyHolderItr.h"
#include "s/internal/Shapes.h"

#include "s/internal/PointerIndex.h"

#include <deque>
#include <memory>
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

// Where one holder stands. A holder is normally selected once, and that entry lives in
// the index itself; it can stand more often only when a host cleared its flag by hand
// and selected it again, and only then is the spill vector allocated.
struct Positions {
    Entry first;
    std::unique_ptr<std::vector<Entry>> more; // later selections, oldest first

    template <class F> void ForEach(F&& f) {
        f(first);
        if (more) {
            for (Entry& e : *more) {
                f(e);
            }
        }
    }
    // Keeps the oldest entry still in use in `first`; false when none is left.
    bool Normalize() {
        while (!first.Used() && more && !more->empty()) {
            first = more->front();
            more->erase(more->begin());
        }
        return first.Used();
    }
};

struct Record {
    explicit Record(SelectionManager* owner) : m_selectedItems(12), m_interface(owner) {}

    // A deque keeps each category list where it is when categories are added, so
    // iterators handed out over one category survive another category's creation.
    std::deque<List> m_selectedItems;
    List m_allSelectedItems;
    SelectionManager_ISelectionManager m_interface;
    detail::PointerIndex<VnI::IPropertyHolder, Positions> m_index;

    // Files holder under its type unless it is null, refused or already flagged.
    // True when it was selected now (so its subtree is to be visited).
    bool Select(VnI::IPropertyHolder* holder);
};

bool Record::Select(VnI::IPropertyHolder* holder) {
    if (holder == nullptr) {
        return false;
    }
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
    holder->SetSelected(true);
    List& category = m_selectedItems[static_cast<size_t>(type)];
    const Entry entry{type, category.insert(category.end(), holder),
                      m_allSelectedItems.insert(m_allSelectedItems.end(), holder), true, true};
    Positions& at = m_index.FindOrAdd(holder);
    if (!at.first.Used()) {
        at.first = entry;
    } else {
        if (!at.more) {
            at.more = std::make_unique<std::vector<Entry>>();
        }
        at.more->push_back(entry);
    }
    return true;
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
    if (!m_imp->Select(holder) || !withChildren) {
        return 1;
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
        if (m_imp->Select(below)) {
            descend(below);
        }
    }
    return 1;
}

std::int64_t SelectionManager::RemoveSelectedItem(VnI::IPropertyHolder* holder, bool withChildren) {
    if (holder == nullptr) {
        return 1;
    }
    const int type = holder->GetType();
    SelectionManagerImp::Positions* at = m_imp->m_index.Find(holder);
    bool listed = false;
    if (at != nullptr && type >= 0 && type < GetNumCategories()) {
        at->ForEach([&](const SelectionManagerImp::Entry& e) {
            listed = listed || (e.hasCategory && e.category == type);
        });
    }
    if (!listed) {
        Port_MsgManData::debugStub("Trying to remove an item that doesn't exist");
    } else {
        holder->SetSelected(false);
        SelectionManagerImp::List& category = m_imp->m_selectedItems[static_cast<size_t>(type)];
        // Out of its category wholly, out of the overall list once (its oldest place).
        bool allTaken = false;
        at->ForEach([&](SelectionManagerImp::Entry& e) {
            if (e.hasCategory && e.category == type) {
                category.erase(e.inCategory);
                e.hasCategory = false;
            }
            if (!allTaken && e.hasAll) {
                m_imp->m_allSelectedItems.erase(e.inAll);
                e.hasAll = false;
                allTaken = true;
            }
        });
        if (!at->Normalize()) {
            m_imp->m_index.Erase(holder);
        }
    }
    if (withChildren) {
        if (auto node = holder->GetParentTreeNode()) {
            auto children = node->GetChildren();
            for (; children && !children->IsEnd(); children->Next()) {
                const auto child = children->CurrentItem();
                if (VnI::IPropertyHolder* below = child ? child->GetDataRef() : nullptr) {
                    RemoveSelectedItem(below, false);
                }
            }
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
