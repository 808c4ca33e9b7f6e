// SPDX-License-Identifier: Apache-2.0
// Every call of Level Zero fails once at every occurrence, in a piece of work that makes all of
// them: the failure is told, by the call itself or to the queue's handler, and nothing that was
// made before it is left over. Then the ends of a process, and drivers that fail while devices are
// looked for.
#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <memory>
#include <new>
#include <set>

#include "native_level_zero.hpp"

namespace {

constexpr std::size_t size = 64;

// What lumen goes on without when it fails once: a list or an event that cannot be used again is
// left alone until the end; an event whose state is not known is waited for; where two threads wait
// for one event, or for a queue and its last event, the other wait counts.
const std::set<std::string> harmless = {"zeCommandListReset", "zeEventHostReset",
                                        "zeEventQueryStatus", "zeCommandQueueSynchronize",
                                        "zeEventHostSynchronize"};
// An object that the driver does not give up stays.
bool gives_back(const std::string& function) {
  return function == "zeMemFree" || function.find("Destroy") != std::string::npos;
}

using memory = std::unique_ptr<number, std::function<void(number*)>>;
memory allocate(sycl::usm::alloc kind, const sycl::queue& queue) {
  auto* const made = sycl::aligned_alloc<number>(64, size, queue, kind);
  if (made == nullptr) {
    throw std::bad_alloc();
  }
  return {made, [queue](number* pointer) { sycl::free(pointer, queue); }};
}

class level_zero_failures : public native_level_zero {
 protected:
  // Kernels and modules come from outside; all else is the runtime's own work.
  struct natives {
    ze_context_handle_t context;
    ze_command_queue_handle_t queue;
    ze_module_handle_t module;
    ze_kernel_handle_t kernel;
  };

  // Objects over native ones.
  static std::vector<number> adopted_work(const natives& given, remembered_errors& errors) {
    const sycl::context context =
        sycl::make_context<level_zero>({given.context, {device()}, ownership::keep});
    const auto bundle = sycl::make_kernel_bundle<level_zero, sycl::bundle_state::executable>(
        {given.module, ownership::keep}, context);
    const sycl::kernel step =
        sycl::make_kernel<level_zero>({bundle, given.kernel, ownership::keep}, context);
    static_cast<void>(step.get_info<sycl::info::kernel::num_args>());
    static_cast<void>(step.get_info<sycl::info::kernel::function_name>());
    sycl::queue first =
        sycl::make_queue<level_zero>({given.queue, ownership::keep}, context, errors.handler());
    sycl::queue second(context, device(), errors.handler(),
                       sycl::property::queue::enable_profiling());
    return work(first, second, step);
  }

  // Memory, commands of every kind on two queues, a buffer that comes home.
  static std::vector<number> work(sycl::queue& first, sycl::queue& second,
                                  const sycl::kernel& step) {
    const memory on_device = allocate(sycl::usm::alloc::device, first);
    const memory on_host = allocate(sycl::usm::alloc::host, first);
    const memory shared = allocate(sycl::usm::alloc::shared, first);
    std::vector<number> result(size, 77);
    {
      sycl::buffer<number> buffer(result.data(), size);
      const sycl::event filled = first.fill(on_device.get(), number{3}, size);
      const sycl::event prefetched = first.prefetch(shared.get(), size * sizeof(number));
      const sycl::event stepped_once = second.submit([&](sycl::handler& h) {
        h.depends_on(filled);
        h.set_args(on_device.get(), number{1});
        h.parallel_for(sycl::nd_range<1>(size, 8, 0), step);
      });
      const sycl::event copied = first.copy(on_device.get(), on_host.get(), size, stepped_once);
      second.copy(on_host.get(), shared.get(), size, std::vector<sycl::event>{copied, prefetched});
      second.wait_and_throw();
      first.submit([&](sycl::handler& h) {
        const sycl::accessor<number, 1, sycl::access_mode::write> to(buffer, h);
        h.copy(shared.get(), to);
      });
      second.submit([&](sycl::handler& h) {
        h.set_args(sycl::accessor<number, 1, sycl::access_mode::read_write>(buffer, h), number{1});
        h.parallel_for(sycl::range<1>(size), step);
      });
      first.wait_and_throw();
      second.wait_and_throw();
      const sycl::host_accessor home(buffer);
    }
    return result;
  }

  static bool is_told(const natives& given, std::vector<number>& result) {
    remembered_errors errors;
    try {
      result = adopted_work(given, errors);
    } catch (const std::exception&) {
      return true;
    }
    return !errors.texts.empty();
  }
};

TEST_F(level_zero_failures, of_every_call_are_told_and_leave_nothing) {
  const native<ze_context_handle_t> context = new_context();
  const sycl::context over =
      sycl::make_context<level_zero>({context.get(), {device()}, ownership::keep});
  const native<ze_command_queue_handle_t> queue = new_queue(over);
  const native<ze_module_handle_t> module = new_module(over);
  const native<ze_kernel_handle_t> kernel = new_kernel(module.get(), "step");
  const natives given = {context.get(), queue.get(), module.get(), kernel.get()};
  const std::vector<number> expected(size, stepped(3, 2));
  const std::map<level_zero_driver::object, int> own = {{level_zero_driver::object::context, 1},
                                                        {level_zero_driver::object::queue, 1},
                                                        {level_zero_driver::object::module, 1},
                                                        {level_zero_driver::object::kernel, 1}};
  std::vector<number> result;
  level_zero_driver::reset();
  EXPECT_FALSE(is_told(given, result));
  EXPECT_EQ(result, expected);
  expect_only(own);
  std::map<std::string, int> calls;
  for (const std::string& function : level_zero_driver::functions()) {
    calls[function] = level_zero_driver::calls(function.c_str());
  }

  int failures = 0;
  for (const auto& [function, count] : calls) {
    for (int occurrence = 0; occurrence < count && !gives_back(function); ++occurrence) {
      level_zero_driver::fail(function.c_str(), occurrence, ZE_RESULT_ERROR_DEVICE_LOST);
      result.clear();
      const bool told = is_told(given, result);
      // How often an event is asked for depends on the time that passes.
      const bool happened = level_zero_driver::failures_left() == 0;
      EXPECT_TRUE(told || !happened || harmless.count(function) == 1)
          << function << ", occurrence " << occurrence;
      EXPECT_TRUE(told || result == expected) << function << ", occurrence " << occurrence;
      failures += happened ? 1 : 0;
      expect_only(own);
      level_zero_driver::reset();
    }
  }
  EXPECT_GT(failures, 100);
}

TEST_F(level_zero_failures, of_a_device_that_is_lost_are_told) {
  const sycl::context context(device());
  const sycl::kernel step = make_kernel(context, "step");
  for (const char* const function : {"zeEventHostSynchronize", "zeCommandQueueExecuteCommandLists",
                                     "zeCommandListAppendLaunchKernel"}) {
    remembered_errors errors;
    sycl::queue queue(context, device(), errors.handler());
    const memory place = allocate(sycl::usm::alloc::shared, queue);
    level_zero_driver::fail_always(function, ZE_RESULT_ERROR_DEVICE_LOST);
    const sycl::event event = queue.submit([&](sycl::handler& h) {
      h.set_args(place.get(), number{1});
      h.parallel_for(sycl::range<1>(size), step);
    });
    queue.wait_and_throw();
    EXPECT_EQ(errors.texts,
              std::vector<std::string>{std::string(function) + ": Level Zero error 0x70000001 "
                                                               "(ZE_RESULT_ERROR_DEVICE_LOST)"});
    EXPECT_EQ(event.get_info<sycl::info::event::command_execution_status>(),
              sycl::info::event_command_status::complete);
    level_zero_driver::reset();
  }
}

// Each runs in a process of its own.
class level_zero_process : public native_level_zero {
 protected:
  void SetUp() override {
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    if (level_zero_loader::find() == nullptr) {
      GTEST_SKIP() << "no Level Zero loader";
    }
  }
  void TearDown() override {}

  // Ends with the number of devices that are found while a function fails once.
  [[noreturn]] static void look_for_devices(const std::string& function, int occurrence) {
    level_zero_driver::fail(function.c_str(), occurrence, ZE_RESULT_ERROR_DEVICE_LOST);
    const std::size_t found = level_zero_devices().size();
    std::exit(level_zero_driver::failures_left() == 0 ? static_cast<int>(found) : 99);
  }

  // Held commands are released while the process ends.
  [[noreturn]] static void end_in_the_middle_of_work(bool with_handles) {
    add_kernels();
    const sycl::context context(device());
    static sycl::queue* const queue = new sycl::queue(context, device());
    const sycl::kernel step = make_kernel(context, "step");
    number* const a = sycl::malloc_device<number>(size, *queue);
    level_zero_driver::hold();
    for (int i = 0; i < 50; ++i) {
      queue->submit([&](sycl::handler& h) {
        h.set_args(a, number{1000});
        h.parallel_for(sycl::range<1>(size), step);
      });
      queue->submit([](sycl::handler& h) { h.host_task([] {}); });
    }
    std::thread([] {
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
      level_zero_driver::release();
    }).detach();
    if (!with_handles) {
      delete queue;
    }
    std::exit(0);
  }
};

TEST_F(level_zero_process, finds_the_devices_that_answer) {
  // The queries of one device leave out that device, those of a driver all of its.
  const std::pair<const char*, int> queries[] = {{"zeDriverGet", 0},
                                                 {"zeDriverGetApiVersion", 0},
                                                 {"zeDriverGetExtensionProperties", 0},
                                                 {"zeDeviceGet", 0},
                                                 {"zeDriverGetProperties", 2},
                                                 {"zeDeviceGetProperties", 2},
                                                 {"zeDeviceGetComputeProperties", 2},
                                                 {"zeDeviceGetModuleProperties", 2},
                                                 {"zeDeviceGetMemoryProperties", 2},
                                                 {"zeDeviceGetCacheProperties", 2},
                                                 {"zeDeviceGetMemoryAccessProperties", 2},
                                                 {"zeDeviceGetSubDevices", 2},
                                                 {"zeDeviceGetCommandQueueGroupProperties", 2}};
  for (const auto& [function, devices] : queries) {
    for (const int occurrence : {0, 1}) {
      if (std::string(function) != "zeDriverGetApiVersion" || occurrence == 0) {
        EXPECT_EXIT(look_for_devices(function, occurrence), testing::ExitedWithCode(devices), "")
            << function << ", occurrence " << occurrence;
      }
    }
  }
}

TEST_F(level_zero_process, ends_in_the_middle_of_work) {
  EXPECT_EXIT(end_in_the_middle_of_work(true), testing::ExitedWithCode(0), "");
}
TEST_F(level_zero_process, ends_in_the_middle_of_work_of_a_queue_that_is_gone) {
  EXPECT_EXIT(end_in_the_middle_of_work(false), testing::ExitedWithCode(0), "");
}

}  // namespace
