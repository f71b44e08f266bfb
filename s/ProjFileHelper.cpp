//===-- s/ProjFileHelper.cpp ----------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/ProjFileHelper.h"

#include "CitP/Factory.h"
#include "CommonI/RefCountPtr.h"
#include "Port/MsgMan.h"
#include "hostproj/Components.h"
#include "hostproj/Dpm.h"
#include "hostproj/IProject.h"
#include "hostproj/Prjrep.h"
#include "hostproj/TaskHelper.h"

#include <memory>
#include <unordered_set>
#include <vector>

namespace Vn::Eng {

namespace {

using Text = Port::StringBase<char>;
using Prjrep::AutoCast;
using Prjrep::AutoRelease;

// The open project, borrowed from the host's project manager; null when the host has
// none. Everything taken on the way is dropped again before returning.
IProject* GetProject() {
    if (!CitP::Factory::LoadLibraryFactory(HostProj::kTaskHelperComponent)) {
        return nullptr;
    }
    CommonI::RefCountPtr<HostTask::ITaskHelper> helper;
    {
        auto created = CitP::Factory::CreateInstanceRef(HostTask::CLSID_TaskHelper);
        if (created) {
            helper =
                CommonI::RefCountPtr<HostTask::ITaskHelper>(static_cast<HostTask::ITaskHelper*>(
                    created->GetInterface(HostTask::IID_ITaskHelper)));
        }
    }
    if (!helper) {
        return nullptr;
    }
    CommonI::RefCountPtr<HostTask::ITaskContext> context;
    Text message;
    if (helper->GetContext(context, message) != 1 || !context) {
        return nullptr;
    }
    HostTask::IProjectManager* manager = context->GetProjectManager();
    if (manager == nullptr) {
        return nullptr;
    }
    CitI::IInterface* current = nullptr;
    manager->GetCurrentProject(current);
    return current != nullptr ? static_cast<IProject*>(current->GetInterface(IProject::IID()))
                              : nullptr;
}

// Replaces target with the unit's full file name, directory and file joined as the host
// gives them; leaves it alone when the unit has no file.
void ReadFileName(Dpm::IDesignUnit* unit, Text& target) {
    AutoCast<Dpm::IDesignUnitFile> access(unit);
    if (!access) {
        return;
    }
    AutoRelease<Dpm::IHdlFile> file;
    access->GetHdlFile(file.Receive());
    if (!file) {
        return;
    }
    Text rest;
    file->GetFileName(target, rest);
    target += rest;
}

// Files the names of the netlist and constraints units among units into netlist and
// constraints. A later unit of a type overwrites an earlier one's name, until both
// names are known.
void ScanDesignUnits(Dpm::IDesignUnitIterator* units, Text& netlist, Text& constraints) {
    if (units == nullptr) {
        return;
    }
    static const Text kNetlist("DESUT_NGD");
    static const Text kConstraints("DESUT_UCF");
    for (units->First(); !units->IsEnd(); units->Next()) {
        Dpm::IDesignUnit* unit = units->CurrentItem();
        if (unit != nullptr) {
            AutoRelease<Dpm::IDesignUnitType> type;
            unit->GetDesignUnitType(type.Receive());
            AutoCast<Dpm::IDefDataId> identity(type);
            if (identity) {
                Text id;
                identity->GetId(id);
                Port_MsgManData::debugStub("Got ID for file %s\n", id.c_str());
                if (id == kNetlist) {
                    ReadFileName(unit, netlist);
                } else if (id == kConstraints) {
                    ReadFileName(unit, constraints);
                }
            }
        }
        if (!netlist.IsEmpty() && !constraints.IsEmpty()) {
            return;
        }
    }
}

// The identifier of a view's type; empty when the view has no type or the type no
// identity.
Text ViewTypeId(Dpm::IView* view) {
    Text id;
    AutoRelease<Dpm::IViewType> type;
    view->GetViewType(type.Receive());
    if (AutoCast<Dpm::IDefDataId> identity(type); identity) {
        identity->GetId(id);
    } else if (AutoCast<Dpm::IDataIdentity> second(type); second) {
        second->GetIdText(id);
    }
    return id;
}

// One view being searched below: its binding instances, and the views of the instance
// at hand. Held on the heap so that a deep network cannot exhaust the stack.
struct SearchFrame {
    AutoRelease<Dpm::ITransformBindingInstanceSet> set;
    AutoRelease<Dpm::ITransformBindingInstanceIterator> bindings;
    AutoRelease<CitI::IInterface> viewsObject;
    AutoCast<Prjrep::IIterator> views;
    bool bindingStarted = false;
};

std::unique_ptr<SearchFrame> OpenFrame(Dpm::IView* view) {
    auto frame = std::make_unique<SearchFrame>();
    view->GetTransformBindingInstances(frame->set.Receive());
    if (frame->set) {
        frame->set->GetIterator(frame->bindings.Receive());
    }
    return frame;
}

// Moves the frame to the next binding instance that has views; false when its binding
// instances are exhausted.
bool NextViews(SearchFrame& frame) {
    if (!frame.bindings) {
        return false;
    }
    if (!frame.bindingStarted) {
        frame.bindings->First();
        frame.bindingStarted = true;
    } else {
        frame.bindings->Next();
    }
    for (; !frame.bindings->IsEnd(); frame.bindings->Next()) {
        frame.views = AutoCast<Prjrep::IIterator>();
        frame.viewsObject.Reset();
        Dpm::ITransformBindingInstance* binding = frame.bindings->CurrentItem();
        if (binding == nullptr) {
            continue;
        }
        // The views object carries a reference of ours whether or not it answers as an
        // iterator, so it is held as it came and the iterator borrowed from it.
        frame.viewsObject = AutoRelease<CitI::IInterface>(binding->GetViews());
        frame.views = AutoCast<Prjrep::IIterator>(frame.viewsObject);
        if (frame.views) {
            frame.views->First();
            return true;
        }
    }
    frame.views = AutoCast<Prjrep::IIterator>();
    frame.viewsObject.Reset();
    return false;
}

// Depth first below start, in the host's order of binding instances and views, for the
// first view whose type is wanted (letters compared ignoring case). The network may
// have cycles and shared views: each view's type is read at most once and each view is
// searched below at most once. Returns the view borrowed from the network.
Dpm::IView* FindViewByType(Dpm::IView* start, const Text& wanted) {
    std::unordered_set<Dpm::IView*> typeRead;
    std::unordered_set<Dpm::IView*> searched{start};
    std::vector<std::unique_ptr<SearchFrame>> path;
    path.push_back(OpenFrame(start));
    while (!path.empty()) {
        SearchFrame& frame = *path.back();
        // A new frame has no views yet; a frame whose views are used up moves on.
        if (!frame.views || frame.views->IsEnd()) {
            if (!NextViews(frame)) {
                path.pop_back();
                if (!path.empty()) {
                    path.back()->views->Next();
                }
                continue;
            }
        }
        if (frame.views->IsEnd()) {
            continue;
        }
        AutoCast<Dpm::IView> view(frame.views->CurrentItem());
        if (!view) {
            frame.views->Next();
            continue;
        }
        if (typeRead.insert(view.Get()).second &&
            ViewTypeId(view.Get()).Compare(wanted, Text::kIgnoreCase) == 0) {
            return view.Get();
        }
        if (searched.insert(view.Get()).second) {
            path.push_back(OpenFrame(view.Get()));
        } else {
            frame.views->Next();
        }
    }
    return nullptr;
}

// ScanDesignUnits over the design units the network lists for `view`.
void ScanViewUnits(Dpm::IViewNetworkHelp& networkHelp, Dpm::IView* view, Text& ngdFile,
                   Text& ucfFile) {
    AutoRelease<Dpm::IDesignUnitIterator> units;
    networkHelp.GetDesignUnits(view, units.Receive());
    ScanDesignUnits(units.Get(), ngdFile, ucfFile);
}

// The project's default view and the help that lists its design units, reached through
// a project helper made for `project`. Members are released in reverse order, the view
// network before the helper that handed it out.
struct DefaultView {
    AutoRelease<CitI::IInterface> helperObject;
    Dpm::IViewNetworkHelp* networkHelp = nullptr;
    AutoRelease<CitI::IInterface> network;
    Dpm::IView* view = nullptr;
};

// False after the debug output that names the interface the host did not give.
bool OpenDefaultView(IProject* project, DefaultView& out) {
    CitP::Factory::LoadLibraryFactory(HostProj::kProjectManagerComponent);
    // The created object is ours even when it turns out not to be a project helper.
    out.helperObject =
        AutoRelease<CitI::IInterface>(CitP::Factory::CreateInstance(Dpm::CLSID_ProjectHelper()));
    AutoCast<Dpm::IProjectHelper> helper(out.helperObject);
    if (!helper) {
        Port_MsgManData::debugStub("Cannot get IProjectHelper interface\n");
        return false;
    }
    AutoCast<Dpm::IProjectCompReference> reference(helper);
    if (!reference) {
        Port_MsgManData::debugStub("Cannot get IProjectCompReference Interface\n");
        return false;
    }
    reference->SetProject(project);
    helper->Update();

    AutoCast<Dpm::IViewNetworkHelp> networkHelp(helper);
    if (!networkHelp) {
        Port_MsgManData::debugStub("Cannot cast to IViewNetworkHelp interface\n");
        return false;
    }
    out.networkHelp = networkHelp.Get();
    networkHelp->GetViewNetwork(Dpm::kDefaultViewNetwork, out.network.Receive());
    if (!out.network) {
        Port_MsgManData::debugStub("Cannot get DefaultViewNetwork\n");
        return false;
    }
    AutoCast<Dpm::IView> defaultView(out.network);
    if (!defaultView) {
        Port_MsgManData::debugStub("Cannot get Dpm::IView interface\n");
        return false;
    }
    out.view = defaultView.Get();
    return true;
}

} // namespace

bool ProjFileHelper::GetFilesFromHost(Port::StringBase<char>& projectFile,
                                      Port::StringBase<char>& ngdFile,
                                      Port::StringBase<char>& ucfFile) {
    projectFile = "";
    ngdFile = "";
    ucfFile = "";

    IProject* project = GetProject();
    if (project == nullptr) {
        Port_MsgManData::debugStub("Cannot get IProject Interface\n");
        return false;
    }
    project->GetProjectFileName(projectFile);
    if (projectFile.IsEmpty()) {
        Port_MsgManData::debugStub("Cannot get ZAM file name from Host\n");
        return false;
    }
    Port_MsgManData::debugStub("ZAM File %s\n", projectFile.c_str());

    DefaultView defaultView;
    if (!OpenDefaultView(project, defaultView)) {
        return false;
    }
    // Both scans share the slot they do not deliver, and this is kept on purpose: callers
    // have always seen this order of host calls. It does show in the result, though. A
    // scan ends once both of its slots hold a name, so when the default view has a netlist
    // unit the scratch text is still full when the translation view is scanned, and that
    // scan stops at its first netlist unit, whose file is delivered; without one, the scan
    // runs on and the translation view's last netlist unit wins. Likewise within the
    // default view, a netlist unit ends the scan at the next constraints unit, so a later
    // constraints unit no longer overwrites it.
    Text scratch;
    ScanViewUnits(*defaultView.networkHelp, defaultView.view, scratch, ucfFile);
    Port_MsgManData::debugStub("UCF File %s\n", ucfFile.c_str());
    if (ucfFile.IsEmpty()) {
        Port_MsgManData::debugStub("Could not find the UCF file\n");
        return false;
    }

    Dpm::IView* translation = FindViewByType(defaultView.view, Text("VIEW_Translation"));
    if (translation == nullptr) {
        Port_MsgManData::debugStub("Cannot get Dpm::IView interface for VIEW_Translation\n");
        return false;
    }
    ScanViewUnits(*defaultView.networkHelp, translation, ngdFile, scratch);
    Port_MsgManData::debugStub("NGD File %s\n", ngdFile.c_str());
    if (ngdFile.IsEmpty()) {
        Port_MsgManData::debugStub("Could not find the NGD file\n");
        return false;
    }
    return true;
}

} // namespace Vn::Eng
