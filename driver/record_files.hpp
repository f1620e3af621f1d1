// The driver's file operations by suite name ("$TMP/contour.bin"): existence
// test, opening record files on logical units, writing closed contours, and
// opening text files (opensq).
//
// Names are blank-padded buffers with a declared length; they are expanded
// with the existence test before use. Errors of the record layer itself end
// the program (see record_fault.hpp); what is returned here are the statuses
// a caller can act on.
#pragma once

#include <cstdint>

#include "core/points.hpp"

namespace zt {

// Capacity of the driver's expanded-name buffers.
inline constexpr std::int32_t kNameCapacity = 512;
// First and last point of a contour farther apart than this: not closed.
inline constexpr float kClosedTolerance = 0.001f;

// True when the name expands to an existing file or directory.
void file_exists(const char* name, const std::int32_t& length, bool& exists);

// ierr = the expansion status (0: the file exists). Mode 2: the old file is
// deleted and a new record file created on the unit, whatever the status.
// Other modes: only when the status is 0, the existing file is attached,
// positioned at its first record; otherwise nothing is opened.
void open_unformatted(const std::int32_t& unit, const char* name, const std::int32_t& length,
                      const std::int32_t& mode, std::int32_t& ierr);

// Writes one closed contour of n points at height z: a separator record, then
// the n points. ierr = -1 and nothing written when n < 1 or the first and last
// points are farther apart than kClosedTolerance; else 0.
void write_contour(const std::int32_t& n, const Point2f* points, const float& z,
                   const std::int32_t& unit, std::int32_t& ierr);

// opensq error codes (ierr with a positive mode).
inline constexpr std::int32_t kOpensqOpenFailed = 1;    // also an empty name
inline constexpr std::int32_t kOpensqDeleteFailed = 2;
inline constexpr std::int32_t kOpensqMissing = 3;       // file to read does not exist
inline constexpr std::int32_t kOpensqAppendFailed = 4;
inline constexpr std::int32_t kOpensqRewindFailed = 5;

// Opens a text file on a unit. |mode| 1: read an existing file from its
// start; 2: write a new file (an old one is deleted); 3: append. A negative
// mode makes every failure a fatal stop; with a positive mode ierr gets the
// error code (0 on success) and the unit is left free. A mode other than
// those is always a fatal stop.
void opensq(const std::int32_t& unit, const char* name, const std::int32_t& length,
            const std::int32_t& mode, std::int32_t& ierr);

}  // namespace zt
