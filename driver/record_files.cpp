// File operations by suite name on logical units.
#include "driver/record_files.hpp"

#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <sys/stat.h>

#include "driver/fatal_stop.hpp"
#include "driver/logical_units.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_stream.hpp"
#include "runtime/path_expansion.hpp"

namespace zt {

namespace {

std::string trimmed_name(const char* name, std::int32_t length) {
  if (name == nullptr || length <= 0) return {};
  std::string s(name, static_cast<std::size_t>(length));
  while (!s.empty() && (s.back() == ' ' || s.back() == '\0')) s.pop_back();
  return s;
}

// Expands with the existence test; out is "" when nothing usable came back.
std::int32_t expand_existing_name(const char* name, std::int32_t length, std::string& out) {
  char buffer[kNameCapacity] = {};
  std::int32_t status = kExpandInvalid;
  expand_existing(name, length, buffer, kNameCapacity, status);
  const bool usable = status == kExpandOk || status == kExpandNotFound || status == kExpandUndefined;
  out = usable ? std::string(buffer) : std::string();
  return status;
}

bool path_exists(const std::string& path) {
  struct stat st {};
  return !path.empty() && ::stat(path.c_str(), &st) == 0;
}

}  // namespace

void file_exists(const char* name, const std::int32_t& length, bool& exists) {
  std::string path;
  exists = expand_existing_name(name, length, path) == kExpandOk;
}

void open_unformatted(const std::int32_t& unit, const char* name, const std::int32_t& length,
                      const std::int32_t& mode, std::int32_t& ierr) {
  std::string path;
  ierr = expand_existing_name(name, length, path);
  if (mode == 2) {
    if (path.empty()) {
      record_stop({RecordFault::kUnwritable, trimmed_name(name, length), 0,
                   "the name cannot be expanded (status " + std::to_string(ierr) + ")"});
    }
    std::int32_t deleted = 0;
    delete_file(name, length, deleted);
    attach_record_output(unit, path);
    return;
  }
  if (ierr == kExpandOk) attach_record_input(unit, path);
}

void opensq(const std::int32_t& unit, const char* name, const std::int32_t& length,
            const std::int32_t& mode, std::int32_t& ierr) {
  std::string path;
  expand_existing_name(name, length, path);
  const std::string given = trimmed_name(name, length);
  const std::int32_t how = std::abs(mode);
  if (how < 1 || how > 3) {
    const std::string routine = "opensq(" + given + ")";
    const std::int32_t values[] = {how};
    fatal_stop(routine, {stop_template("mode=%")}, values);
  }

  std::int32_t code = 0;
  if (path.empty()) {
    code = how == 1 ? kOpensqMissing : kOpensqOpenFailed;
  } else {
    const bool existed = path_exists(path);
    if (how == 1 && !existed) {
      code = kOpensqMissing;
    } else if (how == 1) {
      if (!attach_text(unit, path, TextOpen::kRead)) code = kOpensqOpenFailed;
    } else if (how == 2) {
      if (existed && std::remove(path.c_str()) != 0) {
        code = kOpensqDeleteFailed;
      } else if (!attach_text(unit, path, TextOpen::kCreate)) {
        code = kOpensqOpenFailed;
      }
    } else if (!attach_text(unit, path, TextOpen::kAppend)) {
      code = kOpensqOpenFailed;
    }
  }

  ierr = code;
  if (code == 0) return;
  if (mode < 0) {
    const std::int32_t values[] = {how, code};
    fatal_stop("opensq", {stop_template("Fichier "), stop_inserted(given),
                          stop_template(" iomode= %, err= %")},
               values);
  }
  close_unit(unit);
}

}  // namespace zt
