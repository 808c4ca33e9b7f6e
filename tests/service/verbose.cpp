// SPDX-License-Identifier: Apache-2.0
// Depth, events and times of verbose reports.
#include "verbose.hpp"

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <regex>
#include <string>
#include <tarn_serv.h>
#include <vector>

#include <gtest/gtest.h>

namespace {

namespace gpu = kestrel::tarn::gpu;

std::string report_file() {
  return std::getenv("TARN_VERBOSE_OUTPUT_FILE");
}

class service_report : public testing::Test {
 protected:
  void SetUp() override { std::remove(report_file().c_str()); }
  void TearDown() override { *tarn_serv_verbose_mode() = 0; }

  static void set_level(int level) { *tarn_serv_verbose_mode() = level; }
  void print(double seconds) { gpu::print_verbose_gpu_info(&queue, "a call", seconds); }

  static std::vector<std::string> lines() {
    std::vector<std::string> found;
    std::ifstream file(report_file());
    for (std::string line; std::getline(file, line);) {
      if (line.find("a call") != std::string::npos) {
        found.push_back(line);
      }
    }
    return found;
  }

  sycl::event some_work() {
    sycl::event event = queue.fill(values.data(), 1.0f, values.size());
    event.wait();
    return event;
  }

  sycl::queue queue{sycl::property::queue::enable_profiling{}};
  std::vector<float> values = std::vector<float>(1 << 16);
};

using lines_of = std::vector<std::string>;

TEST_F(service_report, is_silent_at_level_0_and_inside_another_call) {
  print(1.5);
  set_level(1);
  gpu::verbose_depth_inc();
  print(1.5);
  gpu::verbose_depth_inc();
  gpu::verbose_depth_dec();
  print(1.5);
  gpu::verbose_depth_dec();
  EXPECT_EQ(lines(), lines_of{});
  print(1.5);
  EXPECT_EQ(lines(), lines_of{"TARN_VERBOSE a call host:1.50s device:N/A"});
}

TEST_F(service_report, one_second_is_printed_in_milliseconds) {
  set_level(1);
  print(1.0);
  EXPECT_EQ(lines(), lines_of{"TARN_VERBOSE a call host:1000.00ms device:N/A"});
}

TEST_F(service_report, events_of_a_nested_call_count_for_the_outer_one_and_are_then_forgotten) {
  set_level(2);
  gpu::verbose_depth_inc();
  gpu::verbose_register_event(some_work());
  print(0.5);
  gpu::verbose_depth_dec();
  EXPECT_EQ(lines(), lines_of{});
  print(0.5);
  ASSERT_EQ(lines().size(), 1u);
  EXPECT_TRUE(std::regex_match(lines()[0], std::regex(R"(.* device:[0-9.]+(ns|us|ms))")))
      << lines()[0];
  print(0.5);
  EXPECT_EQ(lines().back(), "TARN_VERBOSE a call host:500.00ms device:N/A");
}

TEST_F(service_report, events_are_registered_at_level_2_only) {
  set_level(1);
  gpu::verbose_register_event(some_work());
  print(0.5);
  EXPECT_EQ(lines(), lines_of{"TARN_VERBOSE a call host:500.00ms device:N/A"});
}

TEST_F(service_report, buffer_steps_nest_and_measure_at_every_level) {
  sycl::buffer<float, 1> buffer{sycl::range<1>(16)};
  for (int level = 1; level <= 2; ++level) {
    set_level(level);
    double seconds = 0.0;
    gpu::verbose_buffer_start(&seconds, buffer);
    EXPECT_LT(seconds, 0.0);
    print(0.5);
    EXPECT_EQ(lines(), lines_of{});
    gpu::verbose_buffer_end(&seconds, buffer);
    EXPECT_GE(seconds, 0.0);
  }
  print(0.5);
  EXPECT_EQ(lines().size(), 1u);
}

}  // namespace
