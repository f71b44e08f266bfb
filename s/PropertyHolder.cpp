//===-- s/PropertyHolder.cpp ----------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyHolder.h"

#include "s/PropertyItr.h"
#include "s/internal/Lookahead.h"
#include "s/internal/Shapes.h"
#include "s/internal/TreeLinks.h"

#include <algorithm>
#include <cstdint>
#include <vector>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.6 $";
const detail::Unit kUnit{"../s/PropertyHolder", kRevision};

constexpr std::size_t kMinCapacity = 16;
} // namespace

namespace PropertyHolderImp {

struct Record {
    CommonI::RefCountPtr<VnI::ITreeNode> m_parentNode;
    PropertyItr::Slots m_properties;
    int m_numProperties = 0;
    bool m_isSelected = false;
    // Every node whose holder link names this holder (see s/internal/TreeLinks.h).
    TreeNode* m_nodesShowing = nullptr;
};

} // namespace PropertyHolderImp

TreeNode*& detail::NodesShowing(PropertyHolder& holder) {
    return holder.m_imp->m_nodesShowing;
}

void detail::HintRecord(const PropertyHolder& holder) {
    Hint(holder.m_imp);
}

std::int64_t detail::StoreProperty(PropertyHolder& holder, int index, int names,
                                   const CommonI::RefCountPtr<VnI::IProperty>& property) {
    auto& slots = holder.m_imp->m_properties;
    const auto numNames = static_cast<std::size_t>(std::max(names, index + 1));
    if (numNames > slots.capacity()) {
        slots.reserve(std::max(2 * numNames, kMinCapacity));
    }
    if (numNames > slots.size()) {
        slots.resize(numNames);
    }

    auto& slot = slots[static_cast<std::size_t>(index)];
    if (slot == property) {
        // The same object again: releasing it first could destroy it under our hands.
        slot->SetIndex(static_cast<std::int8_t>(index));
        return 1;
    }
    if (slot) {
        slot->SetIndex(-1);
    } else {
        ++holder.m_imp->m_numProperties;
    }
    slot = property;
    slot->SetIndex(static_cast<std::int8_t>(index));
    return 1;
}

PropertyHolder::PropertyHolder() : m_imp(new PropertyHolderImp::Record()) {}

PropertyHolder::~PropertyHolder() {
    // Nodes first: releasing the tree node below may destroy it, and a node that dies
    // must not walk back into a list that is being torn down.
    detail::ForgetHolder(m_imp->m_nodesShowing);
    delete m_imp;
}

CitI::IInterface* PropertyHolder::GetInterface(const Port::XUID& id) {
    if (id == VnI::IID_IPropertyHolder || id == CitI::IID_IInterface) {
        return static_cast<VnI::IPropertyHolder*>(this);
    }
    return nullptr;
}

Port::StringBase<char> PropertyHolder::GetDisplayName() {
    return GetName();
}

CommonI::RefCountPtr<VnI::IPropertyItr> PropertyHolder::GetProperties() {
    return PropertyItr::CreateInstance(&m_imp->m_properties, false);
}

int PropertyHolder::GetNumProperties() {
    return m_imp->m_numProperties;
}

CommonI::RefCountPtr<VnI::IProperty>
PropertyHolder::GetPropertyByName(const Port::StringBase<char>& name) {
    VnI::IPropertyNameList* names = GetPropertyNames();
    if (names == nullptr) {
        return nullptr;
    }
    const int index = names->Contains(name);
    if (index < 0 || static_cast<std::size_t>(index) >= m_imp->m_properties.size()) {
        return nullptr;
    }
    return m_imp->m_properties[static_cast<std::size_t>(index)];
}

std::int64_t PropertyHolder::AddProperty(const Port::StringBase<char>& name,
                                         const CommonI::RefCountPtr<VnI::IProperty>& property,
                                         bool visible) {
    VnI::IPropertyNameList* names = GetPropertyNames();
    if (!property || names == nullptr) {
        return 0;
    }
    int index = names->Contains(name);
    if (index < 0) {
        // Refuse before touching the list: a name that could never hold a property
        // would only lengthen every holder's slots for nothing.
        if (names->GetNumNames() > detail::kMaxSlot) {
            return 0;
        }
        const VnI::PropertyType type = property->GetType();
        if (type == VnI::ENUM_TYPE) {
            index = names->AddEnumName(name, type, property->GetPossibleValues(), visible);
        } else {
            index = names->AddName(name, type, visible);
        }
    }
    if (index < 0 || index > detail::kMaxSlot) {
        return 0;
    }

    return detail::StoreProperty(*this, index, std::max(names->GetNumNames(), index + 1), property);
}

std::int64_t PropertyHolder::AddProperty(const Port::StringBase<char>& name,
                                         const CommonI::RefCountPtr<VnI::IProperty>& property) {
    return AddProperty(name, property, true);
}

std::int64_t PropertyHolder::RemoveProperty(const Port::StringBase<char>& name) {
    VnI::IPropertyNameList* names = GetPropertyNames();
    if (names == nullptr) {
        return 0;
    }
    const int index = names->Contains(name);
    if (index < 0 || static_cast<std::size_t>(index) >= m_imp->m_properties.size()) {
        return 1;
    }
    auto& slot = m_imp->m_properties[static_cast<std::size_t>(index)];
    if (!slot) {
        return 1;
    }
    --m_imp->m_numProperties;
    slot->SetIndex(-1);
    slot.Reset();
    return 1;
}

CommonI::RefCountPtr<VnI::ITreeNode> PropertyHolder::GetParentTreeNode() {
    return m_imp->m_parentNode;
}

std::int64_t PropertyHolder::SetParentTreeNode(const CommonI::RefCountPtr<VnI::ITreeNode>& node) {
    // Copy first: releasing the old node may destroy it, and `node` may be the very
    // pointer this holder stores.
    CommonI::RefCountPtr<VnI::ITreeNode> keep = node;
    m_imp->m_parentNode.Swap(keep);
    return 0;
}

bool PropertyHolder::IsSelected() {
    return m_imp->m_isSelected;
}

std::int64_t PropertyHolder::SetSelected(bool selected) {
    m_imp->m_isSelected = selected;
    return 0;
}

Port::StringBase<char> PropertyHolder::GetNameTitle() {
    static const Port::StringBase<char> title("Name");
    return title;
}

Port::StringBase<char> PropertyHolder::GetBridgeIDTitle() {
    static const Port::StringBase<char> title("Bridge ID");
    return title;
}

Port::StringBase<char> PropertyHolder::GetHighlightColorTitle() {
    static const Port::StringBase<char> title("Highlight Color");
    return title;
}

void PropertyHolder::Dump() const {
    using detail::AddressArg;
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::PropertyHolder::m_imp->m_parentNode = %x\n",
                     AddressArg(&m_imp->m_parentNode));
    detail::DumpLine(
        kUnit, __LINE__,
        "Vn::Eng::PropertyHolder::m_imp->m_properties = %x number of properties = %d\n",
        AddressArg(&m_imp->m_properties), static_cast<int>(m_imp->m_properties.size()));
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::PropertyHolder::m_imp->m_isSelected = %u\n",
                     static_cast<unsigned int>(m_imp->m_isSelected));
}

} // namespace Vn::Eng
