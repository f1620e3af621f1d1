// User texts by number from the suite's plain-text message files.
//
// Text n of a file is its n-th line (blank lines count), cut to
// kMessageWidth characters. Each file is loaded once per process, also when
// it is missing; a number without a text gives the not-found text
//   No text in file "NAME" at line N
// with "(file not found)" after N when the file could not be loaded.
// At most kMaxMessageFiles files and kMaxMessageLines lines in all are
// loaded; beyond that the program ends with a fatal stop that says so.
#pragma once

#include <cstdint>
#include <string>

namespace zt {

inline constexpr std::int32_t kMaxMessageFiles = 10;
inline constexpr std::int32_t kMaxMessageLines = 1000;
inline constexpr std::int32_t kMessageWidth = 70;
inline constexpr std::int32_t kMessageNameWidth = 200;

// The general message file and its twin, expanded on first use.
inline constexpr const char* kGeneralMessageFile = "?TXT/textg.$KVLLANG";
inline constexpr const char* kTwinMessageFile = "?TXT/texte.$KVLLANG";

// Text n of the named file into buffer (cut or blank-padded to its length);
// length = the text's length without trailing blanks.
void chtext(const char* name, const std::int32_t& name_length, const std::int32_t& n, char* buffer,
            const std::int32_t& buffer_length, std::int32_t& length);
// chtext on the general message file.
void message_text(const std::int32_t& n, char* buffer, const std::int32_t& buffer_length,
                  std::int32_t& length);
// chtext on the twin message file.
void message_text_e(const std::int32_t& n, char* buffer, const std::int32_t& buffer_length,
                    std::int32_t& length);

// C++ convenience: text n of the file, without trailing blanks.
std::string chtext(const std::string& name, std::int32_t n);

}  // namespace zt
