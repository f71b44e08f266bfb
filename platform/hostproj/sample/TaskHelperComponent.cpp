//===-- sample/TaskHelperComponent.cpp - the sample host's task helper ---------===//
//
// Opens the project described by VENLOMER_PROJECT each time a task helper is created and
// keeps it open, as a host keeps its session, until the next one replaces it. The
// session's project manager and project are the only objects that outlive a lookup.
//
//===------------------------------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "HostObject.h"
#include "SampleModel.h"

#include "CitP/Factory.h"
#include "Port/MsgMan.h"
#include "Port/SafeFile.h"
#include "hostproj/IProject.h"
#include "hostproj/TaskHelper.h"

#include <cstdio>
#include <cstdlib>
#include <limits>
#include <memory>
#include <string>

namespace SampleHost {
namespace {

std::atomic<int> g_alive{0};

class Project final : public HostObject, public IProject, public IProjectModel {
public:
    explicit Project(std::shared_ptr<const Description> description)
        : HostObject(g_alive, Counting::Both), m_description(std::move(description)) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetProjectFileName(Port::StringBase<char>& name) override {
        name = Port::StringBase<char>(std::string_view(m_description->projectFile));
        return 1;
    }
    std::shared_ptr<const Description> GetDescription() override { return m_description; }
    /// The object itself, as every host operation hands it out.
    CitI::IInterface* Self() { return static_cast<IProjectModel*>(this); }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        if (id == IProject::IID() && !m_description->Fails(Fail::IProject)) {
            return static_cast<IProject*>(this);
        }
        if (id == IID_IProjectModel || id == CitI::IID_IInterface) {
            return static_cast<IProjectModel*>(this);
        }
        return nullptr;
    }

private:
    std::shared_ptr<const Description> m_description;
};

class ProjectManager final : public HostObject, public HostTask::IProjectManager {
public:
    explicit ProjectManager(std::shared_ptr<const Description> description)
        : HostObject(g_alive, Counting::Both), m_description(description) {
        if (description->hasProject) {
            m_project = Hold<Project>::Adopt(new Project(std::move(description)));
        }
    }

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetCurrentProject(CitI::IInterface*& project) override {
        project =
            m_project && !m_description->Fails(Fail::CurrentProject) ? m_project->Self() : nullptr;
        return 1;
    }
    Project* OpenProject() const { return m_project.Get(); }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return id == CitI::IID_IInterface ? static_cast<HostTask::IProjectManager*>(this) : nullptr;
    }

private:
    std::shared_ptr<const Description> m_description;
    Hold<Project> m_project;
};

/// The host's session: what is open between lookups.
struct Session {
    Hold<ProjectManager> manager;
    std::shared_ptr<const Description> description = std::make_shared<Description>();
    int objects = 0; // objects the session opened and holds
};

Session& TheSession() {
    static Session session;
    return session;
}

class Context final : public HostObject, public HostTask::ITaskContext {
public:
    Context(ProjectManager* manager, std::shared_ptr<const Description> description)
        : HostObject(g_alive, Counting::Both), m_manager(manager),
          m_description(std::move(description)) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    HostTask::IProjectManager* GetProjectManager() override {
        return m_description->Fails(Fail::ProjectManager) ? nullptr : m_manager.Get();
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return id == CitI::IID_IInterface ? static_cast<HostTask::ITaskContext*>(this) : nullptr;
    }

private:
    Hold<ProjectManager> m_manager;
    std::shared_ptr<const Description> m_description;
};

class TaskHelper final : public HostObject, public HostTask::ITaskHelper {
public:
    TaskHelper(ProjectManager* manager, std::shared_ptr<const Description> description)
        : HostObject(g_alive, Counting::Both), m_manager(manager),
          m_description(std::move(description)) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetContext(CommonI::RefCountPtr<HostTask::ITaskContext>& context,
                            Port::StringBase<char>& message) override {
        context = nullptr;
        if (m_description->Fails(Fail::Context)) {
            message = "no task context";
            return 1;
        }
        context = CommonI::RefCountPtr<HostTask::ITaskContext>::Adopt(
            new Context(m_manager.Get(), m_description));
        if (m_description->Fails(Fail::ContextStatus)) {
            // A refusal that still hands out an object: the caller owns it all the same.
            message = "task context refused";
            return 0;
        }
        message = "";
        return 1;
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return id == HostTask::IID_ITaskHelper || id == CitI::IID_IInterface
                   ? static_cast<HostTask::ITaskHelper*>(this)
                   : nullptr;
    }

private:
    Hold<ProjectManager> m_manager;
    std::shared_ptr<const Description> m_description;
};

Port_MsgManData Report(int line) {
    return Port_MsgManData::createObject("VenlomerSampleHost", "sample/TaskHelperComponent", line,
                                         "");
}

// Reads the description named by VENLOMER_PROJECT; no variable means no open project,
// an unreadable or malformed file is reported and also means no open project.
std::shared_ptr<const Description> ReadDescription() {
    auto description = std::make_shared<Description>();
    const char* path = std::getenv("VENLOMER_PROJECT");
    if (path == nullptr || *path == '\0') {
        return description;
    }
    std::string why;
    auto cannotRead = [&] {
        const std::string prefix = std::string(path) + ": ";
        if (why.rfind(prefix, 0) == 0) {
            why.erase(0, prefix.size());
        }
        Report(__LINE__).issueError("project description %s cannot be read: %s\n", path,
                                    why.c_str());
        return std::make_shared<Description>();
    };
    // A FIFO or a device named by mistake is refused rather than waited on or read
    // without end.
    Port::InputFile file;
    if (!file.Open(path, why)) {
        return cannotRead();
    }
    // Read line by line: the text is never held whole beside what is made of it.
    ParseError error;
    const bool parsed = ParseDescription(file.Stream(), *description, error);
    if (!parsed) {
        // A file that cannot be read to its end is reported as such, whatever its lines.
        file.Stream().ignore(std::numeric_limits<std::streamsize>::max());
    }
    if (file.Failed(why)) {
        return cannotRead();
    }
    if (!parsed) {
        Report(__LINE__).issueError("project description %s, line %d: %s\n", path, error.line,
                                    error.what.c_str());
        return std::make_shared<Description>();
    }
    return description;
}

void CloseSession() {
    Session& session = TheSession();
    session.manager.Reset();
    session.description = std::make_shared<Description>();
    session.objects = 0;
}

CitI::IInterface* CreateTaskHelper() {
    CloseSession();
    Session& session = TheSession();
    session.description = ReadDescription();
    session.manager = Hold<ProjectManager>::Adopt(new ProjectManager(session.description));
    session.objects = session.manager->OpenProject() != nullptr ? 2 : 1;

    if (session.description->Fails(Fail::TaskHelper)) {
        return new Opaque(g_alive, Counting::Both);
    }
    return static_cast<HostTask::ITaskHelper*>(
        new TaskHelper(session.manager.Get(), session.description));
}

// The open project, with a new reference, for the project-manager component.
CitI::IInterface* CreateOpenProject() {
    const Session& session = TheSession();
    Project* project = session.manager ? session.manager->OpenProject() : nullptr;
    if (project == nullptr) {
        return nullptr;
    }
    project->AddRef();
    return project->Self();
}

} // namespace
} // namespace SampleHost

extern "C" VN_VISIBLE void CitP_ComponentInit() {
    CitP::Factory::RegisterClass(HostTask::CLSID_TaskHelper, &SampleHost::CreateTaskHelper);
    CitP::Factory::RegisterClass(SampleHost::CLSID_OpenProject, &SampleHost::CreateOpenProject);
}

extern "C" VN_VISIBLE int VenlomerSampleTaskHelper_AliveObjects() {
    return SampleHost::g_alive.load();
}

extern "C" VN_VISIBLE int VenlomerSampleTaskHelper_SessionObjects() {
    return SampleHost::TheSession().objects;
}

extern "C" VN_VISIBLE void VenlomerSampleTaskHelper_CloseProject() {
    SampleHost::CloseSession();
}
