//===-- VnI/IStringContainer.h - a counted list of texts and its cursor ---------===//
//
// Slot orders (binary contract, do not reorder):
//   IStringContainer: GetInterface, ~, AddString, RemoveString, GetStringIterator,
//                     GetNumStrings, ClearStrings
//   IStringIterator:  GetInterface, ~, CurrentItem, First, Next, IsEnd
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "Port/StringBase.h"
#include "VnI/Ids.h"

#include <cstdint>

namespace VnI {

class VN_INTERFACE IStringIterator : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IStringIterator;

    /// Copy of the text under the cursor; call only while IsEnd() is false.
    virtual Port::StringBase<char> CurrentItem() const = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

class VN_INTERFACE IStringContainer : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IStringContainer;

    /// Appends a copy. Returns 1.
    virtual std::int64_t AddString(const Port::StringBase<char>& text) = 0;
    /// Removes the first text equal to the iterator's current one, if any. Returns 1.
    virtual std::int64_t RemoveString(const CommonI::RefCountPtr<IStringIterator>& at) = 0;
    /// Stores the container's one shared cursor in out (one new reference). Returns 1.
    virtual std::int64_t GetStringIterator(CommonI::RefCountPtr<IStringIterator>& out) = 0;
    virtual int GetNumStrings() const = 0;
    /// Empties the container. Returns 1.
    virtual std::int64_t ClearStrings() = 0;
};

} // namespace VnI
