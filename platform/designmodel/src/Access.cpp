//===-- Access.cpp - the library's own units' way into the public objects -------===//
#include "Port/UnitStartup.h"

#include "Access.h"

#include "ModelImp.h"
#include "designmodel/Nmod_Exception.h"

namespace Nmod_Detail {

Store& Access::WritableStore(const Nmod_Model* model) {
    const auto& imp = *model->m_imp;
    if (imp.readOnly) {
        throw Nmod_Exception::Usage("model \"" + imp.modelName + "\" is read-only");
    }
    if (imp.closed) {
        throw Nmod_Exception::Usage("model \"" + imp.modelName + "\" is closed");
    }
    if (!imp.store) {
        throw Nmod_Exception::Usage("model \"" + imp.modelName +
                                    "\" has no file to write to: call Create first");
    }
    return *imp.store;
}

void Access::SetId(Nmod_Design& design, long long id) {
    design.m_id = id;
}
void Access::SetId(Nmod_View& view, long long id) {
    view.m_id = id;
}

Nmod_Txn* Access::NewTxn(std::string name, Nmod_Txn::NMOD_TXN_TYPE type) {
    return new Nmod_Txn(std::move(name), type);
}

Nmod_DesignMgr* Access::NewDesignMgr(Nmod_Model* model) {
    return new Nmod_DesignMgr(model);
}

Nmod_Design* Access::NewDesign(Nmod_Model* model, long long id, std::string name) {
    return new Nmod_Design(model, id, std::move(name));
}

Nmod_View* Access::NewView(Nmod_Design* design, long long id, std::string name) {
    return new Nmod_View(design, id, std::move(name));
}

Nmod_Block* Access::NewBlock(Nmod_View* view, std::string name, unsigned int type) {
    return new Nmod_Block(view, std::move(name), type);
}

std::unique_ptr<Nmod_Model> Access::NewReadModel(const std::string& modelName,
                                                 const std::string& toolName,
                                                 const std::string& toolVersion,
                                                 const std::string& fileName, bool ngd) {
    auto model = std::make_unique<Nmod_Model>(modelName.c_str(), toolName.c_str(),
                                              toolVersion.c_str(), true);
    model->m_imp->fileName = fileName;
    model->m_imp->ngd = ngd;
    return model;
}

Nmod_Design* Access::AddDesign(Nmod_Model& model, long long id, std::string name) {
    auto& designs = model.m_imp->designMgr->m_designs;
    designs.emplace_back(NewDesign(&model, id, std::move(name)));
    return designs.back().get();
}

Nmod_View* Access::AddView(Nmod_Design& design, long long id, std::string name) {
    design.m_views.emplace_back(NewView(&design, id, std::move(name)));
    return design.m_views.back().get();
}

std::size_t Access::AddProperty(Nmod_View& view, std::string name, std::string value) {
    view.m_properties.emplace_back(std::move(name), std::move(value));
    return view.m_properties.size() - 1;
}

const std::string& Access::PropertyName(const Nmod_View& view, std::size_t place) {
    return view.m_properties[place].first;
}

void Access::AddBlock(Nmod_View& view, std::string name, unsigned int type) {
    if (view.m_block) {
        throw Nmod_Exception::Format("view \"" + view.m_name + "\" has two root blocks");
    }
    view.m_block.reset(NewBlock(&view, std::move(name), type));
}

void Access::OpenReadTxn(Nmod_Model& model) {
    model.m_imp->txn.reset(NewTxn("read", Nmod_Txn::NMOD_TXN_READ_ONLY));
}

} // namespace Nmod_Detail
