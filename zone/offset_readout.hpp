// Read-out of the engine's offset store into a VD_OffsetHandler.
//
// Promises: initOutput once with the number of curves, then per curve, in
// store order, initCurve, one write call per element of a known kind and
// endCurve with the running totals of lines and arcs since the start of the
// read-out, then endOutput. Every point handed over is in user coordinates;
// whether an element is too short to be an arc is decided on the engine's
// internal coordinates.
#pragma once

#include "zone/offset_engine.hpp"
#include "zone/offset_handler.hpp"

namespace zt {

// Offset element kinds of the engine's store.
inline constexpr std::int32_t kElementLine = 0;
inline constexpr std::int32_t kElementPointArc = 2;
inline constexpr std::int32_t kElementArcInside = 6;   // counter-clockwise
inline constexpr std::int32_t kElementArcOutside = 7;  // clockwise

void emit_offsets(VD_OffsetHandler& handler);
void emit_offsets(OffsetEngine& engine, VD_OffsetHandler& handler);

}  // namespace zt
