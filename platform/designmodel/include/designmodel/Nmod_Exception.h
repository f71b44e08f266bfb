//===-- designmodel/Nmod_Exception.h - errors of the design-model library -------===//
//
// \file
// Every failure of the design-model library is thrown as a class derived from
// Nmod_Exception::Base, so a caller that only wants "did it work" catches Base:
//
//   try {
//       model.Create("top.ngc", false, false);
//   } catch (const Nmod_Exception::Base& e) {
//       e.Report(); // one error message through the message manager
//   }
//
// The virtual operations of Base come in a fixed order that callers depend on: the
// destructor, what(), then Report(). Do not reorder them or insert new ones before
// Report.
//
// The classes have default visibility on purpose: an exception thrown in this library
// and caught in another one must have one and the same type information in both.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <exception>
#include <string>

namespace Nmod_Exception {

class VN_VISIBLE Base : public std::exception {
public:
    /// `file` and `line` default to the place of the throw.
    explicit Base(std::string message, const char* file = __builtin_FILE(),
                  int line = __builtin_LINE());
    ~Base() override;
    Base(const Base&) = default;
    Base& operator=(const Base&) = default;

    /// The message: what failed and, for database errors, the database's own words.
    const char* what() const noexcept override;
    /// Issues the message as one error through the message manager, placed at the
    /// library unit and line that raised it. Does not throw.
    virtual void Report() const;

    const char* GetMessage() const noexcept { return m_message.c_str(); }
    /// The library unit ("../designmodel/<unit>") and line that raised the error.
    const char* GetUnit() const noexcept { return m_unit.c_str(); }
    int GetLine() const noexcept { return m_line; }

private:
    std::string m_message;
    std::string m_unit;
    int m_line;
};

/// The database engine refused: it could not open, read or write a file (a full disk,
/// a missing folder, a damaged file). GetCode() is the engine's primary result code.
class VN_VISIBLE Database : public Base {
public:
    Database(std::string message, int code, const char* file = __builtin_FILE(),
             int line = __builtin_LINE());
    ~Database() override;
    Database(const Database&) = default;
    Database& operator=(const Database&) = default;

    int GetCode() const noexcept { return m_code; }

private:
    int m_code;
};

/// A file opened as a netlist database is not one this library can read: no format
/// record, another format version, or records that contradict each other.
class VN_VISIBLE Format : public Base {
public:
    explicit Format(std::string message, const char* file = __builtin_FILE(),
                    int line = __builtin_LINE());
    ~Format() override;
    Format(const Format&) = default;
    Format& operator=(const Format&) = default;
};

/// The caller asked for something the model cannot do in its state: writing a model
/// that was read, a second root block, a name given as a null pointer.
class VN_VISIBLE Usage : public Base {
public:
    explicit Usage(std::string message, const char* file = __builtin_FILE(),
                   int line = __builtin_LINE());
    ~Usage() override;
    Usage(const Usage&) = default;
    Usage& operator=(const Usage&) = default;
};

} // namespace Nmod_Exception
