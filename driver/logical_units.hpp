// Logical units: the numbers by which the driver side names its open files.
//
// Units are 3 or above (0 to 2 are never handed out). A unit holds one file:
// a record file opened for reading or created for writing, or a text file.
// Every fault of a record file ends the program through record_stop (exit
// status by kind, message naming the file and the record); the callers only
// ever see data or the end of the file. Process-wide, single-threaded.
#pragma once

#include <cstdint>
#include <string>

#include "driver/record_fault.hpp"

namespace zt {

inline constexpr std::int32_t kFirstUnit = 3;

// The first unit number, from 3 up, with no file attached.
std::int32_t free_unit();
void get_free_unit(std::int32_t& unit);
bool unit_attached(const std::int32_t& unit);

// Attaches an existing record file for reading, positioned at its first
// record (a unit already attached is closed first). Stops on a fault.
void attach_record_input(const std::int32_t& unit, const std::string& path);
// Creates (or truncates) a record file for writing. Stops on a fault.
void attach_record_output(const std::int32_t& unit, const std::string& path);

// Reads the next record's first three floats; false at the end of the file.
// Stops on a fault, on a record shorter than three floats and on a
// non-finite value.
bool read_record_xyz(const std::int32_t& unit, float& x, float& y, float& z);
// read_record_xyz that hands a fault to the caller instead of stopping:
// false with `fault` set (kNone at the end of the file).
bool read_record_xyz(const std::int32_t& unit, float& x, float& y, float& z, RecordFaultInfo& fault);
// Number (from 1) of the record the next read returns.
std::int32_t record_position(const std::int32_t& unit);
// Back to the first record.
void rewind_unit(const std::int32_t& unit);
// rewind_unit that hands a fault to the caller: false with `fault` set.
bool rewind_unit(const std::int32_t& unit, RecordFaultInfo& fault);

// Writes one point record (18 bytes). Stops on a fault.
void write_point_record(const std::int32_t& unit, float x, float y, float z, std::int32_t code,
                        std::int16_t flag);

// Detaches the unit and keeps the file (a written record file gets its end
// marker). Closing a free unit does nothing. Stops on a fault.
void close_unit(const std::int32_t& unit);

// The path attached to a unit ("" when free).
std::string unit_path(const std::int32_t& unit);

// Text files (opensq). How the file is opened.
enum class TextOpen { kRead, kCreate, kAppend };
// Attaches a text file; false when it cannot be opened (nothing attached).
// A file to read must be a regular file (refused at once otherwise).
bool attach_text(const std::int32_t& unit, const std::string& path, TextOpen how);
// Reads the next line without its line end (a "\r" before it is dropped too);
// false at the end of the file or on a read error.
bool read_text_line(const std::int32_t& unit, std::string& line);
// Writes the text and a line end; false on failure.
bool write_text_line(const std::int32_t& unit, const std::string& line);

}  // namespace zt
