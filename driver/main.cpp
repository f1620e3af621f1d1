// restzones: builds the rest-machining zones of the run's temporary
// directory. No arguments, no standard input; how the run ended is told by
// the status marker and the message file (see driver/main_flow.hpp).
#include "driver/main_flow.hpp"

int main() {
  return zt::restzones_main() == zt::RunEnd::kNoMarker ? zt::kNoMarkerExitStatus : 0;
}
