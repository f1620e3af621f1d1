// Faults of the record-file layer and how they end the program.
//
// A record file that cannot be read or written as laid out is never handled
// by the caller: the program ends at once with one English line on standard
// error naming the file and the record number, and an exit status that tells
// the kind of fault. The status marker of the run is left in place, so the
// calling suite sees the run as failed, and no half-written record file stays.
#pragma once

#include <cstdint>
#include <string>

namespace zt {

enum class RecordFault : std::int32_t {
  kNone = 0,
  kUnreadable,     // cannot be opened or read (also a unit used for reading that is not)
  kUnwritable,     // cannot be created, written or closed
  kDiskFull,       // no space left while writing or closing
  kNotRecordFile,  // first byte is not the file marker "K"
  kDamaged,        // segment layout broken: cut short, lengths disagree, no end marker
  kShortRecord,    // a record shorter than three floats
  kNonFinite,      // a point record with a NaN or infinite coordinate
};

// Exit status of the program for each kind of fault (kNone gives 0).
std::int32_t record_fault_exit_status(RecordFault fault);
// Short English description of the kind.
const char* record_fault_text(RecordFault fault);

// Everything needed to report one fault. `record` is the number (from 1) of
// the record being read or written when it happened; 0 means the file as a
// whole (opening it, its first byte).
struct RecordFaultInfo {
  RecordFault fault = RecordFault::kNone;
  std::string path;
  std::int64_t record = 0;
  std::string detail;  // extra words, e.g. the system's error text; may be empty
};

// The line printed on standard error (without its line end).
std::string record_fault_message(const RecordFaultInfo& info);

// Removes the record files still being written on units (they would be
// incomplete), prints the message on standard error and ends the process with
// the fault's exit status.
[[noreturn]] void record_stop(const RecordFaultInfo& info);

}  // namespace zt
