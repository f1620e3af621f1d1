// Messages and exit statuses of record-file faults (table in README.md,
// "Exit statuses"; keep the two in step).
#include "driver/record_fault.hpp"

#include <cstdio>
#include <cstdlib>

#include "core/fatal_gate.hpp"

#include "driver/detail/unit_cleanup.hpp"

namespace zt {

std::int32_t record_fault_exit_status(RecordFault fault) {
  switch (fault) {
    case RecordFault::kNone: return 0;
    case RecordFault::kUnreadable: return 10;
    case RecordFault::kUnwritable: return 11;
    case RecordFault::kDiskFull: return 12;
    case RecordFault::kNotRecordFile: return 13;
    case RecordFault::kDamaged: return 14;
    case RecordFault::kShortRecord: return 15;
    case RecordFault::kNonFinite: return 16;
  }
  return 10;
}

const char* record_fault_text(RecordFault fault) {
  switch (fault) {
    case RecordFault::kNone: return "no error";
    case RecordFault::kUnreadable: return "cannot read the file";
    case RecordFault::kUnwritable: return "cannot write the file";
    case RecordFault::kDiskFull: return "disk full";
    case RecordFault::kNotRecordFile: return "not a record file (first byte is not \"K\")";
    case RecordFault::kDamaged: return "damaged record file";
    case RecordFault::kShortRecord: return "record shorter than three floats";
    case RecordFault::kNonFinite: return "coordinate is not a finite number";
  }
  return "unknown fault";
}

std::string record_fault_message(const RecordFaultInfo& info) {
  std::string m = "record file error: \"" + info.path + "\", record " +
                  std::to_string(info.record) + ": " + record_fault_text(info.fault);
  if (!info.detail.empty()) m += " (" + info.detail + ")";
  return m;
}

void record_stop(const RecordFaultInfo& info) {
  claim_fatal_end();
  detail::abandon_record_outputs();
  std::fflush(stdout);
  const std::string m = record_fault_message(info);
  std::fprintf(stderr, "%s\n", m.c_str());
  std::fflush(stderr);
  std::exit(record_fault_exit_status(info.fault));
}

}  // namespace zt
