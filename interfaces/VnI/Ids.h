//===-- VnI/Ids.h - identifiers of every published interface -------------------===//
//
// \file
// These values are the contract with hosts: a host that asks for VnI::IProperty passes
// exactly this identifier. Do not change them.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "CommonI/IRefCount.h"
#include "Port/XUID.h"

namespace VnI {

inline constexpr Port::XUID IID_IStringContainer{0x902A53DAFEAD47AEull, 0x8A0D534C6A5DBD54ull};
inline constexpr Port::XUID IID_IStringIterator{0xF4E617190DCE4E67ull, 0x8491CEAE546DB067ull};
inline constexpr Port::XUID IID_IProperty{0xA14EEF285109481Dull, 0xB46031093CB52DD8ull};
inline constexpr Port::XUID IID_IColorProperty{0xC00B8B5350964BDFull, 0x864D610101828237ull};
inline constexpr Port::XUID IID_IPossibleEnumValuesItr{0x2D312293D20B4891ull,
                                                       0xB5E9CD24E2E4F859ull};
inline constexpr Port::XUID IID_IPropertyName{0x1CA6C97AFC224851ull, 0x86480B5D021556FCull};
inline constexpr Port::XUID IID_IPropertyNameItr{0x230BE6C346784C1Bull, 0x83C8D45BD6E9CF04ull};
inline constexpr Port::XUID IID_IPropertyNameList{0x6DFC8E1CCBB64B68ull, 0xA6505ED29FEA5D89ull};
inline constexpr Port::XUID IID_IPropertyHolder{0x67233C642BB546E5ull, 0xAA441B45301EC0A6ull};
inline constexpr Port::XUID IID_IPropertyItr{0x4FB7A8F8750343F1ull, 0x9AC1C99BBDE20149ull};
inline constexpr Port::XUID IID_IPropertyHolderItr{0x831E68EDBAE743AFull, 0xAD8AD9A4462AF3BFull};
inline constexpr Port::XUID IID_IDeviceResource{0x6722E20C94F34F67ull, 0x943FC295C4CDEA89ull};
inline constexpr Port::XUID IID_IDeviceResourceItr{0x97995BDE21EF4F41ull, 0x80E1912F5200673Cull};
inline constexpr Port::XUID IID_IDataModel{0xCC07A05B802547B9ull, 0xB60925F095C07EADull};
inline constexpr Port::XUID IID_ISelectionManager{0x7B5B3AF5C25D4C44ull, 0x970B914374B8C663ull};
inline constexpr Port::XUID IID_IHighlightManager{0x7E106CDADEE64A00ull, 0xA923D6771BE69385ull};
inline constexpr Port::XUID IID_ITreeModel{0x6553E6E0BD934B3Aull, 0xBADD4E6F504AFEF9ull};
inline constexpr Port::XUID IID_ITreeNode{0x7124CDEDD8404D46ull, 0x830DD47ABD5F551Dull};
inline constexpr Port::XUID IID_ITreeNodeItr{0x272DF52CA3DA4759ull, 0xBBD4BA63A2950C16ull};

} // namespace VnI
