// SPDX-License-Identifier: Apache-2.0
// Makers of device binaries.
#include "binaries.hpp"

#include <cstddef>
#include <cstring>

namespace tarn_test {
namespace {

void put(byte_vector& bytes, std::size_t at, std::uint64_t value, std::size_t width) {
  for (std::size_t i = 0; i < width; ++i) {
    bytes.at(at + i) = static_cast<std::uint8_t>(value >> (8 * i));
  }
}

std::uint64_t get(const byte_vector& bytes, std::size_t at, std::size_t width) {
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < width; ++i) {
    value |= std::uint64_t{bytes.at(at + i)} << (8 * i);
  }
  return value;
}

void append32(byte_vector& bytes, std::uint64_t value) {
  bytes.resize(bytes.size() + 4);
  put(bytes, bytes.size() - 4, value, 4);
}

void append_text(byte_vector& bytes, const std::string& text, bool with_nul) {
  append(bytes, byte_vector(text.begin(), text.end()));
  bytes.resize(bytes.size() + (with_nul ? 1 : 0));
}

void align(byte_vector& bytes, std::size_t alignment) {
  bytes.resize((bytes.size() + alignment - 1) / alignment * alignment);
}

std::int64_t below_2_32(std::int64_t value) {
  const std::int64_t modulus = std::int64_t{1} << 32;
  return ((value % modulus) + modulus) % modulus;
}

std::int64_t times_2(std::int64_t value, int power) {
  return below_2_32(value % (std::int64_t{1} << (32 - power)) * (std::int64_t{1} << power));
}

/// One round on {a, b, c}.
void model_mix(std::int64_t (&state)[3], std::int64_t p) {
  std::int64_t t[10] = {0, (state[2] >> 13) ^ p, 0, 0, 0, 0, 0, 0, 0, 0};
  const std::int64_t before[2] = {state[1], state[2]};
  const int shifts[10] = {0, 0, 8, -13, -12, 16, -5, -3, 10, -15};  // left, or right if negative
  for (int i = 2; i < 10; ++i) {
    const std::int64_t first = i == 2 ? before[0] : i == 3 ? before[1] : t[i - 3];
    const std::int64_t second = i == 2 ? before[1] : t[i - 2];
    const std::int64_t shifted =
        shifts[i] > 0 ? times_2(t[i - 1], shifts[i]) : t[i - 1] >> -shifts[i];
    t[i] = shifted ^ below_2_32(first - second - t[i - 1]);
  }
  state[0] = t[7];
  state[1] = t[8];
  state[2] = t[9];
}

}  // namespace

void put16(byte_vector& bytes, std::size_t at, std::uint32_t value) {
  put(bytes, at, value, 2);
}
void put32(byte_vector& bytes, std::size_t at, std::uint64_t value) {
  put(bytes, at, value, 4);
}
void put64(byte_vector& bytes, std::size_t at, std::uint64_t value) {
  put(bytes, at, value, 8);
}
std::uint64_t get16(const byte_vector& bytes, std::size_t at) {
  return get(bytes, at, 2);
}
std::uint64_t get32(const byte_vector& bytes, std::size_t at) {
  return get(bytes, at, 4);
}
std::uint64_t get64(const byte_vector& bytes, std::size_t at) {
  return get(bytes, at, 8);
}

void append(byte_vector& bytes, const byte_vector& more) {
  bytes.insert(bytes.end(), more.begin(), more.end());
}

byte_vector cut(const byte_vector& bytes, std::size_t begin, std::size_t end) {
  byte_vector part;
  for (std::size_t at = begin; at < end; ++at) {
    part.push_back(bytes.at(at));
  }
  return part;
}

byte_vector counting(std::size_t count, std::uint8_t first) {
  byte_vector bytes(count);
  for (std::size_t i = 0; i < count; ++i) {
    bytes[i] = static_cast<std::uint8_t>(first + i);
  }
  return bytes;
}

byte_vector elf_file(const std::vector<elf_section>& sections, header_table table) {
  const std::size_t count = sections.size() + 2;
  byte_vector headers(count * 64);
  byte_vector file(table == header_table::first ? 64 + headers.size() : 64);
  byte_vector names(1);
  for (std::size_t i = 1; i < count; ++i) {
    const bool is_names = i == count - 1;
    put32(headers, i * 64, names.size());
    append_text(names, is_names ? ".shstrtab" : sections[i - 1].name, true);
    align(file, 16);
    const byte_vector& data = is_names ? names : sections[i - 1].data;
    put32(headers, i * 64 + at_sh_type, is_names ? type_strings : sections[i - 1].type);
    put64(headers, i * 64 + at_sh_offset, file.size());
    put64(headers, i * 64 + at_sh_size, data.size());
    append(file, data);
  }
  align(file, 16);
  const byte_vector magic = {0x7F, 'E', 'L', 'F', 2, 1, 1};
  std::memcpy(file.data(), magic.data(), magic.size());
  put16(file, at_e_type, 1);
  put32(file, 20, 1);  // version
  put64(file, at_e_shoff, table == header_table::first ? 64 : file.size());
  put16(file, 52, 64);  // size of this header
  put16(file, at_e_shentsize, 64);
  put16(file, at_e_shnum, static_cast<std::uint32_t>(count));
  put16(file, 62, static_cast<std::uint32_t>(count - 1));
  if (table == header_table::first) {
    std::memcpy(&file[64], headers.data(), headers.size());
  } else {
    append(file, headers);
  }
  return file;
}

std::size_t section_at(const byte_vector& file, std::size_t index) {
  return get64(file, at_e_shoff) + index * 64;
}

std::size_t data_at(const byte_vector& file, std::size_t index) {
  return get64(file, section_at(file, index) + at_sh_offset);
}

byte_vector note_data(const std::vector<note>& notes) {
  byte_vector data;
  for (const note& each : notes) {
    append32(data, each.name.size() + 1);
    append32(data, 4);
    append32(data, each.type);
    append_text(data, each.name, true);
    align(data, 4);
    append32(data, each.value);
  }
  return data;
}

byte_vector newer_binary(std::uint32_t machine, std::uint32_t flags) {
  byte_vector file = elf_file({{".ze_info", type_metadata, counting(40, 32)}});
  put16(file, at_e_machine, machine);
  put32(file, at_e_flags, flags);
  return file;
}

byte_vector newer_binary(const std::vector<note>& notes) {
  byte_vector file = elf_file({{".ze_info", type_metadata, counting(40, 32)},
                               {".note.brinegt.compat", type_note, note_data(notes)}});
  put16(file, at_e_machine, 0xCD);
  return file;
}

byte_vector patch_token(std::uint32_t type, const byte_vector& contents) {
  byte_vector token;
  append32(token, type);
  append32(token, contents.size() + 8);
  append(token, contents);
  return token;
}

byte_vector program_header(const older_kernel& kernel) {
  byte_vector data = {'B', 'R', 'N', 'E'};
  for (const std::uint32_t field : {1000U, kernel.core_family, 8U, 1U, kernel.stepping, 0U}) {
    append32(data, field);
  }
  return data;
}

byte_vector program_data(const older_kernel& kernel) {
  byte_vector body(kernel.name.begin(), kernel.name.end());
  for (const byte_vector* part : {&kernel.kernel_heap, &kernel.general_state, &kernel.dynamic_state,
                                  &kernel.surface_state, &kernel.patch_list}) {
    append(body, *part);
  }
  byte_vector data = program_header(kernel);
  append32(data, model_hash(body));
  append(data, counting(8, 0xE0));  // shader hash
  for (const std::size_t size :
       {kernel.name.size(), kernel.patch_list.size(), kernel.kernel_heap.size(),
        kernel.general_state.size(), kernel.dynamic_state.size(), kernel.surface_state.size(),
        kernel.kernel_heap.size()}) {
    append32(data, size);
  }
  append(data, body);
  append(data, kernel.more);
  return data;
}

byte_vector older_binary(const older_kernel& kernel, header_table table) {
  return elf_file({{"own", type_driver_own, counting(24, 11)},
                   {"program", type_program, program_data(kernel)},
                   {"own too", type_driver_own, counting(9, 71)},
                   {"options", 0xFF000009, counting(17, 81)}},
                  table);
}

std::uint32_t model_hash(const byte_vector& bytes) {
  std::int64_t state[3] = {0x428A2F98, 0x71374491, 0xB5C0FBCF};
  std::size_t at = 0;
  for (; at + 4 <= bytes.size(); at += 4) {
    const auto word = static_cast<std::int64_t>(get32(bytes, at));
    model_mix(state, below_2_32((word ^ state[0]) - state[1] - state[2]));
  }
  if (at < bytes.size()) {
    std::int64_t rest = 0;
    for (; at < bytes.size(); ++at) {
      rest = times_2(rest | bytes[at], 8);
    }
    model_mix(state, below_2_32(rest - state[1] - state[2]));
  }
  return static_cast<std::uint32_t>(state[2]);
}

void repair_checksum(byte_vector& file) {
  const std::size_t program = data_at(file, index_of_program);
  const std::size_t name = program + at_kernel_name;
  std::size_t end = name;
  for (const std::size_t size_at : {40, 44, 48, 52, 56, 60}) {
    end += get32(file, program + size_at);
  }
  put32(file, program + at_kernel_checksum, model_hash(cut(file, name, end)));
}

}  // namespace tarn_test
