// SPDX-License-Identifier: Apache-2.0
// The settings of the core as constants, one for each row of settings.def, and how they are read.
#pragma once

namespace tarn::core {

struct integer_setting {
  const char* name;
  int fallback;
  int lowest;
  int highest;
};

struct text_setting {
  const char* name;
};

namespace settings {
#define TARN_INTEGER_SETTING(id, name, fallback, lowest, highest, words, meaning) \
  inline constexpr integer_setting id{name, fallback, lowest, highest};
#define TARN_TEXT_SETTING(id, name, words, meaning) inline constexpr text_setting id{name};
#include "settings.def"
#undef TARN_INTEGER_SETTING
#undef TARN_TEXT_SETTING
}  // namespace settings

// The value from the environment, or the fallback if the variable is unset or empty. A malformed
// value gives the fallback and one line on standard error; callers read each setting once.
int read(const integer_setting& setting);

// The value from the environment, or an empty text. The copy is never freed, so that it stays
// valid while other libraries shut down.
const char* read(const text_setting& setting);

}  // namespace tarn::core
