// The Voronoi engine's facade: one process-wide engine that takes points
// and segments, computes their Voronoi diagram and (later) offset curves.
//
// Life cycle: VD_Initialize once; per problem VD_Reset, API_AddPoint /
// API_AddSegment, VD_ComputeDiagram. Nothing here throws; fatal errors of the
// engine print "\nerror in %s\n" with their message on both standard streams
// and end the process with status 2.
#pragma once

#include <cstdint>

#include "core/points.hpp"

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
// non-finite coordinate or a magnitude above kMaxInputMagnitude. A
// computation that had to take a fallback (VD_InRecoveryMode) and whose
// diagram then fails the engine's own local checks returns false too: no
// wrong diagram is reported as computed.
bool VD_ComputeDiagram(bool clean, std::int32_t boundFactor, bool pointsOnly, bool keepArcLinks,
                       std::int32_t sampleDensity, std::int32_t arcPieces, double arcTolerance,
                       double arcTolerance2, bool autoArcTolerance);
// Runs ComputeVD until no restart is pending.
void API_ComputeVD(bool writeOutput, bool newInput, bool timing, std::int32_t boundFactor,
                   std::int32_t sampleDensity, std::int32_t arcPieces, const char* outputFile,
                   bool clean, bool keepArcLinks, double arcTolerance, double arcTolerance2,
                   bool autoArcTolerance, bool pointsOnly, bool printCells, const char* cellsFile);

bool VD_IsUpToDate();

// Traces offset curves at distance t (user units) into the offset store, on
// side 1 (left of the segments), 2 (right) or 3 (both); side 0 does nothing
// and succeeds. A t from 0 to 1e-11 selects the automatic distances, a d of
// 1e-11 or less a single distance; otherwise the family t, t + d, ... below
// the maximal offset. False when the diagram is not up to date, when t or d
// is negative or not finite, when d would give more than 100,000 distances,
// or when a curve could not be traced (a broken diagram).
bool VD_ComputeOffsets(std::int32_t side, double t, double d);
// The engine operation behind VD_ComputeOffsets (left and right both false
// mean both sides). Ends the process when the diagram is not up to date.
bool API_ComputeOff(bool timing, const char* outputFile, bool write, bool dxfFormat, double t,
                    double d, bool autoOffset, bool left, bool right);

// Read-out of the offset store. Curves hold their elements contiguously;
// an element runs from its start point to the next element's (the last one
// back to the curve's first), so every curve is closed. Element points are
// in internal coordinates (ToUserCoordinates converts them).
inline constexpr std::int32_t kOffsetLineKind = 0;       // offset of a segment
inline constexpr std::int32_t kOffsetPointArcKind = 2;   // arc about a point site
inline constexpr std::int32_t kOffsetArcInsideKind = 6;  // arc site, inside its circle
inline constexpr std::int32_t kOffsetArcOutsideKind = 7;
std::int32_t GetNumOffsetCurves();
// False (outputs untouched) for an index outside the store.
bool GetOffsetCurve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last);
// `tag` is always -1: the tag belongs to the site (VD_GetPointTag ...).
bool GetOffsetElement(std::int32_t k, std::int32_t& kind, std::int32_t& site, double& x, double& y,
                      std::int32_t& tag);
void ToUserCoordinates(const Point2d& p, double& x, double& y);
// Distance at most kCoincidenceDistance (internal units).
inline constexpr double kCoincidenceDistance = 1e-6;
bool PointsCoincide(const Point2d& a, const Point2d& b);
// Centre of a point site / of an arc site, internal coordinates ((0, 0) for
// an unknown index).
Point2d VD_GetPointCentre(std::int32_t point);
Point2d VD_GetArcCentre(std::int32_t arc);

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
std::int32_t VD_GetArcTag(std::int32_t arc);

}  // namespace zt
