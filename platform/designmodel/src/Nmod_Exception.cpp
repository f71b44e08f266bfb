//===-- Nmod_Exception.cpp ------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "designmodel/Nmod_Exception.h"

#include "Port/MsgMan.h"

#include <string_view>
#include <utility>

namespace {

const char kDomain[] = "Nmod";
const char kRevision[] = "$Revision: 1.1 $";

// "../designmodel/Nmod_Model" from ".../src/Nmod_Model.cpp": where the error arose, in
// the same form the library's other messages name their units.
std::string UnitOf(const char* path) {
    std::string_view name(path != nullptr ? path : "");
    if (const auto slash = name.find_last_of('/'); slash != std::string_view::npos) {
        name.remove_prefix(slash + 1);
    }
    if (const auto dot = name.find_last_of('.'); dot != std::string_view::npos) {
        name = name.substr(0, dot);
    }
    return "../designmodel/" + std::string(name);
}

} // namespace

namespace Nmod_Exception {

Base::Base(std::string message, const char* file, int line)
    : m_message(std::move(message)), m_unit(UnitOf(file)), m_line(line) {}

Base::~Base() = default;

const char* Base::what() const noexcept {
    return m_message.c_str();
}

void Base::Report() const {
    try {
        Port_MsgManData::createObject(kDomain, m_unit.c_str(), m_line, kRevision)
            .issueError("%s\n", m_message.c_str());
    } catch (...) {
        // Reporting runs in catch blocks and destructors; a sink that throws must not
        // turn one failure into a termination.
    }
}

Database::Database(std::string message, int code, const char* file, int line)
    : Base(std::move(message), file, line), m_code(code) {}

Format::Format(std::string message, const char* file, int line)
    : Base(std::move(message), file, line) {}

Usage::Usage(std::string message, const char* file, int line)
    : Base(std::move(message), file, line) {}

Database::~Database() = default;
Format::~Format() = default;
Usage::~Usage() = default;

} // namespace Nmod_Exception
