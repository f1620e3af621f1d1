// Configuration table records inside one dynamic storage arena. Sections and
// entries are singly linked lists of fixed records; texts are stored strings.
#include "runtime/config_table.hpp"

#include <cstring>
#include <vector>

#include "runtime/detail/platform.hpp"
#include "runtime/diagnostics.hpp"

namespace zt {
namespace {

constexpr std::int64_t kInitialArena = 16 * 1024;

struct SectionRecord {
  std::int32_t name;
  std::int32_t first_entry;
  std::int32_t last_entry;
  std::int32_t next;
};

struct EntryRecord {
  std::int32_t name;
  std::int32_t value;
  std::int32_t file;      // kDsNoHandle: set by the program
  std::int32_t line;
  std::int32_t replaces;  // the older entry its "+" stand for, or kDsNoHandle
  std::int32_t live;      // 0 once a newer entry of the same name replaced it
  std::int32_t next;
};

template <class Record>
Record* record(DynamicStorage* ds, std::int32_t handle) {
  return static_cast<Record*>(ds_deref(ds, handle));
}

}  // namespace

ConfigTable::ConfigTable() : ds_(ds_create(kInitialArena)) {}

ConfigTable::~ConfigTable() { ds_destroy(ds_); }

void ConfigTable::clear() {
  ds_destroy(ds_);
  ds_ = ds_create(kInitialArena);
  first_section_ = kDsNoHandle;
}

const char* ConfigTable::text(std::int32_t handle) const {
  const char* p = static_cast<const char*>(ds_deref(ds_, handle));
  return p ? p : "";
}

std::int32_t ConfigTable::find_section(std::string_view section) const {
  for (std::int32_t h = first_section_; h >= 0;) {
    const SectionRecord* s = record<SectionRecord>(ds_, h);
    if (section == text(s->name)) return h;
    h = s->next;
  }
  return kDsNoHandle;
}

std::int32_t ConfigTable::add_section(std::string_view section) {
  const std::int32_t name = ds_store_string(ds_, section);
  const std::int32_t h = ds_reserve(ds_, sizeof(SectionRecord));
  if (name < 0 || h < 0) return kDsNoHandle;
  *record<SectionRecord>(ds_, h) = SectionRecord{name, kDsNoHandle, kDsNoHandle, kDsNoHandle};
  if (first_section_ < 0) {
    first_section_ = h;
  } else {
    std::int32_t last = first_section_;
    while (record<SectionRecord>(ds_, last)->next >= 0) last = record<SectionRecord>(ds_, last)->next;
    record<SectionRecord>(ds_, last)->next = h;
  }
  return h;
}

std::int32_t ConfigTable::find_live_entry(std::int32_t section, std::string_view name,
                                          bool exact) const {
  std::int32_t found = kDsNoHandle;
  for (std::int32_t h = record<SectionRecord>(ds_, section)->first_entry; h >= 0;) {
    const EntryRecord* e = record<EntryRecord>(ds_, h);
    const char* n = text(e->name);
    if (e->live && (exact ? name == n : detail::equals_ignoring_case(name, n))) found = h;
    h = e->next;
  }
  return found;
}

bool ConfigTable::add_entry(std::string_view section, std::string_view name,
                            std::string_view value, std::string_view file, std::int32_t line) {
  if (ds_ == nullptr || section.size() > kMaxSectionName) return false;
  std::int32_t s = find_section(section);
  if (s < 0) s = add_section(section);
  if (s < 0) return false;
  const std::int32_t older = find_live_entry(s, name, /*exact=*/true);
  const std::int32_t n = ds_store_string(ds_, name);
  const std::int32_t v = ds_store_string(ds_, value);
  const std::int32_t f = line == kSetByProgram ? kDsNoHandle : ds_store_string(ds_, file);
  const std::int32_t h = ds_reserve(ds_, sizeof(EntryRecord));
  if (n < 0 || v < 0 || h < 0 || (line != kSetByProgram && f < 0)) return false;
  *record<EntryRecord>(ds_, h) = EntryRecord{n, v, f, line, older, 1, kDsNoHandle};
  if (older >= 0) record<EntryRecord>(ds_, older)->live = 0;
  SectionRecord* sec = record<SectionRecord>(ds_, s);
  if (sec->last_entry < 0) {
    sec->first_entry = h;
  } else {
    record<EntryRecord>(ds_, sec->last_entry)->next = h;
  }
  sec->last_entry = h;
  return true;
}

bool ConfigTable::has_section(std::string_view section) const {
  return ds_ != nullptr && find_section(section) >= 0;
}

std::string ConfigTable::origin_of(std::int32_t entry) const {
  const EntryRecord* e = record<EntryRecord>(ds_, entry);
  if (e->file < 0) return "set by program";
  return format_text("from '%s' line %d", text(e->file), e->line);
}

std::string ConfigTable::resolve(std::int32_t entry) const {
  // The chain of replaced entries, resolved from the oldest up, so that a long
  // chain needs neither recursion nor repeated work.
  std::vector<std::int32_t> chain;
  for (std::int32_t h = entry; h >= 0; h = record<EntryRecord>(ds_, h)->replaces) chain.push_back(h);
  std::string older;
  for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
    const EntryRecord e = *record<EntryRecord>(ds_, *it);
    const std::string_view raw = text(e.value);
    std::string out;
    for (std::size_t i = 0; i < raw.size(); ++i) {
      if (raw[i] != '+') {
        out.push_back(raw[i]);
      } else if (i + 1 < raw.size() && raw[i + 1] == '+') {
        out.push_back('+');
        ++i;
      } else if (e.replaces >= 0) {  // otherwise nothing to refer to: dropped
        diagnose_trace(format_text("   %08X -> %s ", static_cast<unsigned>(e.replaces),
                                   origin_of(e.replaces).c_str()));
        if (out.size() + older.size() > kMaxResolvedValue) {
          diagnose_warning(format_text("configuration entry '%s': value longer than %zu bytes, cut",
                                       text(e.name), kMaxResolvedValue));
          return out;
        }
        out += older;
      }
    }
    older = std::move(out);
  }
  return older;
}

std::int32_t ConfigTable::lookup(std::string_view section, std::string_view name) const {
  if (ds_ == nullptr) return -1;
  const std::int32_t s = find_section(section);
  return s < 0 ? -1 : find_live_entry(s, name, /*exact=*/false);
}

std::optional<std::string> ConfigTable::value(std::string_view section,
                                              std::string_view name) const {
  const std::int32_t e = lookup(section, name);
  if (e < 0) return std::nullopt;
  return resolve(e);
}

std::optional<std::string> ConfigTable::origin(std::string_view section,
                                               std::string_view name) const {
  const std::int32_t e = lookup(section, name);
  if (e < 0) return std::nullopt;
  return origin_of(e);
}

}  // namespace zt
