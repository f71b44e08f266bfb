//===-- Nmod_Objects.cpp - transactions, designs, views, blocks, properties -----===//
#include "Port/UnitStartup.h"

#include "designmodel/Nmod_Model.h"

#include "Access.h"
#include "ModelImp.h"
#include "designmodel/Nmod_Exception.h"

#include <cstring>

using Nmod_Detail::Access;
using Nmod_Detail::Required;

// ---- transactions ------------------------------------------------------------------

Nmod_Txn::Nmod_Txn(std::string name, NMOD_TXN_TYPE type) : m_name(std::move(name)), m_type(type) {}
Nmod_Txn::~Nmod_Txn() = default;

// ---- properties, blocks, views, designs --------------------------------------------

Nmod_PropertyHolder::~Nmod_PropertyHolder() = default;

void Nmod_PropertyHolder::CreatePropertyString(const char* name, const char* value) {
    std::string key = Required(name, "property name");
    std::string text = Required(value, "property value");
    // Room first: once the file has the property, keeping it in memory must not fail.
    m_properties.reserve(m_properties.size() + 1);
    StoreProperty(key, text);
    for (auto& property : m_properties) {
        if (property.first == key) {
            property.second.swap(text);
            return;
        }
    }
    m_properties.emplace_back(std::move(key), std::move(text));
}

const char* Nmod_PropertyHolder::GetPropertyString(const char* name) const {
    if (name == nullptr) {
        return nullptr;
    }
    for (const auto& property : m_properties) {
        if (property.first == name) {
            return property.second.c_str();
        }
    }
    return nullptr;
}

Nmod_Block::Nmod_Block(Nmod_View* view, std::string name, unsigned int type)
    : m_view(view), m_name(std::move(name)), m_type(type) {}
Nmod_Block::~Nmod_Block() = default;

Nmod_View::Nmod_View(Nmod_Design* design, long long id, std::string name)
    : m_design(design), m_id(id), m_name(std::move(name)) {}
Nmod_View::~Nmod_View() = default;

void Nmod_View::StoreProperty(const std::string& name, const std::string& value) {
    Access::WritableStore(m_design->GetModel()).SetViewProperty(m_id, name, value);
}

Nmod_Block* Nmod_View::CreateBlock(const char* name, unsigned int type) {
    std::string text = Required(name, "block name");
    if (m_block) {
        throw Nmod_Exception::Usage("view \"" + m_name + "\" has a root block already");
    }
    std::unique_ptr<Nmod_Block> block(Access::NewBlock(this, text, type));
    Access::WritableStore(m_design->GetModel()).InsertBlock(m_id, text, type);
    m_block = std::move(block);
    return m_block.get();
}

Nmod_Design::Nmod_Design(Nmod_Model* model, long long id, std::string name)
    : m_model(model), m_id(id), m_name(std::move(name)) {}
Nmod_Design::~Nmod_Design() = default;

Nmod_View* Nmod_Design::CreateView(const char* name, bool unique) {
    std::string text = Required(name, "view name");
    if (Nmod_View* existing = GetViewByName(text.c_str())) {
        if (unique) {
            throw Nmod_Exception::Usage("design \"" + m_name + "\" has a view \"" + text +
                                        "\" already");
        }
        return existing;
    }
    m_views.reserve(m_views.size() + 1);
    auto& store = Access::WritableStore(m_model);
    std::unique_ptr<Nmod_View> view(Access::NewView(this, 0, text));
    Access::SetId(*view, store.InsertView(m_id, text));
    m_views.push_back(std::move(view));
    return m_views.back().get();
}

Nmod_View* Nmod_Design::GetViewByName(const char* name) const {
    if (name == nullptr) {
        return nullptr;
    }
    for (const auto& view : m_views) {
        if (std::strcmp(view->GetName(), name) == 0) {
            return view.get();
        }
    }
    return nullptr;
}

Nmod_Iterator<Nmod_View*> Nmod_Design::GetViewItr() const {
    std::vector<Nmod_View*> views;
    views.reserve(m_views.size());
    for (const auto& view : m_views) {
        views.push_back(view.get());
    }
    return Nmod_Iterator<Nmod_View*>(std::move(views));
}

Nmod_DesignMgr::Nmod_DesignMgr(Nmod_Model* model) : m_model(model) {}
Nmod_DesignMgr::~Nmod_DesignMgr() = default;

Nmod_Design* Nmod_DesignMgr::CreateDesign(const char* name) {
    std::string text = Required(name, "design name");
    if (GetDesignByName(text.c_str()) != nullptr) {
        throw Nmod_Exception::Usage("a design \"" + text + "\" exists already");
    }
    m_designs.reserve(m_designs.size() + 1);
    auto& store = Access::WritableStore(m_model);
    std::unique_ptr<Nmod_Design> design(Access::NewDesign(m_model, 0, text));
    Access::SetId(*design, store.InsertDesign(text));
    m_designs.push_back(std::move(design));
    return m_designs.back().get();
}

Nmod_Iterator<Nmod_Design*> Nmod_DesignMgr::GetDesignItr() const {
    std::vector<Nmod_Design*> designs;
    designs.reserve(m_designs.size());
    for (const auto& design : m_designs) {
        designs.push_back(design.get());
    }
    return Nmod_Iterator<Nmod_Design*>(std::move(designs));
}

Nmod_Design* Nmod_DesignMgr::GetDesignByName(const char* name) const {
    if (name == nullptr) {
        return nullptr;
    }
    for (const auto& design : m_designs) {
        if (std::strcmp(design->GetName(), name) == 0) {
            return design.get();
        }
    }
    return nullptr;
}
