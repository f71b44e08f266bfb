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
    // Empty until a name object is first asked for (by position or through an iterator):
    // most lists are only ever asked for positions, and the index alone answers those.
    // From then on it holds one counted name per position, and names are made as added.
    PropertyNameItr::Names names;
    detail::NameIndex m_nameIndex;
    std::int32_t m_numVisibleNames = 0;
    bool m_namesMade = false;
};

namespace {

// The byte the index keeps with each text: the type in the low seven bits and the
// visibility in the top one. A name whose type does not fit, or that has possible values,
// is made at once instead (kMadeAtOnce).
constexpr std::uint8_t kVisibleBit = 0x80;
constexpr std::uint8_t kMadeAtOnce = 0x7F;

std::uint8_t Packed(VnI::PropertyType type, bool visible) {
    const bool fits = type >= 0 && type < kMadeAtOnce;
    return static_cast<std::uint8_t>((fits ? static_cast<std::uint8_t>(type) : kMadeAtOnce) |
                                     (visible ? kVisibleBit : 0));
}

// Makes the names of the positions `names` lacks from the texts and bytes of index.
// Throws, leaving names as it was, when one cannot be made.
void MakeMissingNames(const detail::NameIndex& index, PropertyNameItr::Names& names) {
    PropertyNameItr::Names made;
    made.reserve(index.Size());
    made = names;
    for (std::size_t position = names.size(); position < index.Size(); ++position) {
        const std::string_view text = index.Text(position);
        const std::uint8_t packed = index.Extra(position);
        auto name = PropertyName::CreateInstance(
            Port::StringBase<char>(text.data(), static_cast<unsigned int>(text.size())),
            static_cast<VnI::PropertyType>(packed & ~kVisibleBit), (packed & kVisibleBit) != 0);
        if (!name) {
            throw std::bad_alloc();
        }
        made.push_back(std::move(name));
    }
    names.swap(made);
}

// Whether a name must be made when added rather than on first request: its type does not
// fit the packed byte, or it has possible values to copy now (the caller's iterator
// is read as it stands at this call).
bool MadeAtOnce(VnI::PropertyType type,
                const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values) {
    return (Packed(type, false) & ~kVisibleBit) == kMadeAtOnce || (values && !values->IsEnd());
}

} // namespace

// Every name object made, so they can be handed out; the list then makes each new name
// as it is added.
void MakeNames(Record& record) {
    if (record.m_namesMade) {
        return;
    }
    MakeMissingNames(record.m_nameIndex, record.names);
    record.m_namesMade = true;
}

// Adds a name the index lacks (key is its text's) at the next position; -1 when the name
// object cannot be made.
int AddAbsent(Record& record, const Port::StringBase<char>& name, const detail::NameIndex::Key& key,
              VnI::PropertyType type,
              const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values, bool visible) {
    if (!record.m_namesMade && MadeAtOnce(type, values)) {
        MakeNames(record);
    }
    if (!record.m_namesMade) {
        const std::uint32_t position =
            record.m_nameIndex.Append(name.view(), Packed(type, visible), key);
        record.m_numVisibleNames += visible ? 1 : 0;
        return static_cast<int>(position);
    }
    auto created = PropertyName::CreateInstance(name, type, values, visible);
    if (!created) {
        return -1;
    }
    // Either structure may fail to grow. The vector goes first because taking its last
    // element back cannot fail; an index that kept a name the vector lacks would put
    // every later name one position too high (and with it holder slots and indices).
    auto& names = record.names;
    names.push_back(std::move(created));
    std::uint32_t position = 0;
    try {
        position = record.m_nameIndex.Append(name.view(), Packed(type, visible), key);
    } catch (...) {
        names.pop_back();
        throw;
    }
    record.m_numVisibleNames += visible ? 1 : 0;
    return static_cast<int>(position);
}

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
    return static_cast<int>(m_imp->m_nameIndex.Size());
}

VnI::IPropertyName* PropertyNameList::GetPropertyName(int position) {
    if (position < 0 || position >= GetNumNames()) {
        return nullptr;
    }
    PropertyNameListImp::MakeNames(*m_imp);
    return m_imp->names[static_cast<std::size_t>(position)].Get();
}

CommonI::RefCountPtr<VnI::IPropertyNameItr> PropertyNameList::GetNameItr() const {
    // The iterator reads the vector in place, so from now on it must hold every name.
    PropertyNameListImp::MakeNames(*m_imp);
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
    const auto key = detail::NameIndex::MakeKey(name.view());
    if (m_imp->m_nameIndex.Find(name.view(), key) != -1) {
        return -1;
    }
    return PropertyNameListImp::AddAbsent(*m_imp, name, key, type, values, visible);
}

int detail::PositionAddingName(PropertyNameList& list, const Port::StringBase<char>& name,
                               VnI::IProperty& property, bool visible, int maxPosition) {
    auto& record = *list.m_imp;
    const auto key = detail::NameIndex::MakeKey(name.view());
    const int found = record.m_nameIndex.Find(name.view(), key);
    if (found >= 0) {
        return found;
    }
    if (static_cast<std::size_t>(maxPosition) < record.m_nameIndex.Size()) {
        return -1;
    }
    const VnI::PropertyType type = property.GetType();
    if (type == VnI::ENUM_TYPE) {
        return PropertyNameListImp::AddAbsent(record, name, key, type, property.GetPossibleValues(),
                                              visible);
    }
    return PropertyNameListImp::AddAbsent(
        record, name, key, type, CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>(), visible);
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
    bool made = m_imp->m_namesMade;
    std::int32_t visible = m_imp->m_numVisibleNames;
    for (names->First(); !names->IsEnd(); names->Next()) {
        VnI::IPropertyName* name = names->CurrentItem();
        if (name == nullptr) {
            continue;
        }
        const Port::StringBase<char> text = name->GetName();
        const auto key = detail::NameIndex::MakeKey(text.view());
        if (index.Find(text.view(), key) != -1) {
            continue;
        }
        const VnI::PropertyType type = name->GetType();
        const auto values = name->GetPossibleValues();
        // An enumerated name whose values could not be read fails the whole call rather
        // than going in wrong; a skipped name would shift every later position.
        if (type == VnI::ENUM_TYPE && !values) {
            throw std::bad_alloc();
        }
        const bool isVisible = name->IsVisible();
        if (!made && PropertyNameListImp::MadeAtOnce(type, values)) {
            PropertyNameListImp::MakeMissingNames(index, staged);
            made = true;
        }
        if (made) {
            auto created = PropertyName::CreateInstance(text, type, values, isVisible);
            if (!created) {
                throw std::bad_alloc();
            }
            staged.push_back(std::move(created));
        }
        index.Append(text.view(), PropertyNameListImp::Packed(type, isVisible), key);
        visible += isVisible ? 1 : 0;
    }
    m_imp->names.swap(staged);
    m_imp->m_nameIndex.Swap(index);
    m_imp->m_namesMade = made;
    m_imp->m_numVisibleNames = visible;
    return 1;
}

std::int64_t PropertyNameList::ClearList() {
    // Names stay made from now on: an iterator handed out before reads the vector.
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
