//===-- designmodel/Nmod_Model.h - netlist databases in memory and on disk ------===//
//
// \file
// A model holds the designs of one netlist database. A design has named views; a view
// carries text properties and at most one block, its root block. Models either write a
// new file (Create) or hold what Nhlp_FileConv::ReadAsNmod read from one.
//
//   Nmod_Model model("top", "mytool", "1.0", false);
//   model.Create("top.ngd", true, false);            // an NGD; the file does not exist yet
//   model.CreateTxn("build", Nmod_Txn::NMOD_TXN_UPDATE);
//   Nmod_Design* d = model.GetDesignMgr()->CreateDesign("top");
//   Nmod_View* v = d->CreateView("EXPANDED", true);
//   v->CreatePropertyString("PART", "ice40hx8k-ct256");
//   v->CreateBlock("top_root", 0);
//   // leaving scope puts top.ngd in place; an exception before that leaves no top.ngd
//
// Writing is all or nothing. A writing model works on a file of its own, named
// ".<name>.tmp-<unique>" in the folder of the final name, inside one database
// transaction. Close(), or the destructor when Close was not called, commits, flushes the
// file to the disk and then moves it to the final name in one step (and flushes the
// folder, so that the move survives a crash too). A model that saw a failure, or that is
// destroyed while an exception unwinds the stack, deletes its file instead. So a crash,
// an exception or a full disk never leaves a half-written database under the final
// name, where a later run would take it as finished. The move never replaces a file
// that appeared under the final name in the meantime unless Create was asked to
// overwrite.
//
// File format: an SQLite 3 database holding these tables (STRICT tables, so a wrong
// type is refused when written):
//
//   nmod_format         exactly one row, id = 1
//     id INTEGER PRIMARY KEY CHECK (id = 1)
//     kind TEXT NOT NULL          'NGD' (a full netlist) or 'NGC' (a stub)
//     version INTEGER NOT NULL    Nmod_Model::kFormatVersion when written; a smaller
//                                 number is obsolete, a larger one unknown
//     model_name TEXT NOT NULL    the three texts the writing model was made with
//     tool TEXT NOT NULL
//     tool_version TEXT NOT NULL
//   nmod_design
//     id INTEGER PRIMARY KEY, name TEXT NOT NULL UNIQUE
//   nmod_view
//     id INTEGER PRIMARY KEY, design_id INTEGER NOT NULL REFERENCES nmod_design(id),
//     name TEXT NOT NULL, UNIQUE (design_id, name)
//   nmod_view_property
//     view_id INTEGER NOT NULL REFERENCES nmod_view(id), name TEXT NOT NULL,
//     value TEXT NOT NULL, PRIMARY KEY (view_id, name)
//   nmod_block          a view's root block; at most one per view
//     id INTEGER PRIMARY KEY, view_id INTEGER NOT NULL UNIQUE REFERENCES nmod_view(id),
//     name TEXT NOT NULL, type INTEGER NOT NULL
//
// Rows are read back in id order, which is the order they were created in.
//
// Objects handed out by a model (designs, views, blocks, the transaction) belong to it
// and live until it is destroyed. Nothing here is safe for use from two threads at once.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstddef>
#include <memory>
#include <string>
#include <utility>
#include <vector>

class Nmod_Model;
class Nmod_Design;
class Nmod_View;
class Nmod_Block;

namespace Nmod_Detail {
class Store;
struct Access;
} // namespace Nmod_Detail

/// A snapshot of a model's objects: later additions do not disturb a walk in progress.
/// Current() is null (T{}) at the end.
template <class T> class Nmod_Iterator {
public:
    Nmod_Iterator() = default;
    explicit Nmod_Iterator(std::vector<T> items) : m_items(std::move(items)) {}

    void First() { m_pos = 0; }
    void Next() {
        if (m_pos < m_items.size()) {
            ++m_pos;
        }
    }
    bool IsEnd() const { return m_pos >= m_items.size(); }
    T Current() const { return IsEnd() ? T{} : m_items[m_pos]; }
    T operator*() const { return Current(); }
    std::size_t GetCount() const { return m_items.size(); }

private:
    std::vector<T> m_items;
    std::size_t m_pos = 0;
};

/// A named unit of work. The whole life of a writing model is one database transaction
/// (see above), so a transaction object records intent; a model has at most one.
class VN_VISIBLE Nmod_Txn {
public:
    /// Kept with fixed values: callers pass them as numbers. Do not reorder.
    enum NMOD_TXN_TYPE { NMOD_TXN_UPDATE = 0, NMOD_TXN_READ_ONLY = 1 };

    ~Nmod_Txn();
    Nmod_Txn(const Nmod_Txn&) = delete;
    Nmod_Txn& operator=(const Nmod_Txn&) = delete;

    const char* GetName() const { return m_name.c_str(); }
    NMOD_TXN_TYPE GetType() const { return m_type; }

private:
    friend struct Nmod_Detail::Access;
    Nmod_Txn(std::string name, NMOD_TXN_TYPE type);

    std::string m_name;
    NMOD_TXN_TYPE m_type;
};

/// Text properties by name. Setting a name that is already there replaces its value.
class VN_VISIBLE Nmod_PropertyHolder {
public:
    virtual ~Nmod_PropertyHolder();
    Nmod_PropertyHolder(const Nmod_PropertyHolder&) = delete;
    Nmod_PropertyHolder& operator=(const Nmod_PropertyHolder&) = delete;

    /// Adds (or replaces) the property `name` with `value`. Throws Usage for a null
    /// text or a holder of a model that does not write, Database when the file refuses.
    void CreatePropertyString(const char* name, const char* value);
    /// The value of `name`, or null when there is no such property.
    const char* GetPropertyString(const char* name) const;
    std::size_t GetNumProperties() const { return m_properties.size(); }

protected:
    Nmod_PropertyHolder() = default;

private:
    friend struct Nmod_Detail::Access;
    /// Writes the property through to the file before it is kept in memory.
    virtual void StoreProperty(const std::string& name, const std::string& value) = 0;

    std::vector<std::pair<std::string, std::string>> m_properties;
};

class VN_VISIBLE Nmod_Block {
public:
    ~Nmod_Block();
    Nmod_Block(const Nmod_Block&) = delete;
    Nmod_Block& operator=(const Nmod_Block&) = delete;

    const char* GetName() const { return m_name.c_str(); }
    unsigned int GetType() const { return m_type; }
    Nmod_View* GetView() const { return m_view; }

private:
    friend struct Nmod_Detail::Access;
    Nmod_Block(Nmod_View* view, std::string name, unsigned int type);

    Nmod_View* m_view; // not owned
    std::string m_name;
    unsigned int m_type;
};

class VN_VISIBLE Nmod_View : public Nmod_PropertyHolder {
public:
    ~Nmod_View() override;

    const char* GetName() const { return m_name.c_str(); }
    Nmod_Design* GetDesign() const { return m_design; }
    /// Makes the view's root block. `type` is stored with it and not interpreted. Throws
    /// Usage when the view has a root block already.
    Nmod_Block* CreateBlock(const char* name, unsigned int type);
    /// The root block, or null when the view has none.
    Nmod_Block* GetBlock() const { return m_block.get(); }

private:
    friend struct Nmod_Detail::Access;
    Nmod_View(Nmod_Design* design, long long id, std::string name);
    void StoreProperty(const std::string& name, const std::string& value) override;

    Nmod_Design* m_design; // not owned
    long long m_id;
    std::string m_name;
    std::unique_ptr<Nmod_Block> m_block;
};

class VN_VISIBLE Nmod_Design {
public:
    ~Nmod_Design();
    Nmod_Design(const Nmod_Design&) = delete;
    Nmod_Design& operator=(const Nmod_Design&) = delete;

    const char* GetName() const { return m_name.c_str(); }
    /// Makes a view. With `unique` a name already taken is an error (Usage); without it
    /// the view of that name is returned as it is.
    Nmod_View* CreateView(const char* name, bool unique);
    /// The view of that name, or null.
    Nmod_View* GetViewByName(const char* name) const;
    Nmod_Iterator<Nmod_View*> GetViewItr() const;
    Nmod_Model* GetModel() const { return m_model; }

private:
    friend struct Nmod_Detail::Access;
    Nmod_Design(Nmod_Model* model, long long id, std::string name);

    Nmod_Model* m_model; // not owned
    long long m_id;
    std::string m_name;
    std::vector<std::unique_ptr<Nmod_View>> m_views;
};

class VN_VISIBLE Nmod_DesignMgr {
public:
    ~Nmod_DesignMgr();
    Nmod_DesignMgr(const Nmod_DesignMgr&) = delete;
    Nmod_DesignMgr& operator=(const Nmod_DesignMgr&) = delete;

    /// Makes a design. Names are unique within a model (Usage otherwise).
    Nmod_Design* CreateDesign(const char* name);
    unsigned int GetNumDesigns() const { return static_cast<unsigned int>(m_designs.size()); }
    /// The designs in the order they were made (or stored).
    Nmod_Iterator<Nmod_Design*> GetDesignItr() const;
    /// The design of that name, or null.
    Nmod_Design* GetDesignByName(const char* name) const;

private:
    friend struct Nmod_Detail::Access;
    explicit Nmod_DesignMgr(Nmod_Model* model);

    Nmod_Model* m_model; // not owned
    std::vector<std::unique_ptr<Nmod_Design>> m_designs;
};

class VN_VISIBLE Nmod_Model {
public:
    /// The format version this library writes; files of smaller versions are obsolete.
    static constexpr long long kFormatVersion = 2;

    /// A model with no file yet. The three texts are recorded in any file it writes.
    /// A read-only model refuses Create.
    Nmod_Model(const char* modelName, const char* toolName, const char* toolVersion, bool readOnly);
    /// Finishes a file that is being written (see the file comment); never throws. A
    /// failure to finish is reported as an error message and leaves no file.
    virtual ~Nmod_Model();
    Nmod_Model(const Nmod_Model&) = delete;
    Nmod_Model& operator=(const Nmod_Model&) = delete;

    /// Starts a new database that will be put under `fileName`: an NGD when `ngd`, an
    /// NGC otherwise. Without `overwrite`, an existing file of that name is an error
    /// (Usage) and is never replaced. Throws Usage when the model already has a file,
    /// Database when the folder does not take the file.
    void Create(const char* fileName, bool ngd, bool overwrite);
    /// Opens the model's transaction. Throws Usage when one is open already.
    Nmod_Txn* CreateTxn(const char* name, Nmod_Txn::NMOD_TXN_TYPE type);
    /// Deletes the open transaction, if any.
    void DeleteTxn();
    Nmod_Txn* GetTxn() const;
    Nmod_DesignMgr* GetDesignMgr();

    /// True when `fileName` is an SQLite database that passes the engine's integrity
    /// check. Never throws; a missing file is not readable.
    static bool IsQdbReadable(const char* fileName);

    /// A writing model commits and puts its file in place (throws Database when it
    /// cannot; the file is then gone). Later writes throw Usage. Closing twice, or
    /// closing a model that writes nothing, does nothing.
    virtual void Close();

    /// Has the model record whether its own file was put under the final name: `*placed`
    /// becomes false now, and true only when this model's move into place succeeds, in
    /// Close or in the destructor. The destructor cannot throw, and a file of the same
    /// name made meanwhile by another writer is no proof of this model's work, so a
    /// caller that leaves finishing to the destructor learns the outcome here. `placed`
    /// must stay valid until the model is finished or destroyed; null stops recording.
    void RecordPlacementIn(bool* placed);

    const char* GetModelName() const;
    const char* GetToolName() const;
    const char* GetToolVersion() const;
    /// The final file name given to Create, or the file that was read; empty otherwise.
    const char* GetFileName() const;
    /// True when the model writes, or was read from, an NGD.
    bool IsNgd() const;

private:
    friend struct Nmod_Detail::Access;
    struct Imp;
    std::unique_ptr<Imp> m_imp;
};
