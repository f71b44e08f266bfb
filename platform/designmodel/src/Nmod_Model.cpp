//===-- Nmod_Model.cpp - models, their objects, and the all-or-nothing writer ---===//
#include "Port/UnitStartup.h"

#include "designmodel/Nmod_Model.h"

#include "Access.h"
#include "Engine.h"
#include "Schema.h"
#include "designmodel/Nmod_Exception.h"

#include "Port/File.h"

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <exception>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

namespace Nmod_Detail {

namespace {

std::string Required(const char* text, const char* what) {
    if (text == nullptr) {
        throw Nmod_Exception::Usage(std::string("no ") + what + " given (null)");
    }
    return text;
}

std::string Quoted(const std::string& text) {
    return "\"" + text + "\"";
}

[[noreturn]] void FailSystem(const std::string& context, int error) {
    throw Nmod_Exception::Database(context + ": " + std::strerror(error), SQLITE_CANTOPEN);
}

} // namespace

/// The file a writing model fills: a private file beside the final one, one database
/// transaction, and the move into place at the end.
class Store {
public:
    Store(const std::string& finalPath, bool ngd, bool overwrite, const std::string& modelName,
          const std::string& toolName, const std::string& toolVersion);
    ~Store() { Discard(); }
    Store(const Store&) = delete;
    Store& operator=(const Store&) = delete;

    long long InsertDesign(const std::string& name);
    long long InsertView(long long designId, const std::string& name);
    void SetViewProperty(long long viewId, const std::string& name, const std::string& value);
    long long InsertBlock(long long viewId, const std::string& name, unsigned int type);

    /// Commits, syncs and moves the file into place; returns only when this store's own
    /// file is under the final name. On failure nothing is left and it throws.
    void Finish();
    /// Drops the private file; the final name is not touched.
    void Discard() noexcept;
    bool IsFailed() const { return m_failed; }

private:
    /// Runs one write; any failure poisons the store, so that the file is discarded
    /// rather than finished with a hole in it.
    template <class Write> auto Guarded(Write&& write) -> decltype(write()) {
        if (m_failed) {
            throw Nmod_Exception::Usage("an earlier write of netlist database " +
                                        Quoted(m_finalPath) + " failed; it will not be written");
        }
        try {
            return write();
        } catch (...) {
            m_failed = true;
            throw;
        }
    }
    void Exec(const char* sql);
    void MakePrivateFile();
    void SyncPrivateFile();
    void MoveIntoPlace();

    std::string m_finalPath;
    std::string m_tempPath;
    bool m_overwrite;
    Connection m_db;
    bool m_failed = false;
    bool m_done = false;
};

Store::Store(const std::string& finalPath, bool ngd, bool overwrite, const std::string& modelName,
             const std::string& toolName, const std::string& toolVersion)
    : m_finalPath(finalPath), m_overwrite(overwrite) {
    try {
        MakePrivateFile();
        m_db = Connection::OpenForWriting(m_tempPath);
        // The private file is thrown away on any failure, so the engine's rollback
        // journal only needs to live in memory: no second file appears in the folder.
        Exec("PRAGMA journal_mode=MEMORY");
        Exec("PRAGMA synchronous=FULL");
        Exec("BEGIN IMMEDIATE");
        Exec(kSchemaSql);
        CountWriteStep();
        Statement format(m_db,
                         "INSERT INTO nmod_format(id, kind, version, model_name, tool, "
                         "tool_version) VALUES (1, ?, ?, ?, ?, ?)",
                         "cannot write netlist database " + Quoted(m_finalPath));
        format.Bind(1, std::string(ngd ? kKindNgd : kKindNgc));
        format.Bind(2, Nmod_Model::kFormatVersion);
        format.Bind(3, modelName);
        format.Bind(4, toolName);
        format.Bind(5, toolVersion);
        format.Step();
    } catch (...) {
        m_failed = true;
        Discard();
        throw;
    }
}

void Store::MakePrivateFile() {
    static std::atomic<unsigned long> s_serial{0};
    const std::filesystem::path final(m_finalPath);
    std::string base = final.filename().string();
    // Keep the private name within the folder's name length whatever the final name.
    if (base.size() > 160) {
        base.resize(160);
    }
    for (int attempt = 0;; ++attempt) {
        const std::string name =
            "." + base + ".tmp-" + std::to_string(::getpid()) + "-" + std::to_string(s_serial++);
        m_tempPath = (final.parent_path() / name).string();
        const int fd = ::open(m_tempPath.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (fd >= 0) {
            ::close(fd);
            return;
        }
        const int error = errno;
        if (error != EEXIST || attempt >= 100) {
            m_tempPath.clear();
            FailSystem("cannot write netlist database " + Quoted(m_finalPath), error);
        }
    }
}

void Store::Exec(const char* sql) {
    CountWriteStep();
    m_db.Exec(sql, "cannot write netlist database " + Quoted(m_finalPath));
}

long long Store::InsertDesign(const std::string& name) {
    return Guarded([&] {
        CountWriteStep();
        Statement insert(m_db, "INSERT INTO nmod_design(name) VALUES (?)",
                         "cannot store design " + Quoted(name));
        insert.Bind(1, name);
        insert.Step();
        return static_cast<long long>(sqlite3_last_insert_rowid(m_db.Get()));
    });
}

long long Store::InsertView(long long designId, const std::string& name) {
    return Guarded([&] {
        CountWriteStep();
        Statement insert(m_db, "INSERT INTO nmod_view(design_id, name) VALUES (?, ?)",
                         "cannot store view " + Quoted(name));
        insert.Bind(1, designId);
        insert.Bind(2, name);
        insert.Step();
        return static_cast<long long>(sqlite3_last_insert_rowid(m_db.Get()));
    });
}

void Store::SetViewProperty(long long viewId, const std::string& name, const std::string& value) {
    Guarded([&] {
        CountWriteStep();
        Statement insert(m_db,
                         "INSERT INTO nmod_view_property(view_id, name, value) VALUES (?, ?, ?) "
                         "ON CONFLICT(view_id, name) DO UPDATE SET value = excluded.value",
                         "cannot store property " + Quoted(name));
        insert.Bind(1, viewId);
        insert.Bind(2, name);
        insert.Bind(3, value);
        insert.Step();
    });
}

long long Store::InsertBlock(long long viewId, const std::string& name, unsigned int type) {
    return Guarded([&] {
        CountWriteStep();
        Statement insert(m_db, "INSERT INTO nmod_block(view_id, name, type) VALUES (?, ?, ?)",
                         "cannot store block " + Quoted(name));
        insert.Bind(1, viewId);
        insert.Bind(2, name);
        insert.Bind(3, static_cast<long long>(type));
        insert.Step();
        return static_cast<long long>(sqlite3_last_insert_rowid(m_db.Get()));
    });
}

void Store::Finish() {
    if (m_done) {
        return;
    }
    try {
        Guarded([&] {
            Exec("COMMIT");
            m_db.Close("cannot finish netlist database " + Quoted(m_finalPath));
            CountWriteStep();
            SyncPrivateFile();
            CountWriteStep();
            RunBeforeMoveHook(m_finalPath);
            MoveIntoPlace();
        });
    } catch (...) {
        Discard();
        throw;
    }
    m_done = true;
    // The move is only as durable as the folder entry that records it.
    const std::filesystem::path folder = std::filesystem::path(m_finalPath).parent_path();
    const int fd =
        ::open(folder.empty() ? "." : folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd >= 0) {
        ::fsync(fd);
        ::close(fd);
    }
}

void Store::SyncPrivateFile() {
    // The move must not reach the disk before the content it names: after a crash the
    // final name would hold a file with pages missing.
    const int fd = ::open(m_tempPath.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0 || ::fsync(fd) != 0) {
        const int error = errno;
        if (fd >= 0) {
            ::close(fd);
        }
        throw Nmod_Exception::Database("cannot finish netlist database " + Quoted(m_finalPath) +
                                           ": " + std::strerror(error),
                                       SQLITE_IOERR);
    }
    ::close(fd);
}

void Store::MoveIntoPlace() {
    const std::string context = "cannot put netlist database " + Quoted(m_finalPath) + " in place";
    if (m_overwrite) {
        if (std::rename(m_tempPath.c_str(), m_finalPath.c_str()) != 0) {
            FailSystem(context, errno);
        }
        return;
    }
    // Never replace a file that appeared under the final name since Create: another run
    // may have finished first, and its file is as good as ours.
    if (::renameat2(AT_FDCWD, m_tempPath.c_str(), AT_FDCWD, m_finalPath.c_str(),
                    RENAME_NOREPLACE) == 0) {
        return;
    }
    int error = errno;
    if (error == EINVAL || error == ENOSYS || error == ENOTSUP) {
        // File systems without the no-replace move still refuse to link over a file.
        if (::link(m_tempPath.c_str(), m_finalPath.c_str()) == 0) {
            ::unlink(m_tempPath.c_str());
            return;
        }
        error = errno;
    }
    if (error == EEXIST) {
        throw Nmod_Exception::Usage("netlist database " + Quoted(m_finalPath) +
                                    " appeared while it was being written; it was left as it is");
    }
    FailSystem(context, error);
}

void Store::Discard() noexcept {
    m_db.Abandon();
    if (!m_done && !m_tempPath.empty()) {
        ::unlink(m_tempPath.c_str());
        m_tempPath.clear();
    }
}

} // namespace Nmod_Detail

using Nmod_Detail::Access;
using Nmod_Detail::Required;

struct Nmod_Model::Imp {
    std::string modelName;
    std::string toolName;
    std::string toolVersion;
    bool readOnly = false;
    std::string fileName;
    bool ngd = false;
    bool closed = false;
    // Exceptions in flight when writing began: more of them at destruction means the
    // writer is being unwound, and its file must not be finished.
    int uncaughtAtCreate = 0;
    // Where to record that this model's own file went into place; may be null.
    bool* placed = nullptr;
    std::unique_ptr<Nmod_Detail::Store> store;
    std::unique_ptr<Nmod_DesignMgr> designMgr;
    std::unique_ptr<Nmod_Txn> txn;
};

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

// ---- the model ---------------------------------------------------------------------

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

// ---- access for the library's own units --------------------------------------------

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

void Access::AddProperty(Nmod_View& view, std::string name, std::string value) {
    view.m_properties.emplace_back(std::move(name), std::move(value));
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
