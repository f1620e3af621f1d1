// Debug printers of the diagram (standard output, flushed after each).
// Their texts are read by people comparing runs, so they are kept exactly.
#pragma once

#include <cstdint>

namespace zt::vd {

void PrintEdge(const char* label, std::int32_t e);
void PrintNode(const char* label, std::int32_t n);
// Every node and edge, then the summary of counts.
void PrintDiagram(const char* where);
void PrintSummary();

}  // namespace zt::vd
