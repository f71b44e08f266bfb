//===-- Schema.h - the tables of a netlist database file ------------------------===//
//
// Described for users in designmodel/Nmod_Model.h; keep the two in step.
//
//===------------------------------------------------------------------------------===//
#pragma once

namespace Nmod_Detail {

inline constexpr const char* kKindNgd = "NGD";
inline constexpr const char* kKindNgc = "NGC";

inline constexpr const char* kSchemaSql = R"sql(
CREATE TABLE nmod_format (
    id           INTEGER PRIMARY KEY CHECK (id = 1),
    kind         TEXT    NOT NULL CHECK (kind IN ('NGD', 'NGC')),
    version      INTEGER NOT NULL,
    model_name   TEXT    NOT NULL,
    tool         TEXT    NOT NULL,
    tool_version TEXT    NOT NULL
) STRICT;
CREATE TABLE nmod_design (
    id   INTEGER PRIMARY KEY,
    name TEXT    NOT NULL UNIQUE
) STRICT;
CREATE TABLE nmod_view (
    id        INTEGER PRIMARY KEY,
    design_id INTEGER NOT NULL REFERENCES nmod_design(id),
    name      TEXT    NOT NULL,
    UNIQUE (design_id, name)
) STRICT;
CREATE TABLE nmod_view_property (
    view_id INTEGER NOT NULL REFERENCES nmod_view(id),
    name    TEXT    NOT NULL,
    value   TEXT    NOT NULL,
    PRIMARY KEY (view_id, name)
) STRICT;
CREATE TABLE nmod_block (
    id      INTEGER PRIMARY KEY,
    view_id INTEGER NOT NULL UNIQUE REFERENCES nmod_view(id),
    name    TEXT    NOT NULL,
    type    INTEGER NOT NULL
) STRICT;
)sql";

/// The tables a readable file must have, whatever else it holds.
inline constexpr const char* kTables[] = {"nmod_format", "nmod_design", "nmod_view",
                                          "nmod_view_property", "nmod_block"};

} // namespace Nmod_Detail
