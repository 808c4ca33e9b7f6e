// SPDX-License-Identifier: Apache-2.0
// Depth, events and times of verbose reports.
#include "verbose.hpp"

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <regex>
#include <string>
#include <tarn_serv.h>
#include <thread>
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

TEST_F(service_report, depth_belongs_to_the_thread) {
  set_level(1);
  gpu::verbose_depth_inc();
  std::thread([this] { print(1.5); }).join();
  EXPECT_EQ(lines(), lines_of{"TARN_VERBOSE a call host:1.50s device:N/A"});
  gpu::verbose_depth_dec();
}

TEST_F(service_report, events_belong_to_the_thread_and_go_with_it) {
  set_level(2);
  std::thread([this] { gpu::verbose_register_event(some_work()); }).join();
  print(0.5);
  std::thread([this] { print(0.5); }).join();
  const std::string without = "TARN_VERBOSE a call host:500.00ms device:N/A";
  EXPECT_EQ(lines(), (lines_of{without, without}));
}

TEST_F(service_report, the_device_time_spans_all_events) {
  using sycl::info::event_profiling::command_end;
  using sycl::info::event_profiling::command_start;
  set_level(2);
  sycl::event first = some_work();
  sycl::event last = some_work();
  gpu::verbose_register_event(last);
  gpu::verbose_register_event(first);
  print(0.5);
  const auto span =
      last.get_profiling_info<command_end>() - first.get_profiling_info<command_start>();
  char text[32];
  tarn_serv_format_seconds(text, sizeof text, static_cast<double>(span) * 1e-9);
  EXPECT_EQ(lines(), lines_of{std::string("TARN_VERBOSE a call host:500.00ms device:") + text});
}

TEST_F(service_report, an_event_without_times_raises_and_is_forgotten) {
  set_level(2);
  sycl::queue without_times;
  sycl::event event = without_times.fill(values.data(), 1.0f, values.size());
  event.wait();
  gpu::verbose_register_event(event);
  EXPECT_THROW(print(0.5), sycl::exception);
  EXPECT_EQ(lines(), lines_of{});
  print(0.5);
  EXPECT_EQ(lines(), lines_of{"TARN_VERBOSE a call host:500.00ms device:N/A"});
}

TEST_F(service_report, a_mode_below_0_is_off) {
  set_level(-1);
  print(0.5);
  EXPECT_FALSE(std::ifstream(report_file()).good());
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
