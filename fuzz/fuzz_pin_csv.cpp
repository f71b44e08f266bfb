//===-- fuzz/fuzz_pin_csv.cpp - CSV pin tables read from any input ---------------===//
//
// A pin table comes from a spreadsheet; whatever it holds, the reader answers with rows
// or a reason, and what it read writes back to text that reads as the same rows.
//
//===------------------------------------------------------------------------------===//
#include "PinCsv.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    std::vector<std::vector<std::string>> records;
    std::string error;
    if (VnTool::ParseCsv(text, "fuzz", records, error)) {
        std::string again;
        for (const auto& record : records) {
            again += VnTool::CsvRecord(record);
        }
        std::vector<std::vector<std::string>> reread;
        if (!VnTool::ParseCsv(again, "fuzz", reread, error) || reread != records) {
            std::abort();
        }
    } else if (error.rfind("fuzz:", 0) != 0) {
        std::abort();
    }
    VnTool::CsvTable table;
    VnTool::ReadPinCsv(text, "fuzz", table, error);
    return 0;
}
