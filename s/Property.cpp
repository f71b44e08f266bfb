//===-- s/Property.cpp ----------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/Property.h"

#include "Port/LastBuilt.h"
#include "Port/MsgMan.h"
#include "Port/Regexp.h"
#include "s/PossibleEnumValuesItr.h"
#include "s/internal/TextSearch.h"

#include <climits>
#include <cmath>
#include <string>
#include <typeinfo>

namespace Vn::Eng {

namespace {

bool IsPlain(int flags) {
    return flags == 0 || (flags & VnI::MATCH_EXACT) != 0;
}

bool HasType(const CommonI::RefCountPtr<const VnI::IProperty>& other, VnI::PropertyType type) {
    return other && other->GetType() == type;
}

/// The other's text. A search compares one wanted value with every holder's property, so
/// when the other is one of our own string properties we read its text in place instead of
/// copying it; other implementations, a host's subclasses included, pay for the copy into
/// spare through their own GetStringProperty. An exact type test is one compare where a
/// dynamic_cast would walk the class hierarchy at every comparison.
const Port::StringBase<char>& TextOf(const VnI::IProperty& other, Port::StringBase<char>& spare) {
    if (typeid(other) == typeid(StringProperty)) {
        return static_cast<const StringProperty&>(other).Value();
    }
    spare = other.GetStringProperty();
    return spare;
}

/// The numeric comparisons shared by integers and reals: exact equality, or the first
/// of less, greater and within 5 % that is asked for.
template <class T> bool NumberMatches(T mine, T theirs, int flags) {
    if (IsPlain(flags)) {
        return mine == theirs;
    }
    if ((flags & VnI::MATCH_LESS) != 0) {
        return mine < theirs;
    }
    if ((flags & VnI::MATCH_GREATER) != 0) {
        return mine > theirs;
    }
    if ((flags & VnI::MATCH_WITHIN_5_PERCENT) != 0) {
        const double me = static_cast<double>(mine);
        const double other = static_cast<double>(theirs);
        // Written against this value's own tolerance; for a negative value the bounds
        // cross and nothing matches, which callers rely on.
        return other >= me - me * 0.05 && me + me * 0.05 >= other;
    }
    return mine == theirs;
}

/// The expression a search with MATCH_REGEXP runs: the pattern, between ".*" for
/// MATCH_SUBSTRING, ignoring case for MATCH_IGNORE_CASE (ASCII letters, as everywhere
/// else: upper-casing the pattern would turn escapes such as \d, \w and \s into their
/// negations).
Port_Regexp SearchExpression(const Port::StringBase<char>& pattern, int flags) {
    const auto letterCase = (flags & VnI::MATCH_IGNORE_CASE) != 0 ? Port_Regexp::Case::Ignore
                                                                  : Port_Regexp::Case::Match;
    std::string body;
    body.reserve(pattern.GetLength() + 5);
    if ((flags & VnI::MATCH_SUBSTRING) != 0) {
        body += ".*";
    }
    body += pattern.view();
    if ((flags & VnI::MATCH_SUBSTRING) != 0) {
        body += ".*";
    }
    Port_Regexp compiled(std::string_view(body), letterCase);
    if (compiled.IsValid()) {
        // The match is anchored at the start anyway, so a leading ^ changes no outcome;
        // but it lets the engine test a pattern's literal prefix with one compare before
        // running its automaton. Whether the pattern is valid is still decided without
        // it: ^ makes some invalid patterns ("(?)?x") valid.
        Port_Regexp anchored(std::string_view("^" + body), letterCase);
        if (anchored.IsValid()) {
            return anchored;
        }
    }
    return compiled;
}

/// The regular-expression test: the pattern must match at the very start of the value.
bool RegexpMatches(const Port::StringBase<char>& value, const Port::StringBase<char>& pattern,
                   int flags) {
    // A search compares a million values with one pattern: keep the last expression
    // built, so each comparison costs a text compare and one anchored match.
    const int shape = flags & (VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING);
    const auto build = [&] { return SearchExpression(pattern, shape); };
    if (Port::LastBuilt<Port_Regexp>::Gone()) {
        return build().MatchesAtStart(value.view());
    }
    thread_local Port::LastBuilt<Port_Regexp> last;
    return last.Get(pattern.view(), shape, build).MatchesAtStart(value.view());
}

/// A string property's comparison of its text with theirs, past the type test. With
/// MATCH_REGEXP, `expression` is the search's expression built for theirs and these
/// flags, or null to build (or reuse) it here.
bool TextMatches(const Port::StringBase<char>& mine, const Port::StringBase<char>& theirs,
                 int flags, const Port_Regexp* expression) {
    if ((flags & VnI::MATCH_REGEXP) != 0 &&
        (expression != nullptr ? expression->MatchesAtStart(mine.view())
                               : RegexpMatches(mine, theirs, flags))) {
        return true;
    }
    if (IsPlain(flags)) {
        return mine == theirs;
    }
    const bool ignoreCase = (flags & VnI::MATCH_IGNORE_CASE) != 0;
    const bool substring = (flags & VnI::MATCH_SUBSTRING) != 0;
    if (substring) {
        const auto type =
            ignoreCase ? Port::StringBase<char>::kIgnoreCase : Port::StringBase<char>::kExact;
        return mine.GetIndexOfString(theirs, type) != Port::StringBase<char>::npos;
    }
    if (ignoreCase) {
        // Folding maps each byte to one byte, so texts of different lengths never match.
        return mine.GetLength() == theirs.GetLength() &&
               mine.Compare(theirs, Port::StringBase<char>::kIgnoreCase) == 0;
    }
    // Less, greater and within 5 % have no meaning for texts.
    return false;
}

} // namespace

//===-- Property ------------------------------------------------------------------===//

CitI::IInterface* Property::GetInterface(const Port::XUID& id) {
    if (id == CommonI::IID_IRefCount) {
        return static_cast<CommonI::IRefCount*>(this);
    }
    if (id == VnI::IID_IProperty || id == CitI::IID_IInterface) {
        return static_cast<VnI::IProperty*>(this);
    }
    return nullptr;
}

void Property::SetVisible(bool visible) {
    m_isVisible = visible;
}

VnI::PropertyType Property::GetType() const {
    return VnI::UNDEFINED_TYPE;
}
int Property::GetIntProperty() const {
    return -1;
}
double Property::GetDoubleProperty() const {
    return -1.0;
}
Port::StringBase<char> Property::GetStringProperty() const {
    return {};
}
bool Property::GetBoolProperty() const {
    return false;
}
CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> Property::GetPossibleValues() const {
    return nullptr;
}
bool Property::Equals(const CommonI::RefCountPtr<const VnI::IProperty>&, int) const {
    return false;
}
bool Property::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>&, int) const {
    return false;
}

bool Property::SetIndex(std::int8_t index) {
    m_index = index;
    return m_index != 0;
}

std::int8_t Property::GetIndex() const {
    return m_index;
}
bool Property::IsVisible() const {
    return m_isVisible;
}

//===-- IntProperty ---------------------------------------------------------------===//

VnI::PropertyType IntProperty::GetType() const {
    return VnI::INT_TYPE;
}
int IntProperty::GetIntProperty() const {
    return m_value;
}
double IntProperty::GetDoubleProperty() const {
    return static_cast<double>(m_value);
}

bool IntProperty::Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const {
    if ((flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    if (!HasType(other, VnI::INT_TYPE)) {
        return false;
    }
    return NumberMatches(m_value, other->GetIntProperty(), flags);
}

bool IntProperty::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other, int) const {
    return other && m_value < other->GetIntProperty();
}

//===-- DoubleProperty ------------------------------------------------------------===//

VnI::PropertyType DoubleProperty::GetType() const {
    return VnI::DOUBLE_TYPE;
}

int DoubleProperty::GetIntProperty() const {
    // Converting a NaN or an out-of-range real to int is undefined; answer what a caller
    // can still use instead.
    if (std::isnan(m_value)) {
        return -1;
    }
    if (m_value >= static_cast<double>(INT_MAX)) {
        return INT_MAX;
    }
    if (m_value <= static_cast<double>(INT_MIN)) {
        return INT_MIN;
    }
    return static_cast<int>(m_value);
}

double DoubleProperty::GetDoubleProperty() const {
    return m_value;
}

bool DoubleProperty::Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                            int flags) const {
    if ((flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    if (!HasType(other, VnI::DOUBLE_TYPE)) {
        return false;
    }
    const double theirs = other->GetDoubleProperty();
    if (std::isnan(m_value) || std::isnan(theirs)) {
        return false;
    }
    return NumberMatches(m_value, theirs, flags);
}

bool DoubleProperty::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other, int) const {
    return other && m_value < other->GetDoubleProperty();
}

//===-- StringProperty ------------------------------------------------------------===//

VnI::PropertyType StringProperty::GetType() const {
    return VnI::STRING_TYPE;
}
Port::StringBase<char> StringProperty::GetStringProperty() const {
    return m_value;
}

bool StringProperty::Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                            int flags) const {
    if ((flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    if (!HasType(other, VnI::STRING_TYPE)) {
        return false;
    }
    Port::StringBase<char> spare;
    return TextMatches(m_value, TextOf(*other, spare), flags, nullptr);
}

bool StringProperty::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other, int) const {
    if (!other) {
        return false;
    }
    Port::StringBase<char> spare;
    return m_value.Compare(TextOf(*other, spare), Port::StringBase<char>::kByteOrder) < 0;
}

//===-- BoolProperty --------------------------------------------------------------===//

VnI::PropertyType BoolProperty::GetType() const {
    return VnI::BOOL_TYPE;
}
bool BoolProperty::GetBoolProperty() const {
    return m_value;
}

bool BoolProperty::Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                          int flags) const {
    if ((flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    return HasType(other, VnI::BOOL_TYPE) && m_value == other->GetBoolProperty();
}

bool BoolProperty::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other, int) const {
    return other && !m_value && other->GetBoolProperty();
}

//===-- EnumeratedProperty --------------------------------------------------------===//

EnumeratedProperty::EnumeratedProperty(std::vector<Port::StringBase<char>>& possibleValues)
    : m_possibleValuesRef(&possibleValues) {
    // An empty list leaves the current text empty rather than reading past the end.
    if (!possibleValues.empty()) {
        m_currentValue = possibleValues.front();
    }
}

VnI::PropertyType EnumeratedProperty::GetType() const {
    return VnI::ENUM_TYPE;
}
Port::StringBase<char> EnumeratedProperty::GetStringProperty() const {
    return m_currentValue;
}

CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> EnumeratedProperty::GetPossibleValues() const {
    return PossibleEnumValuesItr::CreateInstance(m_possibleValuesRef);
}

bool EnumeratedProperty::Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                                int flags) const {
    if ((flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    if (!other) {
        return false;
    }
    switch (other->GetType()) {
    case VnI::STRING_TYPE: {
        Port::StringBase<char> spare;
        return m_currentValue == TextOf(*other, spare);
    }
    case VnI::INT_TYPE: {
        const int index = other->GetIntProperty();
        return index >= 0 && static_cast<std::uint32_t>(index) == m_currentIndex;
    }
    default:
        return false;
    }
}

bool EnumeratedProperty::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                                  int) const {
    if (!other) {
        return false;
    }
    Port::StringBase<char> spare;
    return m_currentValue.Compare(TextOf(*other, spare), Port::StringBase<char>::kByteOrder) < 0;
}

void EnumeratedProperty::SetCurrentValue(unsigned int index) {
    if (index >= m_possibleValuesRef->size()) {
        Port_MsgManData::debugStub("Tried to set value of Enumerated Property to invalid type\n");
        return;
    }
    m_currentValue = (*m_possibleValuesRef)[index];
    m_currentIndex = index;
}

void EnumeratedProperty::SetCurrentValue(Port::StringBase<char> value) {
    const auto& values = *m_possibleValuesRef;
    for (std::size_t position = 0; position < values.size(); ++position) {
        if (values[position] == value) {
            m_currentIndex = static_cast<std::uint32_t>(position);
            m_currentValue = std::move(value);
            return;
        }
    }
    Port_MsgManData::debugStub("Tried to set value of Enumerated Property to invalid type\n");
}

//===-- PreparedTextMatch ---------------------------------------------------------===//

detail::PreparedTextMatch::PreparedTextMatch(const VnI::IProperty* wanted, int flags)
    : m_flags(flags) {
    if (wanted == nullptr || typeid(*wanted) != typeid(StringProperty)) {
        return;
    }
    m_wanted = static_cast<const StringProperty*>(wanted);
    if ((flags & VnI::MATCH_REGEXP) != 0 && (flags & VnI::MATCH_ANY) == 0) {
        m_expression.emplace(SearchExpression(
            m_wanted->Value(), flags & (VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING)));
    }
}

bool detail::PreparedTextMatch::Answers(const VnI::IProperty& candidate) const {
    return m_wanted != nullptr && typeid(candidate) == typeid(StringProperty);
}

bool detail::PreparedTextMatch::Matches(const VnI::IProperty& candidate) const {
    // StringProperty::Equals, its type test settled by the exact classes of both sides.
    if ((m_flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    return TextMatches(static_cast<const StringProperty&>(candidate).Value(), m_wanted->Value(),
                       m_flags, m_expression ? &*m_expression : nullptr);
}

} // namespace Vn::Eng
