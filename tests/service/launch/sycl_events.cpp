// SPDX-License-Identifier: Apache-2.0
// Events on SYCL queues, in both families, and the verbose report of launches.
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <tarn_serv.h>

#include "kestrel/tarn/gpu/verbose.hpp"
#include "sycl_kernels.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

template <typename Family>
using sycl_events = family_launches<Family>;
TYPED_TEST_SUITE(sycl_events, families, family_names);

// Whether the heap objects are gone is the leak checker's to see.
TYPED_TEST(sycl_events, one_stands_for_all_which_are_consumed) {
  gate first(*this->queue);
  gate second(*this->queue);
  sycl::event* const events[] = {first.event(), second.event()};
  const tarn_gpu_event_list_t list{events, 2, 0};
  sycl::event* const all = TypeParam::coalesce(&this->status, &*this->queue, &list);
  ASSERT_NE(all, nullptr);
  second.open();
  give_it_a_chance();
  EXPECT_FALSE(this->is_complete(*all));
  first.open();
  this->finish(all);
}

TYPED_TEST(sycl_events, later_work_comes_after_the_merged_ones) {
  const auto place = this->filled(std::vector<int>{1});
  sycl::kernel add = this->kernel("add");
  gate held(*this->queue);
  sycl::event* const event = held.event();
  const tarn_gpu_event_list_t list{&event, 1, 0};
  sycl::event* const all = TypeParam::coalesce(&this->status, &*this->queue, &list);
  sycl::event* const launched = this->launch(add, {this->of_memory(place), of_scalar(10)});
  give_it_a_chance();
  EXPECT_FALSE(this->is_complete(*launched));
  held.open();
  this->finish(launched);
  this->finish(all);
}

TYPED_TEST(sycl_events, without_any_the_result_is_complete_whatever_the_queue_does) {
  gate busy(*this->queue);
  sycl::event* const event = busy.event();
  const tarn_gpu_event_list_t empty{&event, 0, 0};
  const tarn_gpu_event_list_t fewer{&event, -1, 0};
  for (const tarn_gpu_event_list_t* list :
       {static_cast<const tarn_gpu_event_list_t*>(nullptr), &empty, &fewer}) {
    sycl::event* const all = TypeParam::coalesce(&this->status, &*this->queue, list);
    ASSERT_NE(all, nullptr);
    EXPECT_TRUE(*all == sycl::event());
    this->finish(all);
  }
  EXPECT_FALSE(this->is_complete(*event));  // and alive
  TypeParam::release(&this->status, event);
}

TYPED_TEST(sycl_events, null_is_released) {
  TypeParam::release(&this->status, nullptr);
}

TYPED_TEST(sycl_events, waiting_blocks_until_the_work_is_done) {
  const auto place = this->filled(std::vector<int>{1});
  sycl::kernel add = this->kernel("add");
  gate held(*this->queue);
  sycl::event* const event = held.event();
  const tarn_gpu_event_list_t list{&event, 1, 0};
  sycl::event* const launched =
      this->launch(add, {this->of_memory(place), of_scalar(10)}, 1, 1, &list);
  std::thread opener([&held] {
    give_it_a_chance();
    held.open();
  });
  TypeParam::host_wait(&this->status, launched);
  EXPECT_TRUE(this->is_complete(*launched));
  opener.join();
  TypeParam::release(&this->status, launched);
  TypeParam::release(&this->status, event);
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{11});
}

using in_buffers = family_launches<buffer_family>;
using in_shared_memory = family_launches<shared_family>;

TEST_F(in_buffers, events_of_a_list_to_be_skipped_stay_alive) {
  gate busy(*queue);
  sycl::event* const event = busy.event();
  const tarn_gpu_event_list_t list{&event, 1, 1};
  sycl::event* const all = gpu::coalesce_events(&status, &*queue, &list);
  EXPECT_TRUE(*all == sycl::event());
  finish(all);
  EXPECT_FALSE(is_complete(*event));
  busy.open();
  finish(event);
}

TEST_F(in_shared_memory, events_of_a_list_to_be_skipped_are_consumed) {
  gate held(*queue);
  sycl::event* const event = held.event();
  const tarn_gpu_event_list_t list{&event, 1, 1};
  sycl::event* const all = gpu::coalesce_events_usm(&status, &*queue, &list);
  give_it_a_chance();
  EXPECT_FALSE(is_complete(*all));
  held.open();
  finish(all);
}

// Reports

class reported : public in_shared_memory {
 protected:
  // The first report looks at all devices, whose default contexts stay.
  void SetUp() override {
    in_shared_memory::SetUp();
    if (IsSkipped()) {
      return;
    }
    const std::vector<int> others = living();
    *tarn_serv_verbose_mode() = 1;
    last_line();
    const std::vector<int> with_contexts = living();
    for (std::size_t kind = 0; kind < before.size(); ++kind) {
      before[kind] += with_contexts[kind] - others[kind];
    }
  }
  void TearDown() override {
    *tarn_serv_verbose_mode() = 0;
    in_shared_memory::TearDown();
  }
  static std::string file() { return std::getenv("TARN_VERBOSE_OUTPUT_FILE"); }
  std::string last_line() {
    std::remove(file().c_str());
    gpu::print_verbose_gpu_info(&*queue, "a launch", 0.5);
    std::ifstream report(file());
    std::string last;
    for (std::string line; std::getline(report, line);) {
      last = line.empty() ? last : line;
    }
    return last;
  }
  void launch_once() {
    const auto place = filled(std::vector<int>{1});
    sycl::kernel add = kernel("add");
    finish(launch(add, {of_memory(place), of_scalar(10)}));
  }
};

TEST_F(reported, a_launch_counts_for_the_device_time_in_mode_2_only) {
  *tarn_serv_verbose_mode() = 1;
  launch_once();
  EXPECT_EQ(last_line(), "TARN_VERBOSE a launch host:500.00ms device:N/A GPU0");
  *tarn_serv_verbose_mode() = 2;
  launch_once();
  const std::string line = last_line();
  EXPECT_EQ(line.rfind("TARN_VERBOSE a launch host:500.00ms device:", 0), 0u) << line;
  EXPECT_EQ(line.find("N/A"), std::string::npos) << line;
  EXPECT_EQ(last_line(), "TARN_VERBOSE a launch host:500.00ms device:N/A GPU0");
}

}  // namespace
