// SPDX-License-Identifier: Apache-2.0
// Every call of OpenCL fails once at each of its occurrences, in work that uses all functions of a
// family. Each failure that changes a result is told, by an exception, by a null pointer or to the
// queue's handler, and nothing is left over. Threads share a queue without one.
#include <numeric>

#include "sycl_kernels.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

const char* const functions[] = {
#define TARN_OPENCL_FUNCTION(name) #name,
#include "opencl_functions.def"
};

// An object whose release fails is lost, whoever lets it go, and who cannot wait for a command must
// not free what it uses.
bool makes_or_asks(const std::string& function) {
  return function.rfind("clRelease", 0) != 0 && function != "clSVMFree" &&
         function != "clWaitForEvents";
}

template <typename Family>
class sycl_failures : public family_launches<Family> {
 protected:
  using memory = typename Family::memory;

  // Two launches on zeros, merged, read and given back; the sum of what they wrote, or -1 for a
  // null pointer.
  std::int64_t work(sycl::kernel& add) {
    const memory place = Family::allocate_zeros(&this->status, &*this->queue, 4 * sizeof(int));
    if (place == nullptr) {
      return -1;
    }
    const place_keeper keeper{*this, place};
    launch_merged(add, place);
    int values[4] = {77, 77, 77, 77};
    Family::read(*this->queue, place, values, sizeof values);
    return std::accumulate(values, values + 4, std::int64_t{0});
  }

 private:
  struct place_keeper {
    sycl_failures& test;
    memory place;
    ~place_keeper() {
      test.queue->wait();
      Family::free(&test.status, place, *test.queue);
    }
  };

  void launch_merged(sycl::kernel& add, memory place) {
    const arguments args{this->of_memory(place), of_scalar(10)};
    std::unique_ptr<sycl::event> first(this->launch(add, args, 4, 2));
    std::unique_ptr<sycl::event> second;
    {
      sycl::event* const earlier = first.get();
      const tarn_gpu_event_list_t list{&earlier, 1, 0};
      second.reset(this->launch(add, args, 4, 2, &list));
    }
    sycl::event* const both[] = {first.release(), second.release()};
    const tarn_gpu_event_list_t list{both, 2, 0};
    const std::unique_ptr<sycl::event> all(Family::coalesce(&this->status, &*this->queue, &list));
    Family::host_wait(&this->status, all.get());
  }
};

TYPED_TEST_SUITE(sycl_failures, families, family_names);

TYPED_TEST(sycl_failures, of_every_call_are_told_and_leave_nothing) {
  sycl::kernel add = this->kernel("add");
  const std::vector<int> idle = this->living();
  EXPECT_EQ(this->work(add), 80);
  int injected = 0;
  for (const char* const function : functions) {
    if (!makes_or_asks(function)) {
      continue;
    }
    const auto calls_so_far = [function] { return opencl_layer::calls(function); };
    const int start = calls_so_far();
    ASSERT_EQ(this->work(add), 80);
    const int occurrences = calls_so_far() - start;
    for (int i = 0; i < occurrences; ++i) {
      this->settle(idle);
      const int begin = calls_so_far();
      opencl_layer::fail(function, i, CL_OUT_OF_RESOURCES);
      std::int64_t sum = -1;
      try {
        sum = this->work(add);
      } catch (const sycl::exception&) {
      }
      this->queue->wait_and_throw();
      this->settle(idle);
      EXPECT_EQ(this->living(), idle) << function << " " << i;
      injected += calls_so_far() - begin > i ? 1 : 0;
      opencl_layer::reset();
      const bool logged = !this->errors.take().empty();
      // An ask that fails may be repeated.
      EXPECT_TRUE(logged || sum == -1 || sum == 80) << function << " " << i;
    }
  }
  EXPECT_GE(injected, 10);
  EXPECT_EQ(this->work(add), 80);
}

TYPED_TEST(sycl_failures, threads_share_a_queue) {
  constexpr int threads = 4;
  constexpr int rounds = 25;
  std::vector<typename TypeParam::memory> places;
  for (int t = 0; t < threads; ++t) {
    places.push_back(this->filled(std::vector<int>(16, t)));
  }
  std::vector<std::thread> team;
  for (std::size_t t = 0; t < threads; ++t) {
    team.emplace_back([&, t] {
      int own_status = 0;
      sycl::kernel own = this->kernel("add");
      const arguments args{this->of_memory(places[t]), of_scalar(1)};
      for (int r = 0; r < rounds; ++r) {
        sycl::event* launched =
            TypeParam::launch_1D(&own_status, &*this->queue, &own, args.data(), 16, 4, nullptr);
        TypeParam::host_wait(&own_status, launched);
        TypeParam::release(&own_status, launched);
      }
    });
  }
  for (std::thread& each : team) {
    each.join();
  }
  for (int t = 0; t < threads; ++t) {
    EXPECT_EQ(this->template contents<int>(places[static_cast<std::size_t>(t)], 16),
              std::vector<int>(16, t + rounds));
  }
}

}  // namespace
