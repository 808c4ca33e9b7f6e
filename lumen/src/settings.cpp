// SPDX-License-Identifier: Apache-2.0
// Reading the environment variables.
#include "settings.hpp"

#include <cstdio>
#include <cstdlib>
#include <thread>

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// A decimal number of at most 9 digits; 0 for anything else.
std::uint32_t parse_number(const std::string& text) {
  if (text.empty() || text.size() > 9 ||
      text.find_first_not_of("0123456789") != std::string::npos) {
    return 0;
  }
  return static_cast<std::uint32_t>(std::strtoul(text.c_str(), nullptr, 10));
}

// Cuts the text at a separator and remembers where each piece began.
struct piece {
  std::string text;
  std::size_t column;
};
std::vector<piece> split(const piece& whole, char separator) {
  std::vector<piece> pieces;
  std::size_t begin = 0;
  for (;;) {
    const std::size_t end = whole.text.find(separator, begin);
    pieces.push_back({whole.text.substr(begin, end - begin), whole.column + begin});
    if (end == std::string::npos) {
      return pieces;
    }
    begin = end + 1;
  }
}

// Reads one setting into the device; the error, if any, with its column.
bool read_setting(const piece& part, virtual_device_setting& device, virtual_device_parse& result) {
  const auto fail = [&result](const std::string& text, std::size_t column) {
    result.error = text;
    result.column = column;
    return false;
  };
  const std::size_t equals = part.text.find('=');
  const std::string name = part.text.substr(0, equals);
  if (name != "compute_units" && name != "max_work_group_size" && name != "memory") {
    return fail("unknown setting '" + name + "'", part.column);
  }
  if (equals == std::string::npos) {
    return fail("setting '" + name + "' has no value", part.column + name.size());
  }
  if (name == "memory") {
    if (part.text.substr(equals + 1) != "own") {
      return fail("'memory' takes the value own", part.column + equals + 1);
    }
    if (device.own_memory) {
      return fail("setting 'memory' is given twice", part.column);
    }
    device.own_memory = true;
    return true;
  }
  const bool units = name == "compute_units";
  const std::uint32_t limit = units ? 65536 : 4096;
  const std::uint32_t value = parse_number(part.text.substr(equals + 1));
  if (value == 0 || value > limit) {
    return fail("'" + name + "' takes a number from 1 to " + std::to_string(limit),
                part.column + equals + 1);
  }
  if (units ? device.compute_units != 0 : device.max_work_group_size != 0) {
    return fail("setting '" + name + "' is given twice", part.column);
  }
  if (units) {
    device.compute_units = value;
  } else {
    device.max_work_group_size = value;
  }
  return true;
}

}  // namespace

unsigned number_of_threads() {
  static const unsigned number = [] {
    if (const char* text = std::getenv("LUMEN_NUM_THREADS")) {
      const std::uint32_t wanted = parse_number(text);
      if (wanted >= 1 && wanted <= 4096) {
        return wanted;
      }
      std::fprintf(stderr,
                   "lumen: LUMEN_NUM_THREADS: column 1: '%s' is not a number from 1 to 4096; "
                   "the variable is ignored\n",
                   text);
    }
    const unsigned hardware = std::thread::hardware_concurrency();
    return hardware == 0 ? 1U : hardware;
  }();
  return number;
}

virtual_device_parse parse_virtual_devices(const std::string& text) {
  virtual_device_parse result;
  for (const piece& item : split({text, 1}, ';')) {
    const std::vector<piece> parts = split(item, ',');
    virtual_device_setting device;
    const std::string& kind = parts[0].text;
    if (kind != "gpu" && kind != "accelerator") {
      result.error = kind.empty() ? "a device kind is missing" : "unknown kind '" + kind + "'";
      result.column = parts[0].column;
    }
    device.is_gpu = kind == "gpu";
    for (std::size_t i = 1; i < parts.size() && result.error.empty(); ++i) {
      read_setting(parts[i], device, result);
    }
    if (!result.error.empty()) {
      result.devices.clear();
      return result;
    }
    result.devices.push_back(device);
  }
  return result;
}

const std::vector<virtual_device_setting>& virtual_devices_from_environment() {
  static const auto& devices = *new std::vector<virtual_device_setting>([] {
    const char* text = std::getenv("LUMEN_VIRTUAL_DEVICES");
    if (text == nullptr || *text == '\0' || !backends_from_environment().virtual_devices) {
      return std::vector<virtual_device_setting>();
    }
    virtual_device_parse result = parse_virtual_devices(text);
    if (!result.error.empty()) {
      std::fprintf(stderr,
                   "lumen: LUMEN_VIRTUAL_DEVICES: column %zu: %s; no virtual device is made\n",
                   result.column, result.error.c_str());
    }
    return std::move(result.devices);
  }());
  return devices;
}

backend_parse parse_backends(const std::string& text) {
  backend_parse result;
  if (text.empty()) {
    return result;
  }
  for (const piece& name : split({text, 1}, ';')) {
    if (name.text == "virtual") {
      result.choice.virtual_devices = true;
    } else if (name.text == "cuda") {
      result.choice.cuda = true;
    } else if (name.text == "opencl") {
      result.choice.opencl = true;
    } else if (name.text == "level_zero") {
      result.choice.level_zero = true;
    } else {
      return {{}, "unknown backend '" + name.text + "'", name.column};
    }
  }
  return result;
}

backend_choice backends_from_environment() {
  static const backend_choice choice = [] {
    constexpr backend_choice all{true, true, true, true};
    const char* text = std::getenv("LUMEN_BACKENDS");
    if (text == nullptr) {
      return all;
    }
    const backend_parse result = parse_backends(text);
    if (!result.error.empty()) {
      std::fprintf(stderr, "lumen: LUMEN_BACKENDS: column %zu: %s; the variable is ignored\n",
                   result.column, result.error.c_str());
      return all;
    }
    return result.choice;
  }();
  return choice;
}

bool cuda_shared_is_managed() {
  static const bool managed = [] {
    const char* text = std::getenv("LUMEN_CUDA_SHARED");
    if (text == nullptr || std::string(text) == "pinned") {
      return false;
    }
    if (std::string(text) == "managed") {
      return true;
    }
    std::fprintf(stderr,
                 "lumen: LUMEN_CUDA_SHARED: column 1: '%s' is neither pinned nor managed; the "
                 "variable is ignored\n",
                 text);
    return false;
  }();
  return managed;
}

}  // namespace detail
LUMEN_NAMESPACE_END
