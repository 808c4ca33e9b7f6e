// SPDX-License-Identifier: Apache-2.0
// Reports of generate at levels 0, 1 and 2, word for word but for banner and times. The program
// sets the level itself and reads the file that TARN_VERBOSE_OUTPUT_FILE names in its environment.
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <mutex>
#include <regex>
#include <sstream>
#include <string>
#include <tarn_serv.h>
#include <thread>
#include <vector>

#include <kestrel/tarn/gpu/verbose.hpp>
#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::gpu;

std::string report_file() {
  return std::getenv("TARN_VERBOSE_OUTPUT_FILE");
}

/// The GPUs that reports know are those of the first queue's backend: here the virtual ones, which
/// have the vendor of the CPU.
constexpr const char* device_list =
    "TARN_VERBOSE Detected GPU0 Unknown_GPU Backend:Unknown_backend VE:0 Stack:1 maxWGsize:0\n\n";

/// What is in the file, but for the lines of the statistics library, which reports for itself.
std::string contents() {
  std::string text;
  std::ifstream file(report_file());
  for (std::string line; std::getline(file, line);) {
    if (line.rfind("TARN_VERBOSE rvx", 0) != 0) {
      text += line + "\n";
    }
  }
  return text;
}

class report : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    std::remove(report_file().c_str());
    set_level(1);
    rng::philox4x32x10 engine(tarn_test::cpu_queue());
    float value = 0;
    rng::generate(rng::uniform<float>(), engine, 1, &value);
    first_report = contents();
    set_level(0);
  }
  void SetUp() override { std::remove(report_file().c_str()); }
  void TearDown() override { *tarn_serv_verbose_mode() = 0; }

  static void set_level(int level) { *tarn_serv_verbose_mode() = level; }

  static sycl::queue profiled(const sycl::queue& queue) {
    return sycl::queue(queue.get_device(), sycl::property::queue::enable_profiling{});
  }

  static std::string first_report;

  /// Lines that report a generate call.
  static std::vector<std::string> lines() {
    std::vector<std::string> found;
    std::ifstream file(report_file());
    for (std::string line; std::getline(file, line);) {
      if (line.find("rng::generate") != std::string::npos) {
        found.push_back(line);
      }
    }
    return found;
  }
};

std::string report::first_report;

TEST_F(report, the_banner_and_the_gpus_come_before_the_first_line) {
  EXPECT_EQ(first_report.rfind("TARN_VERBOSE Tarn RNG ", 0), 0u) << first_report;
  const std::size_t banner = first_report.find('\n') + 1;
  EXPECT_EQ(first_report.substr(banner, std::strlen(device_list)), device_list);
  EXPECT_EQ(first_report.substr(banner + std::strlen(device_list))
                .rfind("TARN_VERBOSE kestrel::tarn::rng::generate USM call", 0),
            0u)
      << first_report;
}

TEST_F(report, level_0_prints_nothing) {
  rng::philox4x32x10 engine(tarn_test::cpu_queue());
  float value = 0;
  rng::generate(rng::uniform<float>(), engine, 1, &value);
  EXPECT_FALSE(std::ifstream(report_file()).good());
}

TEST_F(report, level_1_describes_a_usm_call_without_times) {
  set_level(1);
  rng::philox4x32x10 engine(tarn_test::cpu_queue());
  std::vector<float> values(25);
  rng::generate(rng::uniform<float>(), engine, 25, values.data());
  ASSERT_EQ(lines().size(), 1u);
  std::ostringstream expected;
  expected << "TARN_VERBOSE kestrel::tarn::rng::generate USM call with parameters distribution = "
              "kestrel::tarn::rng::uniform<float, kestrel::tarn::rng::uniform_method::standard>, "
              "engine = kestrel::tarn::rng::philox4x32x10, n = 25, r = "
           << static_cast<const void*>(values.data()) << " host:N/A device:N/A GPU0";
  EXPECT_EQ(lines()[0], expected.str());
}

TEST_F(report, level_1_describes_a_buffer_call) {
  set_level(1);
  rng::philox4x32x10 engine(tarn_test::host_run_gpu_queue());
  sycl::buffer<std::uint32_t, 1> buffer{sycl::range<1>(10)};
  rng::generate(rng::bits<>(), engine, 9, buffer);
  ASSERT_EQ(lines().size(), 1u);
  EXPECT_EQ(lines()[0],
            "TARN_VERBOSE kestrel::tarn::rng::generate Buffer call with parameters distribution = "
            "kestrel::tarn::rng::bits<unsigned int>, engine = kestrel::tarn::rng::philox4x32x10, "
            "n = 9 host:N/A device:N/A GPU0");
}

TEST_F(report, level_2_measures_host_and_device) {
  set_level(2);
  const std::regex timed(R"(.* host:[0-9.]+(ns|us|ms|s) device:[0-9.]+(ns|us|ms|s)( GPU0)?)");
  for (const sycl::queue& queue : {tarn_test::cpu_queue(), tarn_test::gpu_queue()}) {
    rng::philox4x32x10 engine(profiled(queue));
    auto* values = sycl::malloc_shared<float>(10000, engine.get_queue());
    const sycl::event before = engine.get_queue().fill(values, 0.0f, 10000);
    rng::generate(rng::uniform<float>(), engine, 10000, values, {before});
    sycl::buffer<float, 1> buffer{sycl::range<1>(10000)};
    rng::generate(rng::uniform<float>(), engine, 10000, buffer);
    sycl::free(values, engine.get_queue());
  }
  ASSERT_EQ(lines().size(), 4u);
  for (const std::string& line : lines()) {
    EXPECT_TRUE(std::regex_match(line, timed)) << line;
  }
}

/// A task on `queue` that ends when the gate is opened.
class gate {
 public:
  explicit gate(sycl::queue queue)
      : event(queue.submit([this](sycl::handler& group) {
          group.host_task([this] {
            std::unique_lock<std::mutex> lock(mutex_);
            opened_.wait(lock, [this] { return open_; });
          });
        })) {}
  void open() {
    const std::lock_guard<std::mutex> lock(mutex_);
    open_ = true;
    opened_.notify_all();
  }

 private:
  std::mutex mutex_;
  std::condition_variable opened_;
  bool open_ = false;

 public:
  sycl::event event;
};

/// A whole report of level 2, where only the times are not known beforehand.
std::regex timed_line(const std::string& call) {
  const std::string escaped =
      std::regex_replace(call, std::regex(R"([.*+?()\[\]{}|^$\\])"), R"(\$&)");
  return std::regex("TARN_VERBOSE " + escaped +
                    R"( host:[0-9.]+(ns|us|ms|s) device:[0-9.]+(ns|us|ms|s) GPU0\n)");
}

TEST_F(report, level_2_describes_both_forms_word_for_word) {
  set_level(2);
  rng::mcg59 engine(profiled(tarn_test::host_run_gpu_queue()));
  auto* values = sycl::malloc_shared<double>(1000, engine.get_queue());
  rng::generate(rng::exponential<double>(), engine, 1000, values);
  std::ostringstream usm;
  usm << "kestrel::tarn::rng::generate USM call with parameters distribution = "
         "kestrel::tarn::rng::exponential<double, kestrel::tarn::rng::exponential_method::icdf>, "
         "engine = kestrel::tarn::rng::mcg59, n = 1000, r = "
      << static_cast<const void*>(values);
  EXPECT_TRUE(std::regex_match(contents(), timed_line(usm.str()))) << contents();
  sycl::free(values, engine.get_queue());

  std::remove(report_file().c_str());
  sycl::buffer<double, 1> buffer{sycl::range<1>(1000)};
  rng::generate(rng::exponential<double>(), engine, 1000, buffer);
  const std::string form =
      "kestrel::tarn::rng::generate Buffer call with parameters distribution = "
      "kestrel::tarn::rng::exponential<double, kestrel::tarn::rng::exponential_method::icdf>, "
      "engine = kestrel::tarn::rng::mcg59, n = 1000";
  EXPECT_TRUE(std::regex_match(contents(), timed_line(form))) << contents();
}

// Libraries above this one report calls of their own, in which they generate.
TEST_F(report, a_call_inside_another_prints_nothing_and_its_device_time_counts_for_the_outer) {
  set_level(2);
  rng::philox4x32x10 engine(profiled(tarn_test::host_run_gpu_queue()));
  sycl::queue queue = engine.get_queue();
  std::vector<float> values(10000);
  sycl::buffer<float, 1> buffer(values.data(), sycl::range<1>(values.size()));
  auto* shared = sycl::malloc_shared<float>(10000, queue);
  gpu::verbose_depth_inc();
  rng::generate(rng::uniform<float>(), engine, 10000, shared);
  rng::generate(rng::uniform<float>(), engine, 10000, buffer);
  EXPECT_EQ(contents(), "");
  gpu::verbose_depth_dec();
  gpu::print_verbose_gpu_info(&queue, "outer call", 0.5);
  const std::regex line(
      R"(TARN_VERBOSE outer call host:500\.00ms device:[0-9.]+(ns|us|ms|s) GPU0\n)");
  EXPECT_TRUE(std::regex_match(contents(), line)) << contents();
  gpu::print_verbose_gpu_info(&queue, "outer call", 0.5);
  EXPECT_TRUE(
      std::regex_search(contents(), std::regex("outer call host:500\\.00ms device:N/A GPU0\n$")))
      << contents();
  sycl::free(shared, queue);
}

TEST_F(report, at_level_1_a_call_inside_another_prints_nothing_either) {
  set_level(1);
  rng::philox4x32x10 engine(tarn_test::host_run_gpu_queue());
  sycl::queue queue = engine.get_queue();
  sycl::buffer<float, 1> buffer{sycl::range<1>(10)};
  gpu::verbose_depth_inc();
  rng::generate(rng::uniform<float>(), engine, 10, buffer);
  gpu::verbose_depth_dec();
  EXPECT_EQ(contents(), "");
  gpu::print_verbose_gpu_info(&queue, "outer call", 2.0);
  EXPECT_EQ(contents(), "TARN_VERBOSE outer call host:2.00s device:N/A GPU0\n");
}

TEST_F(report, level_1_waits_for_nothing) {
  set_level(1);
  rng::philox4x32x10 engine(tarn_test::gpu_queue());
  auto* value = sycl::malloc_shared<float>(1, engine.get_queue());
  *value = -1.0f;
  gate closed(engine.get_queue());
  sycl::event event = rng::generate(rng::uniform<float>(), engine, 1, value, {closed.event});
  EXPECT_EQ(*value, -1.0f);
  EXPECT_EQ(lines().size(), 1u);
  closed.open();
  event.wait();
  EXPECT_NE(*value, -1.0f);
  sycl::free(value, engine.get_queue());
}

TEST_F(report, level_2_waits_for_dependencies_before_it_starts) {
  set_level(2);
  rng::philox4x32x10 engine(profiled(tarn_test::gpu_queue()), 3);
  auto* values = sycl::malloc_shared<float>(4, engine.get_queue());
  gate closed(engine.get_queue());
  std::atomic<bool> returned{false};
  std::thread caller([&] {
    rng::generate(rng::uniform<float>(), engine, 4, values, {closed.event});
    returned = true;
  });
  // Long enough for a call that does not wait; one that waits cannot return, however long it is.
  std::this_thread::sleep_for(std::chrono::milliseconds(50));
  EXPECT_FALSE(returned);
  EXPECT_TRUE(lines().empty());
  closed.open();
  caller.join();
  EXPECT_EQ(lines().size(), 1u);
  sycl::free(values, engine.get_queue());
}

TEST_F(report, a_refused_call_prints_nothing_and_leaves_no_depth_behind) {
  set_level(1);
  rng::philox4x32x10 engine(tarn_test::cpu_queue());
  float value = 0;
  EXPECT_THROW(rng::generate(rng::uniform<float>(), engine, -1, &value),
               kestrel::tarn::invalid_argument);
  EXPECT_TRUE(lines().empty());
  rng::generate(rng::uniform<float>(), engine, 1, &value);
  EXPECT_EQ(lines().size(), 1u);
}

// Device time comes from profiling stamps; a queue that takes none has the runtime's own error,
// after the values have been written.
TEST_F(report, level_2_on_a_queue_without_profiling_raises_the_runtimes_error) {
  set_level(2);
  rng::philox4x32x10 engine(tarn_test::cpu_queue());
  float value = -1.0f;
  EXPECT_THROW(rng::generate(rng::uniform<float>(), engine, 1, &value), sycl::exception);
  EXPECT_NE(value, -1.0f);
  EXPECT_TRUE(lines().empty());
  set_level(1);
  rng::generate(rng::uniform<float>(), engine, 1, &value);
  EXPECT_EQ(lines().size(), 1u);
}

TEST_F(report, values_do_not_depend_on_the_level) {
  std::vector<std::vector<float>> drawn;
  for (int level = 0; level <= 2; ++level) {
    set_level(level);
    rng::philox4x32x10 engine(profiled(tarn_test::gpu_queue()), 5);
    std::vector<float> values(100);
    {
      sycl::buffer<float, 1> buffer(values.data(), sycl::range<1>(100));
      rng::generate(rng::uniform<float>(), engine, 100, buffer);
    }
    drawn.push_back(values);
  }
  EXPECT_EQ(drawn[0], drawn[1]);
  EXPECT_EQ(drawn[0], drawn[2]);
}

}  // namespace
