// The result file of a run while it is being written, and its commit.
//
// The result is written under a temporary name beside its final one and
// renamed only when it is complete, closed and on disk (commit_result), so
// the final name only ever holds a complete file. Between guard_result and
// release_result the temporary file is removed by any end of the process
// that lets code run: an exit (a fatal report of the engines or of the
// arrays, a runtime fatal text, a record fault) and the signals that end a
// process by default (SIGTERM, SIGINT, SIGHUP, SIGQUIT, SIGPIPE, SIGALRM,
// SIGXCPU, SIGXFSZ), which then end it as they would have. A signal that
// was ignored when the program started stays ignored. Nothing can run on
// SIGKILL or a power loss: the temporary file may then stay, the final name
// is still absent.
#pragma once

#include <string>

namespace zt::detail {

void guard_result(const std::string& path);
void release_result();

// Flushes the file at `part` to the disk, renames it to `final_path` and
// makes the rename durable. 0, or the system's error code (the files are
// then left as they are).
int commit_result(const std::string& part, const std::string& final_path);

}  // namespace zt::detail
