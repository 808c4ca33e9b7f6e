// SPDX-License-Identifier: Apache-2.0
// Kernels from device code for OpenCL queues, as programs and with a dummy source.
#include <optional>
#include <string>
#include <vector>

#include "../../forge/binaries.hpp"
#include "binary_driver.hpp"
#include "c_suite.hpp"

namespace {

using namespace kestrel::tarn;
using byte_vector = std::vector<unsigned char>;

const byte_vector code = tarn_test::counting(500, 3);

byte_vector dummy_binary() {
  return tarn_test::older_binary({});
}

/// The container with the code in it.
byte_vector spliced() {
  const gpu::spliced_binary binary = gpu::splice(dummy_binary(), code);
  const auto* const bytes = static_cast<const unsigned char*>(binary.data.get());
  return byte_vector(bytes, bytes + binary.size);
}

class CBinaryKernels : public CKernels {
 protected:
  static constexpr const char* dummy = "kernel void k(global int* out) { *out = 1; }";
  const tarn_gpu_binary_kernel_t with_dummy{code.size(), code.data(), dummy, "-DDUMMY"};

  handle get_with_dummy(const char* name = "k", const std::string& key = "key") {
    return tarn_gpu_get_binary_kernel_ext(&status, queue(), 3, &with_dummy, name, key.data(),
                                          key.size(), "payload", 7);
  }
  handle get_cached(const char* name, const std::string& key, std::string* payload) {
    const void* data = this;
    std::size_t size = 77;
    const handle found =
        tarn_gpu_get_cached_kernel(&status, queue(), 3, name, key.data(), key.size(), &data, &size);
    *payload = data == nullptr ? "(null)" : std::string(static_cast<const char*>(data), size);
    return found;
  }
};

TEST_F(CBinaryKernels, AProgramsBinaryIsTakenAsItIs) {
  const byte_vector program = compiled(context(), device, taking("k", 2));
  const tarn_gpu_binary_kernel_t binary{program.size(), program.data(), nullptr,
                                        "-not -looked -at"};
  const handle kernel =
      tarn_gpu_get_binary_kernel_ext(&status, queue(), 3, &binary, "k", "key", 3, "payload", 7);
  ASSERT_NE(kernel, nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(arguments_of(kernel), 2);
  std::string payload;
  const handle second = get_cached("k", "key", &payload);
  EXPECT_NE(second, kernel);
  EXPECT_EQ(payload, "payload");
  // Another call's payload is not taken.
  release(kernel);
  EXPECT_EQ(tarn_gpu_get_binary_kernel_ext(&status, queue(), 3, &binary, "k", "key", 3, "other", 5),
            kernel);
  get_cached("k", "key", &payload);
  EXPECT_EQ(payload, "payload");
}

TEST_F(CBinaryKernels, OptionsAreEmptyForDeviceCode) {
  const binary_driver driver({}, taking("k", 1));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, "-DX"};
  ASSERT_NE(tarn_serv_gpu_get_binary_kernel(&status, queue(), 3, &binary, "k"), nullptr);
  EXPECT_EQ(driver.options(), std::vector<std::string>{""});
  EXPECT_EQ(driver.taken(), std::vector<byte_vector>{code});
}

TEST_F(CBinaryKernels, WithoutAKeyItIsTheEmptyOne) {
  const binary_driver driver({}, taking("k", 1));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, ""};
  const handle kernel = tarn_serv_gpu_get_binary_kernel(&status, queue(), 3, &binary, "k");
  release(kernel);
  std::string payload;
  EXPECT_EQ(get_cached("k", "", &payload), kernel);
  EXPECT_EQ(payload, "(null)");
  release(kernel);
  EXPECT_EQ(
      tarn_gpu_get_binary_kernel_ext(&status, queue(), 3, &binary, "k", nullptr, 5, nullptr, 5),
      kernel);
  EXPECT_EQ(driver.taken().size(), 1U);
}

TEST_F(CBinaryKernels, ASelfNamingKeySharesOneProgramAmongNames) {
  const binary_driver driver({}, taking("one", 1) + taking("two", 2));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, ""};
  const auto get_named = [&](const char* name) {
    return tarn_gpu_get_binary_kernel_ext(&status, queue(), 3, &binary, name, "\xFF!", 2, nullptr,
                                          0);
  };
  const handle one = get_named("one");
  const handle two = get_named("two");
  EXPECT_EQ(status, 0);
  EXPECT_EQ(driver.taken().size(), 1U);
  EXPECT_EQ(arguments_of(one), 1);
  EXPECT_EQ(arguments_of(two), 2);
  // Without a name the program's own is taken.
  const handle unnamed = get_named(nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(arguments_of(unnamed), 1);
  std::string payload;
  const handle cached = get_cached(nullptr, "\xFF!", &payload);
  ASSERT_NE(cached, nullptr);
  EXPECT_EQ(arguments_of(cached), 1);
  // Any free kernel of the program serves, whatever name is asked for.
  release(one);
  EXPECT_EQ(get_named("two"), one);
}

TEST_F(CBinaryKernels, KeysThatDifferBeyondThe64thByteHaveProgramsOfTheirOwn) {
  const binary_driver driver({}, taking("k", 1));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, ""};
  for (const char* const last : {"1", "2"}) {
    const std::string key = std::string(64, 'x') + last;
    EXPECT_NE(tarn_gpu_get_binary_kernel_ext(&status, queue(), 3, &binary, "k", key.data(),
                                             key.size(), nullptr, 0),
              nullptr);
  }
  EXPECT_EQ(driver.taken().size(), 2U);
}

TEST_F(CBinaryKernels, TheCodeGoesIntoTheDummysBinary) {
  const binary_driver driver(dummy_binary(), taking("k", 1));
  const handle kernel = get_with_dummy();
  ASSERT_NE(kernel, nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(driver.taken(), std::vector<byte_vector>{spliced()});
  EXPECT_EQ(driver.options(), (std::vector<std::string>{"-DDUMMY", ""}));
  EXPECT_EQ(programs(), 1);  // the dummy is gone
  EXPECT_EQ(cache().count, 1U);
  EXPECT_EQ(kernel->state, 1U);
  const handle second = get_with_dummy();
  EXPECT_NE(second, kernel);
  release(kernel);
  EXPECT_EQ(get_with_dummy(), kernel);
  EXPECT_EQ(driver.taken().size(), 1U);
  EXPECT_EQ(driver.options().size(), 2U);
}

TEST_F(CBinaryKernels, TheDummysRoadKeepsNoPayload) {
  const binary_driver driver(dummy_binary(), taking("k", 1));
  ASSERT_NE(get_with_dummy(), nullptr);
  std::string payload;
  EXPECT_NE(get_cached("k", "key", &payload), nullptr);
  EXPECT_EQ(payload, "(null)");
}

TEST_F(CBinaryKernels, ACodeThatCannotBePutInGivesTheSplicesCode) {
  byte_vector no_elf = dummy_binary();
  no_elf[0] = 0;
  byte_vector no_program = tarn_test::elf_file({{"other", 1, tarn_test::counting(100, 0)}});
  byte_vector bad_program = dummy_binary();
  bad_program[tarn_test::data_at(bad_program, tarn_test::index_of_program)] ^= 1;
  byte_vector bad_checksum = dummy_binary();
  bad_checksum[tarn_test::data_at(bad_checksum, tarn_test::index_of_program) +
               tarn_test::at_kernel_checksum] ^= 1;
  const std::vector<std::pair<byte_vector, int>> rows = {{{}, -2001},
                                                         {no_elf, -2001},
                                                         {no_program, -2002},
                                                         {bad_program, -2003},
                                                         {bad_checksum, -2005}};
  for (const auto& [binary, expected] : rows) {
    SCOPED_TRACE(expected);
    const binary_driver driver(binary, taking("k", 1));
    status = 0;
    EXPECT_EQ(get_with_dummy(), nullptr);
    EXPECT_EQ(status, expected);
    EXPECT_TRUE(driver.taken().empty());
    EXPECT_EQ(cache().count, 0U);
    EXPECT_EQ(programs(), 0);
  }
}

TEST_F(CBinaryKernels, NoMemoryForTheResultIsTheSplicesCodeToo) {
  const binary_driver driver(dummy_binary(), taking("k", 1));
  tarn_serv_gpu_get_eu_count(queue());
  // One allocation remembers the queue, the next one holds the spliced binary.
  const serv_memory::failure failure(1);
  EXPECT_EQ(get_with_dummy(), nullptr);
  EXPECT_TRUE(failure.happened());
  EXPECT_EQ(status, -2004);
}

cl_int CL_API_CALL lists_no_device(cl_program program, cl_program_info what, std::size_t size,
                                   void* value, std::size_t* size_ret) {
  const cl_int result = opencl_loader::get().clGetProgramInfo(program, what, size, value, size_ret);
  if (what == CL_PROGRAM_DEVICES) {
    *static_cast<cl_device_id*>(value) = nullptr;
  }
  return result;
}

TEST_F(CBinaryKernels, ADeviceThatTheProgramDoesNotListIsAnInvalidValue) {
  const binary_driver driver(dummy_binary(), taking("k", 1));
  const replaced_entry entry(gpu::opencl_function::clGetProgramInfo,
                             reinterpret_cast<void*>(&lists_no_device));
  EXPECT_EQ(get_with_dummy(), nullptr);
  EXPECT_EQ(status, -30);
  EXPECT_EQ(programs(), 0);
}

TEST_F(CBinaryKernels, EachCallOfTheDummysRoadMayFail) {
  const auto expect_failure = [&](const char* function, int after, int cached) {
    SCOPED_TRACE(std::string(function) + " after " + std::to_string(after));
    status = 0;
    opencl_layer::fail(function, after, -9999);
    EXPECT_EQ(get_with_dummy(), nullptr);
    EXPECT_EQ(status, -9999);
    opencl_layer::reset();
    EXPECT_EQ(programs(), cached);
    clean_up();
    EXPECT_EQ(living(), before);
  };
  const binary_driver driver(dummy_binary(), taking("k", 1));
  expect_failure("clCreateProgramWithSource", 0, 0);
  expect_failure("clBuildProgram", 0, 0);
  for (int query = 0; query < 4; ++query) {  // number, devices, sizes, binaries
    expect_failure("clGetProgramInfo", query, 0);
  }
  expect_failure("clCreateProgramWithSource", 1, 0);  // the double's, for device code
  expect_failure("clBuildProgram", 1, 0);
  expect_failure("clRetainProgram", 0, 0);
  expect_failure("clCreateKernel", 0, 1);
  const int asked = opencl_layer::calls("clGetProgramInfo");
  ASSERT_NE(get_with_dummy(), nullptr);
  EXPECT_EQ(opencl_layer::calls("clGetProgramInfo"), asked + 4);
}

/// Builds the same program while it is being built.
class BuildWithinABuild : public CBinaryKernels {
 protected:
  static BuildWithinABuild* present;
  static int depth;
  static handle inner;

  static cl_int CL_API_CALL build_twice(cl_program program, cl_uint count,
                                        const cl_device_id* devices, const char* options,
                                        void(CL_CALLBACK* notify)(cl_program, void*), void* data) {
    if (depth++ == 0) {
      inner = present->try_get("k", 1);  // would wait for ever if the lock were held
    }
    return opencl_loader::get().clBuildProgram(program, count, devices, options, notify, data);
  }
};
BuildWithinABuild* BuildWithinABuild::present = nullptr;
int BuildWithinABuild::depth = 0;
CKernels::handle BuildWithinABuild::inner = nullptr;

TEST_F(BuildWithinABuild, TheSecondProgramReplacesTheFirstWhoseKernelStays) {
  present = this;
  std::optional<replaced_entry> entry;
  entry.emplace(gpu::opencl_function::clBuildProgram, reinterpret_cast<void*>(&build_twice));
  const handle outer = try_get("k", 2);
  entry.reset();
  ASSERT_NE(outer, nullptr);
  ASSERT_NE(inner, nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(cache().count, 1U);
  EXPECT_EQ(programs(), 1);
  EXPECT_EQ(arguments_of(inner), 1);
  EXPECT_EQ(arguments_of(outer), 2);
  EXPECT_EQ(outer->next, inner);
  EXPECT_EQ(arguments_of(get("k", 9)), 2);
}

}  // namespace
