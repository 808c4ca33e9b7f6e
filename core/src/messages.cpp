// SPDX-License-Identifier: Apache-2.0
// Prints numbered messages, and formatted text for other libraries.
#include <cstdarg>
#include <cstdio>

#include "channel.hpp"
#include "tarn_serv.h"

namespace {

struct message {
  int number;
  const char* text;
  int holes;
};

// Counts the values that a text takes; any hole other than %s counts as -1.
constexpr int count_holes(const char* text) {
  int holes = 0;
  for (; *text != '\0'; ++text) {
    if (*text == '%') {
      if (*++text != 's') {
        return -1;
      }
      ++holes;
    }
  }
  return holes;
}

constexpr message messages[] = {
#define TARN_MESSAGE(number, text) {number, "Tarn: " text "\n", count_holes(text)},
#include "messages.def"
#undef TARN_MESSAGE
};

#define TARN_MESSAGE(number, text) \
  static_assert(count_holes(text) >= 0, "message " #number " takes texts only");
#include "messages.def"
#undef TARN_MESSAGE

const message* find(int number) {
  for (const message& row : messages) {
    if (row.number == number) {
      return &row;
    }
  }
  return nullptr;
}

// Flushed at once: a message often comes just before the process ends.
void print_whole(std::FILE* file, const char* format, std::va_list values) {
  std::vfprintf(file, format, values);
  std::fflush(file);
}

}  // namespace

void tarn_serv_print(int channel, int message_id, int count, ...) {
  std::FILE* const file = tarn::core::stream_of(channel);
  const message* const row = find(message_id);
  if (row == nullptr) {
    std::fprintf(file, "Tarn: message %d (no text is known for this number)\n", message_id);
    std::fflush(file);
    return;
  }
  if (row->holes != count) {
    std::fprintf(file, "Tarn: message %d (given %d values, but it takes %d)\n", message_id, count,
                 row->holes);
    std::fflush(file);
    return;
  }
  std::va_list values;
  va_start(values, count);
  print_whole(file, row->text, values);
  va_end(values);
}

void tarn_serv_format_print(int channel, const char* format, int count, ...) {
  std::va_list values;
  va_start(values, count);
  print_whole(tarn::core::stream_of(channel), format, values);
  va_end(values);
}

void tarn_serv_file_format_print(FILE* file, const char* format, int count, ...) {
  std::va_list values;
  va_start(values, count);
  print_whole(file, format, values);
  va_end(values);
}
