//===-- s/Property.h - typed property values ------------------------------------===//
//
// \file
// A property is one typed value (integer, real, text, flag or enumerated choice) that a
// holder stores under a name. It is self-counted: the object is its own
// CommonI::IRefCount, born with count 1, and its last Release deletes it. Callers never
// construct properties directly; they ask PropertyFactory or ManagedPropertyFactory,
// which return the VnI::IProperty carrying that first reference.
//
//   VnI::IProperty* raw = PropertyFactory::CreateIntProperty(7, true);   // count 1
//   auto held = CommonI::RefCountPtr<VnI::IProperty>::Adopt(raw);        // still 1
//   held->Equals(other, VnI::MATCH_WITHIN_5_PERCENT);
//   held.Reset();                                                        // deleted
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "CommonI/TRefCountHelper.h"
#include "VnI/IProperty.h"
#include "s/Export.h"

#include <cstdint>
#include <vector>

namespace Vn::Eng {

/// The base of every typed value; on its own it has no value (UNDEFINED_TYPE) and
/// answers every accessor with its default.
class VENLOMER_API Property : public CommonI::TRefCountHelperBase<Property, 0>,
                              public VnI::IProperty {
public:
    Property() = default;
    Property(const Property&) = delete;
    Property& operator=(const Property&) = delete;

    /// IRefCount gives the object itself; IProperty and CitI::IInterface its IProperty.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;

    // Declared before every IProperty override: it takes the slot right after
    // GetRefCount in the primary vtable, where the factories expect it.
    /// Stores the visibility. Reached only through the implementation class.
    virtual void SetVisible(bool visible);

    VnI::PropertyType GetType() const override;
    int GetIntProperty() const override;
    double GetDoubleProperty() const override;
    Port::StringBase<char> GetStringProperty() const override;
    bool GetBoolProperty() const override;
    CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> GetPossibleValues() const override;
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;
    /// Stores the index; true when the stored index is non-zero.
    bool SetIndex(std::int8_t index) override;
    std::int8_t GetIndex() const override;
    bool IsVisible() const override;

protected:
    // Only the last Release destroys a property.
    ~Property() override = default;

    std::int8_t m_index = -1;
    bool m_isVisible = true;
};

class VENLOMER_API IntProperty : public Property {
public:
    explicit IntProperty(int value) : m_value(value) {}

    VnI::PropertyType GetType() const override;
    int GetIntProperty() const override;
    double GetDoubleProperty() const override;
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;

protected:
    ~IntProperty() override = default;

private:
    int m_value;
};

class VENLOMER_API DoubleProperty : public Property {
public:
    explicit DoubleProperty(double value) : m_value(value) {}

    VnI::PropertyType GetType() const override;
    /// Truncated toward zero; saturates outside the int range, and NaN gives -1.
    int GetIntProperty() const override;
    double GetDoubleProperty() const override;
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;

protected:
    ~DoubleProperty() override = default;

private:
    double m_value;
};

class VENLOMER_API StringProperty : public Property {
public:
    explicit StringProperty(const Port::StringBase<char>& value) : m_value(value) {}

    VnI::PropertyType GetType() const override;
    Port::StringBase<char> GetStringProperty() const override;
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;

    /// The stored text without a copy.
    const Port::StringBase<char>& Value() const { return m_value; }

protected:
    ~StringProperty() override = default;

private:
    Port::StringBase<char> m_value;
};

class VENLOMER_API BoolProperty : public Property {
public:
    explicit BoolProperty(bool value) : m_value(value) {}

    VnI::PropertyType GetType() const override;
    bool GetBoolProperty() const override;
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;

protected:
    ~BoolProperty() override = default;

private:
    bool m_value;
};

/// One choice out of a list of texts that belongs to the creator: the property reads
/// the list in place, so it must outlive the property and every iterator taken from it.
class VENLOMER_API EnumeratedProperty : public Property {
public:
    /// Starts on the first value; over an empty list the current text is empty and the
    /// index 0, and every SetCurrentValue is rejected.
    explicit EnumeratedProperty(std::vector<Port::StringBase<char>>& possibleValues);

    VnI::PropertyType GetType() const override;
    Port::StringBase<char> GetStringProperty() const override;
    /// A new iterator over the creator's list (one reference).
    CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> GetPossibleValues() const override;
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;

    /// Moves to the value at index; an index past the list is reported and ignored.
    void SetCurrentValue(unsigned int index);
    /// Moves to the first value with exactly this text; an unknown text is reported and
    /// ignored.
    void SetCurrentValue(Port::StringBase<char> value);

    /// The position of the current value.
    unsigned int GetCurrentIndex() const { return m_currentIndex; }

protected:
    ~EnumeratedProperty() override = default;

private:
    // First, so that it fills the padding after the base's two small fields instead of
    // lengthening every enumerated property by eight bytes.
    std::uint32_t m_currentIndex = 0;
    std::vector<Port::StringBase<char>>* m_possibleValuesRef; // not owned
    Port::StringBase<char> m_currentValue;
};

} // namespace Vn::Eng
