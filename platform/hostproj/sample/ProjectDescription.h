//===-- sample/ProjectDescription.h - the sample host's project, as read -------===//
//
// \file
// The parsed form of a project description file (the format is documented in
// hostproj/SampleHost.h). Plain data shared by the two sample components: the task
// helper reads it, the project manager builds its view network from it.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <iosfwd>
#include <string>
#include <string_view>
#include <vector>

namespace SampleHost {

/// The steps a description can make fail. Values index a bit mask.
enum class Fail : unsigned {
    TaskHelper,
    ContextStatus,
    Context,
    ProjectManager,
    CurrentProject,
    IProject,
    ProjectHelper,
    ProjectHelperInterface,
    ProjectReference,
    ViewNetworkHelp,
    DefaultViewNetwork,
    DefaultView,
    DesignUnits,
    BindingSet,
    BindingIterator,
    BindingViews,
    ViewsIterator,
    Count
};

struct UnitDesc {
    bool hasType = true;
    std::string typeId;
    bool answersId = true;
    bool fileAccess = true;
    bool hdlFile = true;
    std::string directory;
    std::string file;
};

struct ViewDesc {
    std::string name;
    bool hasType = false;
    std::string typeId;
    bool secondIdentity = false; // the type answers only Dpm::IDataIdentity
    std::vector<UnitDesc> units;
    std::vector<std::vector<std::size_t>> bindings; // produced views, by index
};

struct Description {
    bool hasProject = false;
    std::string projectFile;
    std::vector<ViewDesc> views;
    bool hasDefault = false;
    std::size_t defaultView = 0;
    bool commonCounting = false;
    unsigned failures = 0;

    bool Fails(Fail step) const { return (failures & (1u << static_cast<unsigned>(step))) != 0; }
};

struct ParseError {
    int line = 0;
    std::string what;
};

/// Reads a whole description. On failure returns false, fills error with the first
/// offending line and what is wrong there, and leaves out in an unspecified state.
bool ParseDescription(std::string_view text, Description& out, ParseError& error);

/// The same, line by line from `in`, so that the text is never held whole. Stops at the
/// first offending line; the caller tells a failed read from the end of the text.
bool ParseDescription(std::istream& in, Description& out, ParseError& error);

} // namespace SampleHost
