// SPDX-License-Identifier: Apache-2.0
// Writes one of the texts to standard output: c_header, offload_module or host_module.
#include <exception>
#include <iostream>
#include <string>

#include "interfaces.hpp"

int main(int count, char** arguments) try {
  using namespace tarn::interfaces;
  const std::string which = count == 2 ? arguments[1] : "";
  if (which == "c_header") {
    write_c_header(std::cout);
  } else if (which == "offload_module") {
    write_offload_module(std::cout);
  } else if (which == "host_module") {
    write_host_module(std::cout);
  } else {
    std::cerr << "usage: offload_interfaces c_header|offload_module|host_module\n";
    return 2;
  }
  return std::cout.flush() ? 0 : 1;
} catch (const std::exception& failure) {
  std::cerr << "offload_interfaces: " << failure.what() << '\n';
  return 1;
}
