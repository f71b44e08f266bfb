//===-- tests/support/LargeNgd.h - large netlist files, written fast ------------===//
//
// Shared by the netlist tests and the benchmarks, so it depends on neither GoogleTest nor
// Google Benchmark: a failure is thrown.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>

namespace VnTest {

/// Writes, as another program would and fast enough for files of any size, an NGD of
/// `designs` designs D0, D1, ...: each has an EXPANDED view naming part P0, P1, ... with
/// a root block B0, B1, .... Design D0 has `extraViews` more views V0, V1, ..., and its
/// EXPANDED view `extraProperties` more properties N0 = v0, N1 = v1, .... Rows get ids in
/// that order (design 1 is D0, view 1 its EXPANDED view). The file must not exist yet.
/// Throws std::runtime_error with SQLite's reason when the file cannot be written.
void WriteLargeNgd(const std::string& path, long designs, long extraViews, long extraProperties);

/// The tables of a netlist file as another program may declare them: the same columns,
/// without STRICT and without uniqueness, so that values of any type and duplicate names
/// can be stored.
inline constexpr const char* kOutsideSchema = R"sql(
CREATE TABLE nmod_format (id INTEGER PRIMARY KEY, kind TEXT, version INTEGER,
                          model_name TEXT, tool TEXT, tool_version TEXT);
CREATE TABLE nmod_design (id INTEGER PRIMARY KEY, name TEXT);
CREATE TABLE nmod_view (id INTEGER PRIMARY KEY, design_id INTEGER, name TEXT);
CREATE TABLE nmod_view_property (view_id INTEGER, name TEXT, value TEXT);
CREATE TABLE nmod_block (id INTEGER PRIMARY KEY, view_id INTEGER, name TEXT, type INTEGER);
)sql";

} // namespace VnTest
