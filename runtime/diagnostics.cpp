// Default diagnostic handlers and their routing switches.
#include "runtime/diagnostics.hpp"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "runtime/path_expansion.hpp"

namespace zt {
namespace {

bool g_quiet = false;
bool g_all_to_stdout = false;

bool verbose_mode() {
  const char* v = std::getenv("KVL_KVLFILES_VERBOSE");
  return v != nullptr && std::strcmp(v, "off") != 0;
}

std::FILE* message_stream() {
  return (verbose_mode() || g_all_to_stdout) ? stdout : stderr;
}

void print_line(std::FILE* stream, const char* text) {
  std::fputs(text, stream);
  std::fputc('\n', stream);
  std::fflush(stream);
}

void default_fatal(const char* text) {
  print_line(message_stream(), text);
  std::fflush(nullptr);
  std::exit(-1);
}

void default_warning(const char* text) {
  if (g_quiet && !verbose_mode()) return;
  print_line(message_stream(), text);
}

void default_trace(const char* text) {
  if (verbose_mode()) print_line(stdout, text);
}

DiagnosticHandler g_fatal = default_fatal;
DiagnosticHandler g_warning = default_warning;
DiagnosticHandler g_trace = default_trace;

DiagnosticHandler swap_handler(DiagnosticHandler& slot, DiagnosticHandler h,
                               DiagnosticHandler fallback) {
  DiagnosticHandler previous = slot;
  slot = h ? h : fallback;
  return previous;
}

}  // namespace

DiagnosticHandler set_fatal_handler(DiagnosticHandler h) {
  return swap_handler(g_fatal, h, default_fatal);
}
DiagnosticHandler set_warning_handler(DiagnosticHandler h) {
  return swap_handler(g_warning, h, default_warning);
}
DiagnosticHandler set_trace_handler(DiagnosticHandler h) {
  return swap_handler(g_trace, h, default_trace);
}

void set_diagnostics_quiet(bool quiet) { g_quiet = quiet; }
void set_diagnostics_to_stdout(bool all_to_stdout) { g_all_to_stdout = all_to_stdout; }

void diagnose_fatal(const std::string& text) { g_fatal(text.c_str()); }
void diagnose_warning(const std::string& text) { g_warning(text.c_str()); }
void diagnose_trace(const std::string& text) { g_trace(text.c_str()); }

std::string format_text(const char* format, ...) {
  va_list args;
  va_start(args, format);
  va_list copy;
  va_copy(copy, args);
  const int n = std::vsnprintf(nullptr, 0, format, copy);
  va_end(copy);
  std::string out;
  if (n > 0) {
    out.resize(static_cast<std::size_t>(n) + 1);
    std::vsnprintf(out.data(), out.size(), format, args);
    out.resize(static_cast<std::size_t>(n));
  }
  va_end(args);
  return out;
}

}  // namespace zt
