// SPDX-License-Identifier: Apache-2.0
// Each exception has its own class, its own text, and the common base.
#include "exceptions.hpp"

#include <set>
#include <stdexcept>
#include <string>

#include <gtest/gtest.h>

namespace {

using namespace kestrel::tarn::forge;

template <typename Exception>
std::string text_of() {
  try {
    throw Exception();
  } catch (const std::runtime_error& caught) {
    return caught.what();
  }
}

TEST(ForgeExceptions, Encoding) {
  EXPECT_EQ(text_of<invalid_immediate_exception>(), "Invalid immediate value");
  EXPECT_EQ(text_of<invalid_region_exception>(), "Unsupported register region");
  EXPECT_EQ(text_of<invalid_range_exception>(), "Invalid register range");
  EXPECT_EQ(text_of<invalid_object_exception>(), "Object is invalid");
  EXPECT_EQ(text_of<invalid_modifiers_exception>(), "Invalid or conflicting modifiers");
  EXPECT_EQ(text_of<invalid_type_exception>(),
            "Instruction does not support this type or combination of types");
  EXPECT_EQ(text_of<invalid_operand_exception>(), "Invalid operand to instruction");
  EXPECT_EQ(text_of<invalid_address_modifier_exception>(), "Invalid address offset");
  EXPECT_EQ(text_of<invalid_model_exception>(), "Invalid addressing model specified");
  EXPECT_EQ(text_of<read_only_exception>(), "Memory model is read-only");
  EXPECT_EQ(text_of<missing_type_exception>(), "Operand is missing its type");
  EXPECT_EQ(text_of<unsupported_message>(), "Message is not supported by the chosen hardware");
}

TEST(ForgeExceptions, Streams) {
  EXPECT_EQ(text_of<multiple_label_exception>(), "Label already has a location");
  EXPECT_EQ(text_of<dangling_label_exception>(),
            "A label was referenced, but its location was not defined");
  EXPECT_EQ(text_of<unfinished_stream_exception>(),
            "An unfinished instruction stream is still active");
}

TEST(ForgeExceptions, Interfaces) {
  EXPECT_EQ(text_of<unknown_argument_exception>(), "Argument not found");
  EXPECT_EQ(text_of<interface_not_finalized>(), "Interface has not been finalized");
  EXPECT_EQ(text_of<unsupported_argument_location_override>(),
            "Argument register location is invalid");
}

TEST(ForgeExceptions, Binaries) {
  EXPECT_EQ(text_of<crate::bad_elf>(),
            "Incompatible OpenCL runtime: program is not in expected ELF format.");
  EXPECT_EQ(text_of<crate::no_binary_section>(),
            "Incompatible OpenCL runtime: no binary section found.");
  EXPECT_EQ(text_of<crate::bad_binary_section>(),
            "Incompatible OpenCL runtime: invalid binary section.");
  EXPECT_EQ(text_of<crate::invalid_checksum>(), "Incompatible OpenCL runtime: invalid checksum.");
}

TEST(ForgeExceptions, TheListHoldsNoTextTwiceAndNothingElse) {
  std::set<std::string> texts;
  int rows = 0;
#define TARN_FORGE_EXCEPTION(name, text) \
  texts.insert(text);                    \
  ++rows;
#define TARN_FORGE_CRATE_EXCEPTION(name, text) TARN_FORGE_EXCEPTION(name, text)
#include "exceptions.def"
#undef TARN_FORGE_CRATE_EXCEPTION
#undef TARN_FORGE_EXCEPTION
  EXPECT_EQ(rows, 22) << "one row for each class tested above";
  EXPECT_EQ(texts.size(), 22U);
}

TEST(ForgeExceptions, DriverErrorsCarryTheirCode) {
  const opencl_error opencl(-2147483647 - 1);
  EXPECT_STREQ(opencl.what(), "An OpenCL error occurred: -2147483648");
  EXPECT_EQ(opencl.status, -2147483647 - 1);
  EXPECT_STREQ(opencl_error(-11).what(), "An OpenCL error occurred: -11");
  const level_zero_error level_zero(0x78000003);
  EXPECT_STREQ(level_zero.what(), "A Level Zero error occurred.");
  EXPECT_EQ(level_zero.status, 0x78000003U);
  EXPECT_THROW(throw opencl, std::runtime_error);
  EXPECT_THROW(throw level_zero, std::runtime_error);
}

}  // namespace
