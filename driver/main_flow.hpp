// The main program restzones, as a function of the driver library.
//
// It takes no arguments and reads no standard input. In a fixed order it
// scans "$TMP/contour.bin" and "$TMP/stock1.bin" into level tables, hands
// every stock level with more than kMinLevelRecords records to the zone
// builder, and lets the zone builder write "$TMP/stock2.bin". The run is
// framed by the status marker: created first, removed only by a normal end.
//
// A failed step shows one French message (console and "$TMP/kvlerror.prg")
// and stops: exit status 0, marker left behind. Faults of the record layer
// (damaged files, non-finite coordinates) end the process inside that layer
// with their own status. When the marker itself cannot be created nothing
// else is done: one line on standard error, exit status kNoMarkerExitStatus.
// The result is written as "$TMP/stock2.bin.tmp.<pid>" and renamed to
// "$TMP/stock2.bin" once complete, closed and on disk; an older stock2.bin
// is deleted before. Whichever way the process ends (a signal, a crash, a
// power loss included), "$TMP/stock2.bin" is absent or complete.
#pragma once

#include <cstdint>

namespace zt {

// The driver's messages, exactly as the calling suite knows them.
inline constexpr const char* kMsgNoContours = "Pas de Finition en Z";
inline constexpr const char* kMsgNoStock = "Pas de Zones de Reprise";
inline constexpr const char* kMsgInitFailed = "Erreur dans wf_init_czone";
inline constexpr const char* kMsgAddFailed = "Erreur dans wf_add_level";
inline constexpr const char* kMsgFinFailed = "Erreur dans wf_fin_czone";
// A file whose levels do not run from the top down would have levels
// silently skipped or overwritten; it is refused instead.
inline constexpr const char* kMsgContoursUnordered = "Niveaux de Finition non ordonnes en Z";
inline constexpr const char* kMsgStockUnordered = "Niveaux de Zones de Reprise non ordonnes en Z";

// Number of the banner in the general message file.
inline constexpr std::int32_t kBannerMessage = 139;
// Width of the driver's message buffer.
inline constexpr std::int32_t kMessageBufferWidth = 80;
// A stock level reaches the zone builder only with more records than this
// (separator records inside its range counted).
inline constexpr std::int32_t kMinLevelRecords = 4;

// Exit status of a run whose status marker could not be created.
inline constexpr int kNoMarkerExitStatus = 3;

enum class RunEnd {
  kNormal,    // result written, status marker removed
  kStopped,   // a message was shown, status marker left
  kNoMarker,  // the status marker could not be created; nothing was done
};

// Runs the whole program once per process (the zone builder's state lives
// until the process ends). The exit status of the first two ends is 0.
RunEnd restzones_main();

}  // namespace zt
