// SPDX-License-Identifier: Apache-2.0
// Writes the inputs that fuzzing starts from: fuzz_seeds TARGET FOLDER. They are binaries as the
// tests build them, in the input form of the target.
#include <cstdio>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

#include "binaries.hpp"
#include "elf_writer.hpp"

namespace {

using namespace tarn_test;

std::vector<byte_vector> older_binaries() {
  older_kernel kernel;
  kernel.kernel_heap = counting(64, 1);
  kernel.patch_list = patch_token(52, counting(12, 201));
  append(kernel.patch_list, patch_token(7, counting(8, 221)));
  kernel.more = counting(21, 241);
  older_kernel oak = kernel;
  oak.core_family = 17;
  oak.kernel_heap = {0x31, 0, 0, 0x80, 0x04, 0, 0, 0, 0x0C, 0, 0x20, 0x30, 0, 0, 0, 0};
  older_kernel small;
  small.name.clear();
  small.kernel_heap.clear();
  small.general_state.clear();
  small.dynamic_state.clear();
  small.surface_state.clear();
  return {older_binary(kernel), older_binary(kernel, header_table::last), older_binary(oak),
          older_binary(small),
          elf_file({{"program", type_program, program_header(kernel)}}, header_table::last)};
}

std::vector<byte_vector> newer_binaries() {
  return {newer_binary({{2, 3080}, {1, 1271}, {3, 0x300}}),
          newer_binary({{1, 1272}, {2, 3078}}),
          newer_binary({}),
          newer_binary(3079, 1U << 15 | 0x0700),
          newer_binary(1271, 0x1F00),
          kestrel::tarn::forge::write_binary(12, "binary_test", "version: 1.8\n", counting(48, 1))};
}

/// In front of a binary: the sizes of the code and of the patches.
byte_vector with_sizes(const byte_vector& binary, std::uint32_t code, std::uint32_t patches) {
  byte_vector input(4);
  put16(input, 0, code);
  put16(input, 2, patches);
  append(input, binary);
  return input;
}

std::vector<byte_vector> seeds_of(const std::string& target) {
  std::vector<byte_vector> seeds;
  if (target == "parse_binary") {
    seeds = older_binaries();
    for (const byte_vector& each : newer_binaries()) {
      seeds.push_back(each);
    }
  } else if (target == "replace_kernel" || target == "splice_kernel") {
    for (const byte_vector& each : older_binaries()) {
      seeds.push_back(with_sizes(each, 192, 0));
      seeds.push_back(with_sizes(each, 193, 20));
    }
    seeds.push_back(with_sizes(newer_binaries().front(), 16, 0));
  } else if (target == "binary_hash") {
    for (std::size_t size = 0; size < 10; ++size) {
      seeds.push_back(counting(size, 0xF0));
    }
  } else if (target == "write_binary") {
    seeds = {{11, 20, 0x08, 0x0C}, {0, 0, 12, 0}};
    append(seeds[0], counting(100, 'a'));
  }
  return seeds;
}

}  // namespace

int main(int count, char** arguments) {
  const std::vector<byte_vector> seeds =
      count == 3 ? seeds_of(arguments[1]) : std::vector<byte_vector>();
  int number = 0;
  for (const byte_vector& each : seeds) {
    std::ofstream file(std::string(arguments[2]) + "/" + std::to_string(number++),
                       std::ios::binary);
    file.write(reinterpret_cast<const char*>(each.data()),
               static_cast<std::streamsize>(each.size()));
    if (!file) {
      std::fprintf(stderr, "fuzz_seeds: cannot write below %s\n", arguments[2]);
      return 1;
    }
  }
  if (seeds.empty()) {
    std::fprintf(stderr, "usage: fuzz_seeds TARGET FOLDER\n");
    return 1;
  }
  return 0;
}
