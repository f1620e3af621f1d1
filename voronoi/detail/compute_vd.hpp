// ComputeVD: the randomized incremental construction, resumable and
// restartable. One call performs a whole computation unless it returns with
// a restart pending; API_ComputeVD calls it again with the same arguments.
#pragma once

#include <cstdint>

namespace zt::vd {

struct ComputeArgs {
  bool writeOutput = false;
  bool newInput = true;
  bool timing = false;
  std::int32_t boundFactor = 1;
  std::int32_t sampleDensity = 0;
  std::int32_t arcPieces = 0;
  const char* outputFile = nullptr;
  bool clean = false;
  bool keepArcLinks = false;
  double arcTolerance = 0.0;
  double arcTolerance2 = 0.0;
  bool autoArcTolerance = true;
  bool pointsOnly = false;
  bool printCells = false;
  const char* cellsFile = nullptr;
};

// Restarts beyond this number end the computation with a fatal error.
inline constexpr std::int32_t kMaxRestarts = 500;

void ComputeVD(const ComputeArgs& args, bool& finished);

// Empties the diagram and the per-computation fields of every site, as a
// restart does.
void ClearDiagram();

}  // namespace zt::vd
