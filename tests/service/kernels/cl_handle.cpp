// SPDX-License-Identifier: Apache-2.0
// Handles with tables of kernels by name: hashes, every outcome of every operation, and that each
// operation waits for itself only.
#include "cl_handle.hpp"

#include <random>
#include <string>
#include <thread>
#include <vector>

#include "binary_driver.hpp"
#include "c_suite.hpp"

namespace {

using namespace kestrel::tarn::gpu;

/// The hash in 32-bit halves, by school multiplication.
std::uint64_t model(const std::string& name) {
  constexpr std::uint64_t half = std::uint64_t{1} << 32;
  std::uint64_t low = 1;
  std::uint64_t high = 0;
  for (std::size_t i = 0; i < name.size(); ++i) {
    const int letter = static_cast<unsigned char>(name[i]);
    const int factor = (letter < 128 ? letter : letter - 256) - 48 + 80 * static_cast<int>(i);
    const std::uint64_t size = static_cast<std::uint64_t>(factor < 0 ? -factor : factor);
    const std::uint64_t first = low * size;
    high = (high * size + first / half) % half;
    low = first % half;
    if (factor < 0 && low == 0) {
      high = (half - high) % half;
    } else if (factor < 0) {
      high = half - 1 - high;
      low = half - low;
    }
  }
  return high * half + low;
}

TEST(NameHash, CasesByHand) {
  EXPECT_EQ(name_hash(""), 1U);
  EXPECT_EQ(name_hash("1"), 1U);
  EXPECT_EQ(name_hash("a"), 49U);
  EXPECT_EQ(name_hash("0"), 0U);
  EXPECT_EQ(name_hash("ab"), 49U * 130);
  EXPECT_EQ(name_hash("a0"), 49U * 80);
  EXPECT_EQ(name_hash("/"), ~std::uint64_t{0});  // a factor of -1
  EXPECT_EQ(name_hash("\x80"), ~std::uint64_t{0} - 175);
  EXPECT_EQ(name_hash("/") % 1021, 18446744073709551615ULL % 1021);
}

TEST(NameHash, IsTheModelsForRandomNames) {
  std::mt19937 words(20261121);
  for (int i = 0; i < 10000; ++i) {
    std::string name(words() % 40, '\0');
    for (char& letter : name) {
      letter = static_cast<char>(1 + words() % 255);
    }
    ASSERT_EQ(name_hash(name.c_str()), model(name)) << i;
  }
}

class ClHandle : public CKernels {
 protected:
  void SetUp() override {
    CKernels::SetUp();
    if (!IsSkipped()) {
      ASSERT_EQ(TARN_CL_Create_Handle(&made, queue()), 0);
    }
  }
  void TearDown() override {
    TARN_CL_Destroy_Handle(made);
    CKernels::TearDown();
  }

  cl_kernel new_kernel(int arguments = 1) {
    return tarn_serv_gpu_get_OCL_kernel_by_progname(&status, queue(), arguments, "p",
                                                    taking("k", arguments).c_str(), "k", "");
  }
  cl_kernel found(const char* name) const {
    cl_kernel kernel = nullptr;
    return find_kernel(made, name, &kernel) == 0 ? kernel : nullptr;
  }

  cl_handle* made = nullptr;
};

TEST_F(ClHandle, KnowsTheQueueItsDeviceAndItsContext) {
  EXPECT_EQ(made->queue, queue());
  EXPECT_EQ(made->device, device);
  EXPECT_EQ(made->context, context());
  ASSERT_NE(made->kernels, nullptr);
  EXPECT_EQ(made->kernels->bucket_count, 1021U);
  EXPECT_EQ(made->kernels->count, 0U);
  for (std::size_t i = 0; i < 1021; ++i) {
    ASSERT_EQ(made->kernels->buckets[i], nullptr);
  }
  EXPECT_EQ(living(), before);  // no reference is added
}

TEST_F(ClHandle, ItsMemoryGoesWithIt) {
  const std::int64_t kept = serv_memory::live_blocks();
  cl_handle* another = nullptr;
  ASSERT_EQ(TARN_CL_Create_Handle(&another, queue()), 0);
  EXPECT_EQ(serv_memory::live_blocks(), kept + 3);  // the handle, the table, the buckets
  EXPECT_EQ(serv_memory::last_malloc().size, 32U);
  ASSERT_EQ(insert_kernel(another, "name", new_kernel()), 0);
  TARN_CL_Destroy_Handle(another);
  EXPECT_EQ(kernels(), 0);
  clean_up();
  EXPECT_EQ(serv_memory::live_blocks(), kept);
}

TEST_F(ClHandle, NullsAreToldApart) {
  EXPECT_EQ(TARN_CL_Create_Handle(nullptr, queue()), 1);
  TARN_CL_Destroy_Handle(nullptr);
  cl_kernel kernel = nullptr;
  EXPECT_EQ(find_kernel(nullptr, "name", &kernel), -34);
  EXPECT_EQ(insert_kernel(nullptr, "name", nullptr), -34);
  cl_handle without_table{};
  EXPECT_EQ(find_kernel(&without_table, "name", &kernel), -34);
  EXPECT_EQ(insert_kernel(&without_table, "name", nullptr), -34);
}

TEST_F(ClHandle, AQueueThatTellsNothingGivesItsCode) {
  const std::int64_t kept = serv_memory::live_blocks();
  cl_handle* none = made;
  EXPECT_EQ(TARN_CL_Create_Handle(&none, nullptr), CL_INVALID_COMMAND_QUEUE);
  EXPECT_EQ(none, nullptr);
  for (int after = 0; after < 2; ++after) {  // device, then context
    none = made;
    opencl_layer::fail("clGetCommandQueueInfo", after, -9990 - after);
    EXPECT_EQ(TARN_CL_Create_Handle(&none, queue()), -9990 - after);
    EXPECT_EQ(none, nullptr);
  }
  EXPECT_EQ(serv_memory::live_blocks(), kept);
}

TEST_F(ClHandle, ExhaustedMemoryLeavesNothing) {
  const std::int64_t kept = serv_memory::live_blocks();
  int failures = 0;
  for (int code = -6; code != 0; ++failures) {
    const serv_memory::failure failure(failures);
    cl_handle* none = made;
    code = TARN_CL_Create_Handle(&none, queue());
    EXPECT_EQ(code, failure.happened() ? -6 : 0);
    EXPECT_EQ(none == nullptr, failure.happened());
    TARN_CL_Destroy_Handle(none);
    EXPECT_EQ(serv_memory::live_blocks(), kept);
  }
  EXPECT_EQ(failures, 4);  // table, buckets, handle; then there is none
}

TEST_F(ClHandle, AnUnknownNameIsNone) {
  cl_kernel kernel = reinterpret_cast<cl_kernel>(this);
  EXPECT_EQ(find_kernel(made, "name", &kernel), -46);
  EXPECT_EQ(kernel, reinterpret_cast<cl_kernel>(this));
}

TEST_F(ClHandle, KernelsAreFoundByTheirNames) {
  // "0..." hash to 0, and products of even factors to few buckets.
  const std::vector<std::string> names = {"a", "b", "0", "00", "0a", "", "dgemm", "dgemn"};
  std::vector<cl_kernel> all;
  for (const std::string& name : names) {
    all.push_back(new_kernel());
    std::string copy = name;
    ASSERT_EQ(insert_kernel(made, copy.c_str(), all.back()), 0);
    copy.assign(copy.size(), '-');
  }
  for (std::size_t i = 0; i < names.size(); ++i) {
    EXPECT_EQ(found(names[i].c_str()), all[i]) << names[i];
  }
  EXPECT_EQ(made->kernels->count, names.size());
  ASSERT_NE(made->kernels->buckets[0], nullptr);
  EXPECT_STREQ(made->kernels->buckets[0]->name, "0a");  // the latest stands first
}

TEST_F(ClHandle, AKnownNameGetsTheNewKernelAndTheOldOneGoes) {
  const cl_kernel one = new_kernel(1);
  const cl_kernel two = new_kernel(2);
  ASSERT_EQ(insert_kernel(made, "name", one), 0);
  const int held_before = kernels();
  ASSERT_EQ(insert_kernel(made, "name", two), 0);
  EXPECT_EQ(kernels(), held_before - 1);
  EXPECT_EQ(found("name"), two);
  EXPECT_EQ(made->kernels->count, 1U);
}

TEST_F(ClHandle, AKernelThatFindsNoMemoryStaysTheCallers) {
  const cl_kernel kernel = new_kernel();
  for (int after = 0; after < 2; ++after) {  // the node, and the name
    const std::int64_t kept = serv_memory::live_blocks();
    const serv_memory::failure failure(after);
    EXPECT_EQ(insert_kernel(made, "name", kernel), -6);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(serv_memory::live_blocks(), kept);
    EXPECT_EQ(found("name"), nullptr);
    EXPECT_EQ(made->kernels->count, 0U);
  }
  EXPECT_EQ(kernels(), 1);
  tarn_serv_gpu_release_kernel_obj(&status, kernel);
}

/// Inserts and destroys while a handle is being made, which waits.
class ThreeLocks : public ClHandle {
 protected:
  static cl_handle* other;
  static cl_kernel kernel;
  static int depth;

  static cl_int CL_API_CALL ask(cl_command_queue of, cl_command_queue_info what, std::size_t size,
                                void* value, std::size_t* size_ret) {
    if (depth++ == 0) {  // each would wait for ever if the locks were one
      EXPECT_EQ(insert_kernel(other, "name", kernel), 0);
      TARN_CL_Destroy_Handle(other);
    }
    return opencl_loader::get().clGetCommandQueueInfo(of, what, size, value, size_ret);
  }
};
cl_handle* ThreeLocks::other = nullptr;
cl_kernel ThreeLocks::kernel = nullptr;
int ThreeLocks::depth = 0;

TEST_F(ThreeLocks, EachOperationHasOneOfItsOwn) {
  ASSERT_EQ(TARN_CL_Create_Handle(&other, queue()), 0);
  kernel = new_kernel();
  depth = 0;
  const replaced_entry entry(opencl_function::clGetCommandQueueInfo, reinterpret_cast<void*>(&ask));
  cl_handle* third = nullptr;
  EXPECT_EQ(TARN_CL_Create_Handle(&third, queue()), 0);
  EXPECT_EQ(depth, 2);
  EXPECT_EQ(kernels(), 0);
  TARN_CL_Destroy_Handle(third);
}

TEST_F(ClHandle, ThreadsMayMakeAndDestroyAndInsert) {
  const cl_kernel kernel = new_kernel();
  std::vector<std::thread> all;
  for (int t = 0; t < 4; ++t) {
    all.emplace_back([this, kernel, t] {
      for (int i = 0; i < 200; ++i) {
        cl_handle* own = nullptr;
        EXPECT_EQ(TARN_CL_Create_Handle(&own, queue()), 0);
        TARN_CL_Destroy_Handle(own);
        opencl_loader::get().clRetainKernel(kernel);
        EXPECT_EQ(insert_kernel(made, ("name" + std::to_string((t + i) % 7)).c_str(), kernel), 0);
      }
    });
  }
  for (std::thread& thread : all) {
    thread.join();
  }
  EXPECT_EQ(made->kernels->count, 7U);
  EXPECT_EQ(kernels(), 8);
  tarn_serv_gpu_release_kernel_obj(&status, kernel);
}

}  // namespace
