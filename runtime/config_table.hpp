// The configuration table: named sections of NAME = value entries, loaded
// from the suite's environ.cfg files and kept in dynamic storage.
//
// Promises: sections are matched exactly; an entry added under the exact name
// of an existing entry of its section replaces it for lookups while the old
// one is kept, so that each single "+" of the new value stands for the old
// value ("++" is one literal "+"; a "+" with nothing before it is dropped);
// lookups match entry names without regard to case and return the newest
// live entry. Every entry remembers its origin (file and line, or the program).
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "runtime/dynamic_storage.hpp"

namespace zt {

inline constexpr std::size_t kMaxSectionName = 99;  // section names are shorter than 100
inline constexpr std::int32_t kSetByProgram = -1;    // origin line of program-set entries
// A value whose "+" references would grow beyond this is cut (with a warning).
inline constexpr std::size_t kMaxResolvedValue = 1u << 20;

class ConfigTable {
 public:
  ConfigTable();
  ~ConfigTable();
  ConfigTable(const ConfigTable&) = delete;
  ConfigTable& operator=(const ConfigTable&) = delete;

  // False when the storage could not be had (the table then stays empty).
  bool usable() const { return ds_ != nullptr; }

  // Adds or replaces an entry; `file` empty and line kSetByProgram for entries
  // the program sets. False on storage exhaustion or a too long section name.
  bool add_entry(std::string_view section, std::string_view name, std::string_view value,
                 std::string_view file, std::int32_t line);
  bool has_section(std::string_view section) const;
  // The entry's value with its "+" references resolved; none when absent.
  std::optional<std::string> value(std::string_view section, std::string_view name) const;
  // "from '<file>' line <n>" or "set by program"; none when absent.
  std::optional<std::string> origin(std::string_view section, std::string_view name) const;

  void clear();

 private:
  std::int32_t find_section(std::string_view section) const;
  std::int32_t add_section(std::string_view section);
  std::int32_t find_live_entry(std::int32_t section, std::string_view name, bool exact) const;
  // The live entry that value() and origin() read, or -1 when there is none.
  std::int32_t lookup(std::string_view section, std::string_view name) const;
  std::string resolve(std::int32_t entry) const;
  std::string origin_of(std::int32_t entry) const;
  const char* text(std::int32_t handle) const;

  DynamicStorage* ds_ = nullptr;
  std::int32_t first_section_ = kDsNoHandle;
};

}  // namespace zt
