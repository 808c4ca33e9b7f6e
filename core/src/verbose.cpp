// SPDX-License-Identifier: Apache-2.0
// Verbose mode: its settings, the banner, and the one way that all verbose lines take.
#include <cstdio>
#include <cstring>
#include <string>

#include <sys/utsname.h>

#include "channel.hpp"
#include "settings.hpp"
#include "tarn_serv.h"

namespace {

using namespace tarn::core;

// The processor's name as the system gives it, or its architecture where it gives no name.
std::string processor_name() {
  std::string name;
  if (std::FILE* const info = std::fopen("/proc/cpuinfo", "r")) {
    char line[256];
    while (name.empty() && std::fgets(line, sizeof line, info) != nullptr) {
      const char* const value = std::strstr(line, ": ");
      if (std::strncmp(line, "model name", 10) == 0 && value != nullptr) {
        name.assign(value + 2, std::strcspn(value + 2, "\n"));
      }
    }
    std::fclose(info);
  }
  utsname system{};
  if (name.empty() && ::uname(&system) == 0) {
    name = system.machine;
  }
  return name;
}

const char* interface_name(int iface) {
  switch (iface) {
    case 1:
      return "OpenMP offload";
    case 2:
      return "SYCL";
    default:
      return "host streams";
  }
}

int stdout_lock = 0;  // one line of the console after the other; the file needs none

void print_banner(int iface) {
  std::string line = "TARN_VERBOSE Tarn RNG " TARN_VERSION ", processor: ";
  line.append(processor_name());
  line.append(", threads: ").append(std::to_string(tarn_serv_get_max_threads()));
  line.append(", first interface: ").append(interface_name(iface)).append("\n");
  tarn_serv_print_verbose_text(line.c_str());
}

}  // namespace

int* tarn_serv_verbose_mode(void) {
  static int mode = read(settings::verbose);
  return &mode;
}

const char* tarn_serv_verbose_output_file_mode(void) {
  static const char* const path = read(settings::verbose_output_file);
  return path;
}

void tarn_serv_print_verbose_header(int iface) {
  if (*tarn_serv_verbose_mode() <= 0) {
    return;
  }
  // A second thread waits here until the banner is out, so that its own line comes after it.
  static const bool printed = (print_banner(iface), true);
  static_cast<void>(printed);
}

void tarn_serv_print_verbose_info(double seconds, const char* text) {
  if (*tarn_serv_verbose_mode() <= 0) {
    return;
  }
  tarn_serv_print_verbose_header(0);
  char time[64];
  tarn_serv_format_seconds(time, sizeof time, seconds);
  tarn_serv_print_verbose_line(text, time);
}

void tarn_serv_print_verbose_line(const char* text, const char* times) {
  std::string line = "TARN_VERBOSE ";
  line.append(text).append(" ").append(times).append("\n");
  tarn_serv_print_verbose_text(line.c_str());
}

void tarn_serv_print_verbose_text(const char* text) {
  const char* const path = tarn_serv_verbose_output_file_mode();
  if (*path != '\0') {
    if (std::FILE* const file = std::fopen(path, "a")) {
      tarn_serv_file_format_print(file, "%s", 1, text);
      std::fclose(file);
      return;
    }
    tarn_serv_format_print(channel::warning, "TARN_VERBOSE WARNING: %s\n", 1,
                           "unable to open output file. Print to STDOUT");
  }
  tarn_serv_lock(&stdout_lock);
  tarn_serv_format_print(channel::normal, "%s", 1, text);
  tarn_serv_unlock(&stdout_lock);
}
