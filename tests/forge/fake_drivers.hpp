// SPDX-License-Identifier: Apache-2.0
// Drivers that follow a script: an OpenCL and a Level Zero with the few calls that forge makes.
// They write down each call and can be made to fail at any of them.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "binaries.hpp"
#include "level_zero_calls.hpp"
#include "opencl_calls.hpp"

namespace tarn_test {

/// What the drivers do, and what has been asked of them. Reset by every test.
struct driver_script {
  // The script.
  bool knows_ip_version = false;
  std::uint32_t ip_version = 0;
  byte_vector binary;              // what compiling gives for the device of the queue
  bool lists_device = true;        // among the program's devices
  std::size_t devices_before = 0;  // other devices that the program lists first
  std::string failing_call;        // name of a call, with the number of its occurrence from 1 on:
  int failing_occurrence = 1;
  std::int32_t failure = 0;

  // The record.
  std::vector<std::string> calls;
  std::vector<std::string> mistakes;  // arguments that are not what they have to be
  std::string source;
  std::string options;
  byte_vector module;
  int programs = 0;  // living programs and modules
};

extern driver_script script;

/// What stands behind the queue, for both drivers.
extern int device_object;
extern int context_object;

extern const kestrel::tarn::forge::opencl_calls fake_opencl;
extern const kestrel::tarn::forge::level_zero_calls fake_level_zero;

}  // namespace tarn_test
