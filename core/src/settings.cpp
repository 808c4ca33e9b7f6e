// SPDX-License-Identifier: Apache-2.0
// Reads settings from the environment, and prints their table.
#include "settings.hpp"

#include <charconv>
#include <cstdlib>
#include <cstring>
#include <string>
#include <system_error>

#include "channel.hpp"
#include "tarn_serv.h"

namespace tarn::core {

int read(const integer_setting& setting) {
  const char* const text = std::getenv(setting.name);
  if (text == nullptr || *text == '\0') {
    return setting.fallback;
  }
  const char* const end = text + std::strlen(text);
  int value = 0;
  const auto [stop, error] = std::from_chars(text, end, value);
  if (error == std::errc{} && stop == end && value >= setting.lowest && value <= setting.highest) {
    return value;
  }
  std::fprintf(stderr,
               "Tarn: %s is set to '%s', which is not an integer from %d to %d; the default is "
               "taken\n",
               setting.name, text, setting.lowest, setting.highest);
  return setting.fallback;
}

const char* read(const text_setting& setting) {
  const char* const text = std::getenv(setting.name);
  if (text == nullptr) {
    return "";
  }
  const char* const copy = ::strdup(text);
  return copy != nullptr ? copy : "";
}

}  // namespace tarn::core

void tarn_serv_print_settings(int channel) {
  std::string table = "| Variable | Default | Meaning |\n|---|---|---|\n";
  const auto add_row = [&table](const char* name, const char* words, const char* meaning) {
    table.append("| `").append(name).append("` | ").append(words);
    table.append(" | ").append(meaning).append(" |\n");
  };
#define TARN_INTEGER_SETTING(id, name, fallback, lowest, highest, words, meaning) \
  add_row(name, words, meaning);
#define TARN_TEXT_SETTING(id, name, words, meaning) add_row(name, words, meaning);
#include "settings.def"
#undef TARN_INTEGER_SETTING
#undef TARN_TEXT_SETTING
  std::fputs(table.c_str(), tarn::core::stream_of(channel));
}
