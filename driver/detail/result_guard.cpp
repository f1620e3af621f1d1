// Removal of a half-written result at process exit or on a signal, and the
// commit of a complete one.
#include "driver/detail/result_guard.hpp"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace zt::detail {

namespace {

// The signal handler can only use what is async-signal-safe: a fixed buffer
// and a flag, never the std::string.
constexpr std::size_t kPendingCapacity = 4096;
char g_pending[kPendingCapacity];
volatile std::sig_atomic_t g_guarded = 0;

constexpr int kEndingSignals[] = {SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGPIPE, SIGALRM, SIGXCPU, SIGXFSZ};

std::string& pending() {
  // Never destroyed: the exit handler may run after static destructors.
  static std::string* path = new std::string;
  return *path;
}

void discard_pending() {
  if (!pending().empty()) std::remove(pending().c_str());
}

extern "C" void discard_and_end(int sig) {
  const int saved = errno;
  if (g_guarded) ::unlink(g_pending);
  g_guarded = 0;
  errno = saved;
  // The handler was installed with SA_RESETHAND: once it returns, the
  // signal raised here ends the process the default way.
  ::raise(sig);
}

void install_handlers() {
  for (int sig : kEndingSignals) {
    struct sigaction old {};
    if (::sigaction(sig, nullptr, &old) != 0 || old.sa_handler == SIG_IGN) continue;
    struct sigaction act {};
    act.sa_handler = discard_and_end;
    sigfillset(&act.sa_mask);
    act.sa_flags = SA_RESETHAND;
    ::sigaction(sig, &act, nullptr);
  }
}

}  // namespace

void guard_result(const std::string& path) {
  static const bool registered = std::atexit(discard_pending) == 0;
  (void)registered;
  static const bool handled = (install_handlers(), true);
  (void)handled;
  pending() = path;
  g_guarded = 0;
  if (path.size() < kPendingCapacity) {
    std::memcpy(g_pending, path.c_str(), path.size() + 1);
    g_guarded = 1;
  }
}

void release_result() {
  g_guarded = 0;
  pending().clear();
}

int commit_result(const std::string& part, const std::string& final_path) {
  // The data first, then the name: after a power loss the final name holds
  // the whole file or nothing.
  const int fd = ::open(part.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return errno;
  const int synced = ::fsync(fd) == 0 ? 0 : errno;
  ::close(fd);
  if (synced != 0) return synced;
  if (std::rename(part.c_str(), final_path.c_str()) != 0) return errno;
  const std::string::size_type slash = final_path.find_last_of('/');
  const std::string dir = slash == std::string::npos ? "." : slash == 0 ? "/" : final_path.substr(0, slash);
  const int dfd = ::open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (dfd >= 0) {
    ::fsync(dfd);  // best effort: the rename itself has been done
    ::close(dfd);
  }
  return 0;
}

}  // namespace zt::detail
