// Test access to the process-wide message tables.
#pragma once

namespace zt::detail {

// Forgets every loaded message file and the remembered expansions of the
// fixed files, as at process start.
void reset_message_tables();

}  // namespace zt::detail
