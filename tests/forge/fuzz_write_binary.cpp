// SPDX-License-Identifier: Apache-2.0
// write_binary makes a file of any parts that can be read again, and that holds the parts where its
// section headers say.
#include <string>

#include "elf_view.hpp"
#include "elf_writer.hpp"
#include "fuzz_support.hpp"

namespace {

using namespace kestrel::tarn::forge;

void require_section(const elf_view& elf, unsigned index, byte_view part) {
  const auto contents = elf.contents(elf.section(index));
  tarn_test::require(contents.has_value(), "section inside the file");
  tarn_test::require(byte_vector(contents->data, contents->data + contents->size) ==
                         byte_vector(part.data, part.data + part.size),
                     "section holds its part");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size < 4) {
    return 0;
  }
  // The sizes of the name and of the metadata, 8 bits each, and the core family number.
  const std::size_t name_size = std::min<std::size_t>(data[0], size - 4);
  const std::size_t metadata_size = std::min<std::size_t>(data[1], size - 4 - name_size);
  const std::uint32_t core_family = data[2] | std::uint32_t{data[3]} << 8;
  const char* const text = reinterpret_cast<const char*>(data + 4);
  const std::string name(text, name_size);
  const std::string metadata(text + name_size, metadata_size);
  const byte_view code(data + 4 + name_size + metadata_size, size - 4 - name_size - metadata_size);

  const byte_vector file = write_binary(core_family, name, metadata, code);
  tarn_test::require(file.size() % 16 == 0, "whole alignments");
  tarn_test::require(parse_binary(file).hw == hw_of_core_family(core_family), "target as written");
  const elf_view elf = *elf_view::open(file);
  require_section(elf, 2, byte_view(metadata.data(), metadata.size()));
  require_section(elf, 3, code);
  return 0;
}
