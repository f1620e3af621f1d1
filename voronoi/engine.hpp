// The Voronoi engine's facade: one process-wide engine that takes points
// and segments, computes their Voronoi diagram and (later) offset curves.
//
// Life cycle: VD_Initialize once; per problem VD_Reset, API_AddPoint /
// API_AddSegment, VD_ComputeDiagram. Nothing here throws; fatal errors of the
// engine print "\nerror in %s\n" with their message on both standard streams
// and end the process with status 2.
#pragma once

#include <cstdint>

namespace zt {

// False (and nothing changes) when the engine is already initialised.
bool VD_Initialize();
// Empties the engine keeping its memory; nothing while not initialised.
void VD_Reset();
// Frees every array of the engine; nothing while not initialised.
void VD_Terminate();

// Appends a point and returns its index; on an empty engine the first point
// gets index 2 (0 and 1 are reserved for corner points).
std::int32_t API_AddPoint(double x, double y, std::int32_t tag);
// Appends a segment between two stored caller points (indices returned by
// API_AddPoint) and returns its index from 0; -1, with nothing stored, when
// an index names no stored caller point.
std::int32_t API_AddSegment(std::int32_t i1, std::int32_t i2, std::int32_t tag);

// Computes the diagram of the stored sites; returns whether the diagram is
// up to date afterwards. Refuses (false, nothing computed) input with a
// non-finite coordinate or a magnitude above kMaxInputMagnitude.
bool VD_ComputeDiagram(bool clean, std::int32_t boundFactor, bool pointsOnly, bool keepArcLinks,
                       std::int32_t sampleDensity, std::int32_t arcPieces, double arcTolerance,
                       double arcTolerance2, bool autoArcTolerance);
// Runs ComputeVD until no restart is pending.
void API_ComputeVD(bool writeOutput, bool newInput, bool timing, std::int32_t boundFactor,
                   std::int32_t sampleDensity, std::int32_t arcPieces, const char* outputFile,
                   bool clean, bool keepArcLinks, double arcTolerance, double arcTolerance2,
                   bool autoArcTolerance, bool pointsOnly, bool printCells, const char* cellsFile);

bool VD_IsUpToDate();

// Largest coordinate magnitude the engine accepts.
inline constexpr double kMaxInputMagnitude = 1e15;

// Figures of the last computation.
std::int32_t VD_GetRestartCount();
bool VD_InRecoveryMode();
std::int32_t VD_GetDuplicateCount();

// Read-out of the diagram, in user coordinates. Indices run over all
// records; a record on a free list reads as not live.
struct VD_NodeInfo {
  bool live;
  double x, y;
  double r;  // clearance (never squared here)
  bool degree2;
};
struct VD_EdgeInfo {
  bool live;
  std::int32_t n1, n2;
  std::int32_t lft, ltype, rgt, rtype;
};
std::int32_t VD_GetNodeCount();
std::int32_t VD_GetEdgeCount();
VD_NodeInfo VD_GetNode(std::int32_t i);
VD_EdgeInfo VD_GetEdge(std::int32_t i);
// Number of stored points including the reserved and corner slots.
std::int32_t VD_GetPointCount();
// The caller's tag of a point or segment site (-1 for an unknown index).
std::int32_t VD_GetPointTag(std::int32_t point);
std::int32_t VD_GetSegmentTag(std::int32_t segment);

}  // namespace zt
