// The first fatal end of the process wins.
//
// Every report that ends the process (the array's fatal report, the Voronoi
// engine's, the driver's stops) claims the end first. The first thread to
// claim it reports and ends the process; any other thread that claims it
// meanwhile waits, without a word, for that end. A run on several threads
// where two workers fail at once therefore shows one report and ends with
// its status, never two reports or two exits racing. The winning thread may
// claim again (a fault while it ends) and goes on.
#pragma once

#include <mutex>

namespace zt {

inline void claim_fatal_end() {
  // Locked for good by the first claimer; never destroyed, so a claim made
  // while the process runs its exit handlers still finds it.
  static std::recursive_mutex* const gate = new std::recursive_mutex;
  gate->lock();
}

}  // namespace zt
