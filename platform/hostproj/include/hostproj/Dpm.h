//===-- hostproj/Dpm.h - the host project manager's interfaces -----------------===//
//
// \file
// A project helper is created by class identifier, given the open project, updated, and
// then answers questions about the project's view network: which view is the default
// one, which design units a view holds, and which views its transform binding instances
// produce.
//
// Ownership: every object a host operation stores in an out-parameter carries one new
// reference that the caller releases (Prjrep::AutoRelease). Iterator elements and
// interfaces asked for with GetInterface are borrowed (Prjrep::AutoCast).
//
// Slot orders (binary contract with the host, do not reorder), after GetInterface, ~:
//   IDefDataId:                          GetId
//   IDataIdentity:                       GetName, GetIdText
//   IDesignUnitType:                     (none)
//   IHdlFile:                            GetFileName
//   IDesignUnitFile:                     GetHdlFile
//   IDesignUnit:                         GetDesignUnitType
//   IDesignUnitIterator:                 CurrentItem, First, Next, IsEnd
//   IViewType:                           (none)
//   ITransformBindingInstance:           GetViews
//   ITransformBindingInstanceIterator:   CurrentItem, First, Next, IsEnd
//   ITransformBindingInstanceSet:        GetIterator
//   IView:                               GetViewType, GetTransformBindingInstances
//   IProjectHelper:                      Update
//   IProjectCompReference:               SetProject
//   IViewNetworkHelp:                    GetViewNetwork, GetDesignUnits
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "Port/StringBase.h"
#include "Port/XUID.h"
#include "hostproj/IProject.h"

#include <cstdint>

namespace Dpm {

/// The project helper's class, created through CitP::Factory::CreateInstance.
inline const Port::XUID& CLSID_ProjectHelper() {
    static const Port::XUID id("{0725c3d2-5e9b-4383-a7b6-a80c932eac21}");
    return id;
}

/// The view-network kind of the project's default view network.
inline constexpr int kDefaultViewNetwork = 4;

/// The identity of a design-unit type or a view type.
class VN_INTERFACE IDefDataId : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{05E2C73F-A5B3-4a0b-9AB1-9229002413CB}");
        return id;
    }
    /// Stores the identifier text, such as "DESUT_NGD" or "VIEW_Translation". Returns 1.
    virtual std::int64_t GetId(Port::StringBase<char>& id) = 0;
};

/// The identity some view types carry instead of IDefDataId.
class VN_INTERFACE IDataIdentity : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{02C092B4-7972-4bbe-8340-B370F411CC8F}");
        return id;
    }
    /// Stores the name shown to users; not an identifier. Returns 1.
    virtual std::int64_t GetName(Port::StringBase<char>& name) = 0;
    /// Stores the identifier text. Returns 1.
    virtual std::int64_t GetIdText(Port::StringBase<char>& id) = 0;
};

/// The type of a design unit; its identifier is read through IDefDataId.
class VN_INTERFACE IDesignUnitType : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{2FC4E309-B903-4126-BF81-94B55ED286ED}");
        return id;
    }
};

class VN_INTERFACE IHdlFile : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{7D72019D-90EF-4E4E-BCD9-A41DD3783D3F}");
        return id;
    }
    /// Stores the file's name in two parts; the full name is directory followed by file,
    /// with nothing put between them. Returns 1.
    virtual std::int64_t GetFileName(Port::StringBase<char>& directory,
                                     Port::StringBase<char>& file) = 0;
};

/// The file access of a design unit.
class VN_INTERFACE IDesignUnitFile : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{09411137-6791-4986-AA3C-43609908D0C7}");
        return id;
    }
    /// Stores the unit's file object (one new reference), or null. Returns 1.
    virtual std::int64_t GetHdlFile(IHdlFile*& file) = 0;
};

/// A design unit, met only as an element of an IDesignUnitIterator.
class VN_INTERFACE IDesignUnit : public CitI::IInterface {
public:
    /// Stores the unit's type (one new reference), or null. Returns 1.
    virtual std::int64_t GetDesignUnitType(IDesignUnitType*& type) = 0;
};

class VN_INTERFACE IDesignUnitIterator : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{2df348fb-eb95-40cf-a1ae-08f387fb385b}");
        return id;
    }
    /// The current unit, borrowed; null at the end.
    virtual IDesignUnit* CurrentItem() = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() = 0;
};

/// The type of a view; its identifier is read through IDefDataId or IDataIdentity.
class VN_INTERFACE IViewType : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{9FC9C959-67CF-44cc-B2AA-CFFF3178C051}");
        return id;
    }
};

/// A transform binding instance, met only as an element of its iterator.
class VN_INTERFACE ITransformBindingInstance : public CitI::IInterface {
public:
    /// An iterator over the views this instance produces, carrying one new reference and
    /// reached through Prjrep::IIterator; or null.
    virtual CitI::IInterface* GetViews() = 0;
};

class VN_INTERFACE ITransformBindingInstanceIterator : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{51847251-BCBB-4505-86F6-4E33635FEBED}");
        return id;
    }
    /// The current binding instance, borrowed; null at the end.
    virtual ITransformBindingInstance* CurrentItem() = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() = 0;
};

class VN_INTERFACE ITransformBindingInstanceSet : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{5D668616-2130-473f-87CA-0293AEC8F386}");
        return id;
    }
    /// Stores an iterator over the set (one new reference), or null. Returns 1.
    virtual std::int64_t GetIterator(ITransformBindingInstanceIterator*& iterator) = 0;
};

class VN_INTERFACE IView : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{7712A3E4-8429-449a-A82C-B7A1B78F3863}");
        return id;
    }
    /// Stores the view's type (one new reference), or null. Returns 1.
    virtual std::int64_t GetViewType(IViewType*& type) = 0;
    /// Stores the view's transform binding instances (one new reference), or null.
    /// Returns 1.
    virtual std::int64_t GetTransformBindingInstances(ITransformBindingInstanceSet*& set) = 0;
};

class VN_INTERFACE IProjectHelper : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{6002c9fe-bb9b-4ed7-9b78-d59cf0c04b07}");
        return id;
    }
    /// Brings the helper up to date with the project it was given.
    virtual std::int64_t Update() = 0;
};

class VN_INTERFACE IProjectCompReference : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{c9b69cbc-0d15-4cc4-a24d-f403f60d77fd}");
        return id;
    }
    /// Makes the helper work on project (borrowed).
    virtual std::int64_t SetProject(IProject* project) = 0;
};

class VN_INTERFACE IViewNetworkHelp : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{25a9e219-6655-4851-af5a-a3069d2a111f}");
        return id;
    }
    /// Stores the view network of the given kind (one new reference), or null. The
    /// default view network (kDefaultViewNetwork) is the default view. Returns 1.
    virtual std::int64_t GetViewNetwork(int kind, CitI::IInterface*& network) = 0;
    /// Stores an iterator over the view's design units (one new reference), or null.
    /// Returns 1.
    virtual std::int64_t GetDesignUnits(IView* view, IDesignUnitIterator*& units) = 0;
};

} // namespace Dpm
