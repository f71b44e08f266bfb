//===-- Nmod_Model.cpp - the model: its file, transaction and design manager ----===//
#include "Port/UnitStartup.h"

#include "designmodel/Nmod_Model.h"

#include "Access.h"
#include "Engine.h"
#include "ModelImp.h"
#include "designmodel/Nmod_Exception.h"

#include "Port/File.h"

#include <exception>

using Nmod_Detail::Access;
using Nmod_Detail::Required;

Nmod_Model::Nmod_Model(const char* modelName, const char* toolName, const char* toolVersion,
                       bool readOnly)
    : m_imp(std::make_unique<Imp>()) {
    m_imp->modelName = modelName != nullptr ? modelName : "";
    m_imp->toolName = toolName != nullptr ? toolName : "";
    m_imp->toolVersion = toolVersion != nullptr ? toolVersion : "";
    m_imp->readOnly = readOnly;
    m_imp->designMgr.reset(Access::NewDesignMgr(this));
}

Nmod_Model::~Nmod_Model() {
    if (!m_imp->store) {
        return;
    }
    if (m_imp->store->IsFailed() || std::uncaught_exceptions() > m_imp->uncaughtAtCreate) {
        m_imp->store->Discard();
        return;
    }
    try {
        m_imp->store->Finish();
        if (m_imp->placed != nullptr) {
            *m_imp->placed = true;
        }
    } catch (const Nmod_Exception::Base& e) {
        // A destructor cannot throw: say why the file is missing instead.
        e.Report();
    } catch (...) {
        // Out of memory while finishing: the file was discarded; nothing more to do.
    }
}

void Nmod_Model::Create(const char* fileName, bool ngd, bool overwrite) {
    std::string file = Required(fileName, "file name");
    if (m_imp->readOnly) {
        throw Nmod_Exception::Usage("model \"" + m_imp->modelName + "\" is read-only");
    }
    if (m_imp->store || m_imp->closed || !m_imp->fileName.empty()) {
        throw Nmod_Exception::Usage("model \"" + m_imp->modelName + "\" has a file already");
    }
    if (file.empty()) {
        throw Nmod_Exception::Usage("no file name given (empty)");
    }
    if (!overwrite && Port::File::exist(file.c_str())) {
        throw Nmod_Exception::Usage("netlist database \"" + file +
                                    "\" exists already; it was left as it is");
    }
    auto store = std::make_unique<Nmod_Detail::Store>(file, ngd, overwrite, m_imp->modelName,
                                                      m_imp->toolName, m_imp->toolVersion);
    m_imp->fileName = std::move(file);
    m_imp->ngd = ngd;
    m_imp->uncaughtAtCreate = std::uncaught_exceptions();
    m_imp->store = std::move(store);
}

Nmod_Txn* Nmod_Model::CreateTxn(const char* name, Nmod_Txn::NMOD_TXN_TYPE type) {
    std::string text = Required(name, "transaction name");
    if (m_imp->txn) {
        throw Nmod_Exception::Usage("model \"" + m_imp->modelName +
                                    "\" has an open transaction already");
    }
    m_imp->txn.reset(Access::NewTxn(std::move(text), type));
    return m_imp->txn.get();
}

void Nmod_Model::DeleteTxn() {
    m_imp->txn.reset();
}

Nmod_Txn* Nmod_Model::GetTxn() const {
    return m_imp->txn.get();
}

Nmod_DesignMgr* Nmod_Model::GetDesignMgr() {
    return m_imp->designMgr.get();
}

bool Nmod_Model::IsQdbReadable(const char* fileName) {
    if (fileName == nullptr || *fileName == '\0' || !Port::File::exist(fileName)) {
        return false;
    }
    try {
        auto db = Nmod_Detail::Connection::OpenForReading(fileName);
        Nmod_Detail::Statement check(db, "PRAGMA integrity_check", "integrity check");
        // One row "ok" when the file is sound; otherwise one row per problem found.
        if (!check.Step() || check.Text(0) != "ok") {
            return false;
        }
        return !check.Step();
    } catch (const std::exception&) {
        return false;
    }
}

void Nmod_Model::Close() {
    m_imp->closed = true;
    if (auto store = std::move(m_imp->store)) {
        store->Finish();
        if (m_imp->placed != nullptr) {
            *m_imp->placed = true;
        }
    }
}

void Nmod_Model::RecordPlacementIn(bool* placed) {
    m_imp->placed = placed;
    if (placed != nullptr) {
        *placed = false;
    }
}

const char* Nmod_Model::GetModelName() const {
    return m_imp->modelName.c_str();
}
const char* Nmod_Model::GetToolName() const {
    return m_imp->toolName.c_str();
}
const char* Nmod_Model::GetToolVersion() const {
    return m_imp->toolVersion.c_str();
}
const char* Nmod_Model::GetFileName() const {
    return m_imp->fileName.c_str();
}
bool Nmod_Model::IsNgd() const {
    return m_imp->ngd;
}
