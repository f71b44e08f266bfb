//===-- Access.h - what the library's own units may do to the public objects ----===//
//
// The public classes keep their constructors and state private; the writers of a model
// and the file reader reach them through here only.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "designmodel/Nmod_Model.h"

#include <memory>
#include <string>

namespace Nmod_Detail {

class Store;

struct Access {
    /// The store that a write through `model` goes to; throws Usage when the model does
    /// not write (read-only, closed, or no Create yet).
    static Store& WritableStore(const Nmod_Model* model);

    static Nmod_Txn* NewTxn(std::string name, Nmod_Txn::NMOD_TXN_TYPE type);
    static Nmod_DesignMgr* NewDesignMgr(Nmod_Model* model);
    static Nmod_Design* NewDesign(Nmod_Model* model, long long id, std::string name);
    static Nmod_View* NewView(Nmod_Design* design, long long id, std::string name);
    static Nmod_Block* NewBlock(Nmod_View* view, std::string name, unsigned int type);
    /// Objects are made before their rows so that nothing can fail after the row is
    /// written; the row id is filled in afterwards.
    static void SetId(Nmod_Design& design, long long id);
    static void SetId(Nmod_View& view, long long id);

    // The reader builds a model from stored rows with these. They do not look for
    // duplicates: the reader does, in one pass over each table, and throws Format. Only
    // AddBlock refuses a second root block itself.
    static std::unique_ptr<Nmod_Model> NewReadModel(const std::string& modelName,
                                                    const std::string& toolName,
                                                    const std::string& toolVersion,
                                                    const std::string& fileName, bool ngd);
    static Nmod_Design* AddDesign(Nmod_Model& model, long long id, std::string name);
    static Nmod_View* AddView(Nmod_Design& design, long long id, std::string name);
    /// Returns the property's place among the view's, for PropertyName.
    static std::size_t AddProperty(Nmod_View& view, std::string name, std::string value);
    static const std::string& PropertyName(const Nmod_View& view, std::size_t place);
    static void AddBlock(Nmod_View& view, std::string name, unsigned int type);
    static void OpenReadTxn(Nmod_Model& model);
};

} // namespace Nmod_Detail
