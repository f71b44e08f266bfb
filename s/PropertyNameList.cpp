//===-- s/PropertyNameList.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyNameList.h"

#include "s/PropertyName.h"
#include "s/PropertyNameItr.h"
#include "s/internal/NameIndex.h"
#include "s/internal/Shapes.h"

#include <cstdint>
#include <new>
#include <string>
#include <string_view>
#include <vector>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.7 $";
const detail::Unit kUnit{"../s/PropertyNameList", kRevision};

} // namespace

namespace PropertyNameListImp {

class PropertyNameList_IPropertyNameList final
    : public detail::InterfaceObject<PropertyNameList, VnI::IPropertyNameList> {
public:
    using InterfaceObject::InterfaceObject;

    int GetNumNames() const override { return m_owner->GetNumNames(); }
    CommonI::RefCountPtr<VnI::IPropertyNameItr> GetNameItr() const override {
        return m_owner->GetNameItr();
    }
    int Contains(const Port::StringBase<char>& name) const override {
        return m_owner->Contains(name);
    }
    int AddName(const Port::StringBase<char>& name, VnI::PropertyType type, bool visible) override {
        return m_owner->AddName(name, type, visible);
    }
    int AddEnumName(const Port::StringBase<char>& name, VnI::PropertyType type,
                    const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values,
                    bool visible) override {
        return m_owner->AddEnumName(name, type, values, visible);
    }
    std::int64_t AppendList(const VnI::IPropertyNameList* other) override {
        return m_owner->AppendList(other);
    }
    std::int64_t ClearList() override { return m_owner->ClearList(); }
    VnI::IPropertyName* GetPropertyName(int position) override {
        return m_owner->GetPropertyName(position);
    }
};

struct Record {
    explicit Record(PropertyNameList* owner) : m_xIPropertyNameList(owner) {}

    PropertyNameList_IPropertyNameList m_xIPropertyNameList;
    PropertyNameItr::Names names;
    detail::NameIndex m_nameIndex;
    std::int32_t m_numVisibleNames = 0;
};

} // namespace PropertyNameListImp

PropertyNameList::PropertyNameList() : m_imp(new PropertyNameListImp::Record(this)) {}

PropertyNameList::~PropertyNameList() {
    delete m_imp;
}

CitI::IInterface* PropertyNameList::GetInterface(const Port::XUID& id) {
    if (m_imp == nullptr) {
        return nullptr;
    }
    if (id == VnI::IID_IPropertyNameList || id == CitI::IID_IInterface) {
        return &m_imp->m_xIPropertyNameList;
    }
    return nullptr;
}

int PropertyNameList::GetNumNames() const {
    return static_cast<int>(m_imp->names.size());
}

VnI::IPropertyName* PropertyNameList::GetPropertyName(int position) {
    if (position < 0 || position >= GetNumNames()) {
        return nullptr;
    }
    return m_imp->names[static_cast<std::size_t>(position)].Get();
}

CommonI::RefCountPtr<VnI::IPropertyNameItr> PropertyNameList::GetNameItr() const {
    return PropertyNameItr::CreateInstance(&m_imp->names);
}

int PropertyNameList::Contains(const Port::StringBase<char>& name) const {
    return m_imp->m_nameIndex.Find(name.view());
}

int PropertyNameList::AddName(const Port::StringBase<char>& name, VnI::PropertyType type,
                              bool visible) {
    return AddEnumName(name, type, CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>(), visible);
}

int PropertyNameList::AddEnumName(const Port::StringBase<char>& name, VnI::PropertyType type,
                                  const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values,
                                  bool visible) {
    if (Contains(name) != -1) {
        return -1;
    }
    auto created = PropertyName::CreateInstance(name, type, values, visible);
    if (!created) {
        return -1;
    }
    // Either structure may fail to grow. The vector goes first because taking its last
    // element back cannot fail; an index that kept a name the vector lacks would put
    // every later name one position too high (and with it holder slots and indices).
    auto& names = m_imp->names;
    names.push_back(std::move(created));
    std::uint32_t position = 0;
    try {
        position = m_imp->m_nameIndex.Append(name.view());
    } catch (...) {
        names.pop_back();
        throw;
    }
    if (visible) {
        ++m_imp->m_numVisibleNames;
    }
    return static_cast<int>(position);
}

std::int64_t PropertyNameList::AppendList(const VnI::IPropertyNameList* other) {
    if (other == nullptr) {
        return 1;
    }
    const auto names = other->GetNameItr();
    if (!names) {
        return 1;
    }
    // All or nothing: the names are appended to copies of the vector and the index, which
    // replace them only once every name is in, so a failure part way leaves the list as it
    // was. Walking by position means names this call appends (when other is this list
    // itself) can never invalidate the walk; they are skipped as already present anyway.
    PropertyNameItr::Names staged = m_imp->names;
    detail::NameIndex index = m_imp->m_nameIndex;
    std::int32_t visible = m_imp->m_numVisibleNames;
    for (names->First(); !names->IsEnd(); names->Next()) {
        VnI::IPropertyName* name = names->CurrentItem();
        if (name == nullptr) {
            continue;
        }
        const Port::StringBase<char> text = name->GetName();
        if (index.Find(text.view()) != -1) {
            continue;
        }
        const VnI::PropertyType type = name->GetType();
        const auto values = name->GetPossibleValues();
        auto created = PropertyName::CreateInstance(text, type, values, name->IsVisible());
        // A name that could not be made, or an enumerated one whose values could not be
        // read, fails the whole call rather than going in wrong or not at all.
        if (!created || (type == VnI::ENUM_TYPE && !values)) {
            throw std::bad_alloc(); // a name skipped would shift every later position
        }
        staged.push_back(std::move(created));
        index.Append(text.view());
        visible += name->IsVisible() ? 1 : 0;
    }
    m_imp->names.swap(staged);
    m_imp->m_nameIndex.Swap(index);
    m_imp->m_numVisibleNames = visible;
    return 1;
}

std::int64_t PropertyNameList::ClearList() {
    m_imp->names.clear();
    m_imp->m_nameIndex.Clear();
    m_imp->m_numVisibleNames = 0;
    return 1;
}

void PropertyNameList::Dump() const {
    using detail::AddressArg;
    detail::DumpLine(kUnit, 103, "Vn::Eng::PropertyNameList::m_imp->names = %x, numNames = %d\n",
                     AddressArg(&m_imp->names), GetNumNames());
    detail::DumpLine(kUnit, 104, "Vn::Eng::PropertyNameList::m_imp->m_numVisibleNames = %d\n",
                     m_imp->m_numVisibleNames);
}

} // namespace Vn::Eng
