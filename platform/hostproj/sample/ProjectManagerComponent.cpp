//===-- sample/ProjectManagerComponent.cpp - the sample host's project manager -===//
//
// A project helper builds the view network of the project it is given when it is
// updated. The network is one counted whole: its views, binding instances and design
// units are parts that share its count, so a caller may keep a view it met (borrowed)
// as long as anything of the network is held. Everything else a caller receives is an
// object of its own, with one reference for the caller.
//
//===------------------------------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "HostObject.h"
#include "SampleModel.h"

#include "CitP/Factory.h"
#include "CommonI/RefCountPtr.h"
#include "hostproj/Dpm.h"

#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace SampleHost {
namespace {

std::atomic<int> g_alive{0};

Counting CountingOf(const Description& description) {
    return description.commonCounting ? Counting::Common : Counting::Prjrep;
}

Port::StringBase<char> Text(const std::string& text) {
    return Port::StringBase<char>(std::string_view(text));
}

class View;

/// The view network of one update: owns the views, and through them their binding
/// instances and design units.
class Network final : public HostObject, public CitI::IInterface {
public:
    explicit Network(std::shared_ptr<const Description> description);
    ~Network() override;

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    const Description& Desc() const { return *m_description; }
    Counting CountingMode() const { return CountingOf(*m_description); }
    View* ViewAt(std::size_t index) const;
    /// Guards the parts made on first request, should two threads walk one network.
    std::mutex& PartsMutex() const { return m_partsMutex; }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return id == CitI::IID_IInterface ? static_cast<CitI::IInterface*>(this) : nullptr;
    }

private:
    std::shared_ptr<const Description> m_description;
    // Made when first asked for: a lookup meets a few views of a network that may have
    // a million, and a part costs several times the line that describes it.
    mutable std::vector<std::unique_ptr<View>> m_views;
    mutable std::mutex m_partsMutex;
};

class ViewType final : public HostObject,
                       public Dpm::IViewType,
                       public Dpm::IDefDataId,
                       public Dpm::IDataIdentity {
public:
    ViewType(Counting counting, const ViewDesc& view)
        : HostObject(g_alive, counting), m_id(view.typeId), m_name(view.name),
          m_second(view.secondIdentity) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetId(Port::StringBase<char>& id) override {
        id = Text(m_id);
        return 1;
    }
    std::int64_t GetName(Port::StringBase<char>& name) override {
        name = Text(m_name);
        return 1;
    }
    std::int64_t GetIdText(Port::StringBase<char>& id) override { return GetId(id); }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        if (id == Dpm::IViewType::IID() || id == CitI::IID_IInterface) {
            return static_cast<Dpm::IViewType*>(this);
        }
        if (id == Dpm::IDefDataId::IID() && !m_second) {
            return static_cast<Dpm::IDefDataId*>(this);
        }
        if (id == Dpm::IDataIdentity::IID() && m_second) {
            return static_cast<Dpm::IDataIdentity*>(this);
        }
        return nullptr;
    }

private:
    std::string m_id;
    std::string m_name;
    bool m_second;
};

class UnitType final : public HostObject, public Dpm::IDesignUnitType, public Dpm::IDefDataId {
public:
    UnitType(Counting counting, const UnitDesc& unit)
        : HostObject(g_alive, counting), m_id(unit.typeId), m_answersId(unit.answersId) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetId(Port::StringBase<char>& id) override {
        id = Text(m_id);
        return 1;
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        if (id == Dpm::IDesignUnitType::IID() || id == CitI::IID_IInterface) {
            return static_cast<Dpm::IDesignUnitType*>(this);
        }
        if (id == Dpm::IDefDataId::IID() && m_answersId) {
            return static_cast<Dpm::IDefDataId*>(this);
        }
        return nullptr;
    }

private:
    std::string m_id;
    bool m_answersId;
};

class HdlFile final : public HostObject, public Dpm::IHdlFile {
public:
    HdlFile(Counting counting, const UnitDesc& unit)
        : HostObject(g_alive, counting), m_directory(unit.directory), m_file(unit.file) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetFileName(Port::StringBase<char>& directory,
                             Port::StringBase<char>& file) override {
        directory = Text(m_directory);
        file = Text(m_file);
        return 1;
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return OwnOnly<Dpm::IHdlFile>(this, id);
    }

private:
    std::string m_directory;
    std::string m_file;
};

class Unit final : public HostObject, public Dpm::IDesignUnit, public Dpm::IDesignUnitFile {
public:
    Unit(Network& network, const UnitDesc& desc)
        : HostObject(g_alive, network.CountingMode(), &network), m_counting(network.CountingMode()),
          m_desc(desc) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetDesignUnitType(Dpm::IDesignUnitType*& type) override {
        type = m_desc.hasType ? new UnitType(m_counting, m_desc) : nullptr;
        return 1;
    }
    std::int64_t GetHdlFile(Dpm::IHdlFile*& file) override {
        file = m_desc.hdlFile ? new HdlFile(m_counting, m_desc) : nullptr;
        return 1;
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        if (id == CitI::IID_IInterface) {
            return static_cast<Dpm::IDesignUnit*>(this);
        }
        if (id == Dpm::IDesignUnitFile::IID() && m_desc.fileAccess) {
            return static_cast<Dpm::IDesignUnitFile*>(this);
        }
        return nullptr;
    }

private:
    Counting m_counting;
    const UnitDesc& m_desc; // in the network's description, which outlives the network
};

class Binding final : public HostObject, public Dpm::ITransformBindingInstance {
public:
    Binding(Network& network, const std::vector<std::size_t>& produced)
        : HostObject(g_alive, network.CountingMode(), &network), m_network(network),
          m_produced(produced) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    CitI::IInterface* GetViews() override;

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return id == CitI::IID_IInterface ? static_cast<Dpm::ITransformBindingInstance*>(this)
                                          : nullptr;
    }

private:
    Network& m_network;
    const std::vector<std::size_t>& m_produced;
};

class View final : public HostObject, public Dpm::IView {
public:
    View(Network& network, const ViewDesc& desc)
        : HostObject(g_alive, network.CountingMode(), &network), m_network(network), m_desc(desc),
          m_units(desc.units.size()), m_bindings(desc.bindings.size()) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetViewType(Dpm::IViewType*& type) override {
        type = m_desc.hasType ? new ViewType(m_network.CountingMode(), m_desc) : nullptr;
        return 1;
    }
    std::int64_t GetTransformBindingInstances(Dpm::ITransformBindingInstanceSet*& set) override;

    Network& Owner() const { return m_network; }
    std::size_t NumUnits() const { return m_units.size(); }
    Unit* UnitAt(std::size_t i) const {
        std::lock_guard lock(m_network.PartsMutex());
        if (!m_units[i]) {
            m_units[i] = std::make_unique<Unit>(m_network, m_desc.units[i]);
        }
        return m_units[i].get();
    }
    std::size_t NumBindings() const { return m_bindings.size(); }
    Binding* BindingAt(std::size_t i) const {
        std::lock_guard lock(m_network.PartsMutex());
        if (!m_bindings[i]) {
            m_bindings[i] = std::make_unique<Binding>(m_network, m_desc.bindings[i]);
        }
        return m_bindings[i].get();
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override { return OwnOnly<Dpm::IView>(this, id); }

private:
    Network& m_network;
    const ViewDesc& m_desc;
    // Made on first request, as the network's views are.
    mutable std::vector<std::unique_ptr<Unit>> m_units;
    mutable std::vector<std::unique_ptr<Binding>> m_bindings;
};

Network::Network(std::shared_ptr<const Description> description)
    : HostObject(g_alive, CountingOf(*description)), m_description(std::move(description)),
      m_views(m_description->views.size()) {}

View* Network::ViewAt(std::size_t index) const {
    std::lock_guard lock(m_partsMutex);
    if (!m_views[index]) {
        m_views[index] =
            std::make_unique<View>(const_cast<Network&>(*this), m_description->views[index]);
    }
    return m_views[index].get();
}

Network::~Network() = default;

/// Iterators keep the network alive, so the elements they hand out stay valid.
// One iterator over a view's design units or its binding instances: both are walked by
// position, and both keep the view's network alive while they live.
template <class Iterator, class Element, std::size_t (View::*Count)() const,
          auto(View::*At)(std::size_t) const>
class PositionIterator final : public HostObject, public Iterator {
public:
    explicit PositionIterator(View& view)
        : HostObject(g_alive, view.Owner().CountingMode()), m_network(&view.Owner()), m_view(view) {
    }

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    Element* CurrentItem() override {
        return IsEnd() ? nullptr : static_cast<Element*>((m_view.*At)(m_pos));
    }
    std::int64_t First() override {
        m_pos = 0;
        return 1;
    }
    std::int64_t Next() override {
        if (!IsEnd()) {
            ++m_pos;
        }
        return 1;
    }
    bool IsEnd() override { return m_pos >= (m_view.*Count)(); }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override { return OwnOnly<Iterator>(this, id); }

private:
    Hold<Network> m_network;
    View& m_view;
    std::size_t m_pos = 0;
};

using UnitIterator =
    PositionIterator<Dpm::IDesignUnitIterator, Dpm::IDesignUnit, &View::NumUnits, &View::UnitAt>;
using BindingIterator =
    PositionIterator<Dpm::ITransformBindingInstanceIterator, Dpm::ITransformBindingInstance,
                     &View::NumBindings, &View::BindingAt>;

class BindingSet final : public HostObject, public Dpm::ITransformBindingInstanceSet {
public:
    explicit BindingSet(View& view)
        : HostObject(g_alive, view.Owner().CountingMode()), m_network(&view.Owner()), m_view(view) {
    }

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    std::int64_t GetIterator(Dpm::ITransformBindingInstanceIterator*& iterator) override {
        iterator =
            m_network->Desc().Fails(Fail::BindingIterator) ? nullptr : new BindingIterator(m_view);
        return 1;
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return OwnOnly<Dpm::ITransformBindingInstanceSet>(this, id);
    }

private:
    Hold<Network> m_network;
    View& m_view;
};

class ViewIterator final : public HostObject, public Prjrep::IIterator {
public:
    ViewIterator(Network& network, const std::vector<std::size_t>& views)
        : HostObject(g_alive, network.CountingMode()), m_network(&network), m_views(views) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }
    CitI::IInterface* CurrentItem() override {
        return IsEnd() ? nullptr : static_cast<Dpm::IView*>(m_network->ViewAt(m_views[m_pos]));
    }
    std::int64_t First() override {
        m_pos = 0;
        return 1;
    }
    std::int64_t Next() override {
        if (!IsEnd()) {
            ++m_pos;
        }
        return 1;
    }
    bool IsEnd() override { return m_pos >= m_views.size(); }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return OwnOnly<Prjrep::IIterator>(this, id);
    }

private:
    Hold<Network> m_network;
    const std::vector<std::size_t>& m_views;
    std::size_t m_pos = 0;
};

std::int64_t View::GetTransformBindingInstances(Dpm::ITransformBindingInstanceSet*& set) {
    set = m_network.Desc().Fails(Fail::BindingSet) ? nullptr : new BindingSet(*this);
    return 1;
}

CitI::IInterface* Binding::GetViews() {
    const Description& desc = m_network.Desc();
    if (desc.Fails(Fail::BindingViews)) {
        return nullptr;
    }
    if (desc.Fails(Fail::ViewsIterator)) {
        return new Opaque(g_alive, m_network.CountingMode());
    }
    return static_cast<Prjrep::IIterator*>(new ViewIterator(m_network, m_produced));
}

class ProjectHelper final : public HostObject,
                            public Dpm::IProjectHelper,
                            public Dpm::IProjectCompReference,
                            public Dpm::IViewNetworkHelp {
public:
    explicit ProjectHelper(std::shared_ptr<const Description> open)
        : HostObject(g_alive, CountingOf(*open)), m_open(std::move(open)) {}

    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }

    std::int64_t SetProject(IProject* project) override {
        auto* model = project != nullptr
                          ? static_cast<IProjectModel*>(project->GetInterface(IID_IProjectModel))
                          : nullptr;
        m_project = model != nullptr ? model->GetDescription() : nullptr;
        return 1;
    }

    // The network reflects the project only after an update, as in the host.
    std::int64_t Update() override {
        m_network.Reset();
        if (m_project) {
            m_network = Hold<Network>::Adopt(new Network(m_project));
        }
        return 1;
    }

    std::int64_t GetViewNetwork(int kind, CitI::IInterface*& network) override {
        network = nullptr;
        if (kind != Dpm::kDefaultViewNetwork || !m_network) {
            return 1;
        }
        const Description& desc = m_network->Desc();
        if (desc.Fails(Fail::DefaultViewNetwork) || !desc.hasDefault) {
            return 1;
        }
        if (desc.Fails(Fail::DefaultView)) {
            m_network->AddRef();
            network = m_network.Get();
            return 1;
        }
        View* view = m_network->ViewAt(desc.defaultView);
        view->AddRef();
        network = static_cast<Dpm::IView*>(view);
        return 1;
    }

    std::int64_t GetDesignUnits(Dpm::IView* view, Dpm::IDesignUnitIterator*& units) override {
        units = nullptr;
        auto* ours = dynamic_cast<View*>(view);
        if (ours == nullptr || !m_network || &ours->Owner() != m_network.Get() ||
            m_network->Desc().Fails(Fail::DesignUnits)) {
            return 1;
        }
        units = new UnitIterator(*ours);
        return 1;
    }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        if (id == Dpm::IProjectHelper::IID() || id == CitI::IID_IInterface) {
            return static_cast<Dpm::IProjectHelper*>(this);
        }
        if (id == Dpm::IProjectCompReference::IID() && !m_open->Fails(Fail::ProjectReference)) {
            return static_cast<Dpm::IProjectCompReference*>(this);
        }
        if (id == Dpm::IViewNetworkHelp::IID() && !m_open->Fails(Fail::ViewNetworkHelp)) {
            return static_cast<Dpm::IViewNetworkHelp*>(this);
        }
        return nullptr;
    }

private:
    std::shared_ptr<const Description> m_open;    // the host's open project, for its flags
    std::shared_ptr<const Description> m_project; // the project given with SetProject
    Hold<Network> m_network;
};

CitI::IInterface* CreateProjectHelper() {
    // The host's open project decides how its project manager behaves.
    std::shared_ptr<const Description> open;
    if (auto project = CitP::Factory::CreateInstanceRef(CLSID_OpenProject)) {
        if (auto* model = static_cast<IProjectModel*>(project->GetInterface(IID_IProjectModel))) {
            open = model->GetDescription();
        }
    }
    if (!open) {
        open = std::make_shared<Description>();
    }
    if (open->Fails(Fail::ProjectHelper)) {
        return nullptr;
    }
    if (open->Fails(Fail::ProjectHelperInterface)) {
        return new Opaque(g_alive, CountingOf(*open));
    }
    return static_cast<Dpm::IProjectHelper*>(new ProjectHelper(std::move(open)));
}

} // namespace
} // namespace SampleHost

extern "C" VN_VISIBLE void CitP_ComponentInit() {
    CitP::Factory::RegisterClass(Dpm::CLSID_ProjectHelper(), &SampleHost::CreateProjectHelper);
}

extern "C" VN_VISIBLE int VenlomerSampleProjMgr_AliveObjects() {
    return SampleHost::g_alive.load();
}
