// Running the built programs from tests: a shell command's exit status and
// standard output, and where the programs live in the build tree.
#pragma once

#include <sys/wait.h>

#include <cstdio>
#include <string>

namespace zt::test {

struct CommandRun {
  int status;  // the exit status; -1 when the command could not start or died of a signal
  std::string out;
};

inline std::string zonetool_path() { return std::string(ZT_BINARY_DIR) + "/tools/zonetool/zonetool"; }

// Runs `command` through the shell and collects its standard output.
inline CommandRun run_command(const std::string& command) {
  CommandRun r{-1, ""};
  FILE* p = ::popen(command.c_str(), "r");
  if (!p) return r;
  char buf[4096];
  for (std::size_t n; (n = std::fread(buf, 1, sizeof buf, p)) > 0;) r.out.append(buf, n);
  const int st = ::pclose(p);
  r.status = WIFEXITED(st) ? WEXITSTATUS(st) : -1;
  return r;
}

}  // namespace zt::test
