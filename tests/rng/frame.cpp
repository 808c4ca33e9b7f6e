// SPDX-License-Identifier: Apache-2.0
// The frame of a generate call: which check comes first, what each raises, what is left alone.
#include <cstdint>
#include <initializer_list>
#include <limits>
#include <string>
#include <tarn_serv.h>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "frame/checks.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using tarn_test::draw;
using tarn_test::marker;
using tarn_test::message_of;

const std::string bad_n = "kestrel::tarn::rng::generate: invalid argument: n";
const std::string bad_r = "kestrel::tarn::rng::generate: invalid argument: r";

class frame : public tarn_test::over_queues {};
TARN_OVER_QUEUES(frame);
TARN_REPORTS_CUDA(frame)

std::string pointer_refusal(rng::philox4x32x10& engine, std::int64_t n, float* r) {
  return message_of<tarn::invalid_argument>(
      [&] { rng::generate(rng::uniform<float>(), engine, n, r); });
}

TEST_P(frame, refuses_a_negative_count_before_a_null_pointer) {
  rng::philox4x32x10 engine(queue());
  float value = 7.0f;
  EXPECT_EQ(pointer_refusal(engine, -1, &value), bad_n);
  EXPECT_EQ(pointer_refusal(engine, -1, nullptr), bad_n);
  EXPECT_EQ(pointer_refusal(engine, std::numeric_limits<std::int64_t>::min(), nullptr), bad_n);
  EXPECT_EQ(pointer_refusal(engine, 1, nullptr), bad_r);
  EXPECT_EQ(pointer_refusal(engine, 0, nullptr), bad_r);
  EXPECT_EQ(value, 7.0f);
}

TEST_P(frame, a_refused_call_leaves_the_engine_where_it_was) {
  rng::philox4x32x10 engine(queue(), 5);
  rng::philox4x32x10 untouched(queue(), 5);
  pointer_refusal(engine, -1, nullptr);
  pointer_refusal(engine, 10, nullptr);
  const rng::bits<> bits;
  EXPECT_EQ(draw(bits, engine, 9), draw(bits, untouched, 9));
}

TEST_P(frame, takes_a_buffer_of_exactly_n_and_refuses_one_short) {
  rng::philox4x32x10 engine(queue());
  std::vector<float> values(8, 3.0f);
  {
    sycl::buffer<float, 1> buffer(values.data(), sycl::range<1>(8));
    const auto call = [&](std::int64_t n) {
      return message_of<tarn::invalid_argument>(
          [&] { rng::generate(rng::uniform<float>(), engine, n, buffer); });
    };
    EXPECT_EQ(call(9), bad_n);
    EXPECT_EQ(call(-1), bad_n);
  }
  EXPECT_EQ(values, std::vector<float>(8, 3.0f));
  {
    sycl::buffer<float, 1> buffer(values.data(), sycl::range<1>(8));
    rng::generate(rng::uniform<float>(), engine, 8, buffer);
  }
  for (const float value : values) {
    EXPECT_NE(value, 3.0f);
  }
}

TEST_P(frame, zero_results_write_nothing_and_move_nothing) {
  rng::philox4x32x10 engine(queue(), 11);
  rng::philox4x32x10 untouched(queue(), 11);
  EXPECT_TRUE(draw(rng::uniform<float>(), engine, 0).empty());
  EXPECT_TRUE(tarn_test::draw_into_buffer(rng::uniform<double>(), engine, 0).empty());
  EXPECT_EQ(draw(rng::bits<>(), engine, 5), draw(rng::bits<>(), untouched, 5));
}

TEST_P(frame, waits_for_its_dependencies) {
  sycl::queue on = queue();
  rng::philox4x32x10 engine(on, 3);
  constexpr std::size_t count = 1 << 20;
  auto* values = sycl::malloc_shared<std::uint32_t>(count, on);
  // Whatever the fill leaves behind must be overwritten by the call, not the other way round.
  const sycl::event fill = on.fill(values, marker<std::uint32_t>(), count);
  rng::generate(rng::bits<>(), engine, count, values, {fill}).wait();
  rng::philox4x32x10 again(on, 3);
  EXPECT_EQ(std::vector<std::uint32_t>(values, values + count), draw(rng::bits<>(), again, count));
  sycl::free(values, on);
}

TEST(frame_on_a_cpu, returns_a_completed_event) {
  rng::philox4x32x10 engine(tarn_test::cpu_queue());
  float value = 0.0f;
  const sycl::event event = rng::generate(rng::uniform<float>(), engine, 1, &value);
  EXPECT_EQ(event.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::complete);
}

// A host routine reports bad parameters by itself; no exception, nothing drawn, nothing moved.
TEST(frame_on_a_cpu, bad_bounds_are_reported_and_write_nothing) {
  static std::string report;
  tarn_serv_set_xerbla_interface(
      reinterpret_cast<void*>(+[](const char* name, const int* position, int length) {
        report =
            std::string(name, static_cast<std::size_t>(length)) + ":" + std::to_string(*position);
      }),
      0);
  rng::philox4x32x10 engine(tarn_test::cpu_queue(), 2);
  const auto refused = [&](const auto& distr) {
    using T = typename std::decay_t<decltype(distr)>::result_type;
    report.clear();
    for (const T value : draw(distr, engine, 2500)) {
      EXPECT_TRUE(tarn_test::same_bits(value, marker<T>()));
    }
    return report;
  };
  using accurate = rng::uniform_method::accurate;
  EXPECT_EQ(refused(rng::uniform<float>(1.0f, 1.0f)), "rvxsRngUniform:5");
  EXPECT_EQ(refused(rng::uniform<double>(2.0, 1.0)), "rvxdRngUniform:5");
  EXPECT_EQ(refused(rng::uniform<std::int32_t>(3, 3)), "rvxiRngUniform:5");
  EXPECT_EQ(refused(rng::uniform<std::int32_t, accurate>(3, 3)), "rvxdRngUniform:5");
  EXPECT_EQ(refused(rng::uniform<std::uint32_t>(4, 3)), "rvxdRngUniform:5");
  tarn_serv_set_xerbla_interface(nullptr, 1);
  rng::philox4x32x10 untouched(tarn_test::cpu_queue(), 2);
  EXPECT_EQ(draw(rng::bits<>(), engine, 5), draw(rng::bits<>(), untouched, 5));
}

TEST(frame_on_an_accelerator, constructors_refuse_the_device) {
  const sycl::queue queue = tarn_test::accelerator_queue();
  const std::string name = queue.get_device().get_info<sycl::info::device::name>();
  const std::string message = "kestrel::tarn::rng::philox4x32x10: unsupported device: " + name;
  EXPECT_EQ(message_of<tarn::unsupported_device>([&] { rng::philox4x32x10 engine(queue, 1); }),
            message);
  EXPECT_EQ(message_of<tarn::unsupported_device>([&] {
              rng::philox4x32x10 engine(queue, {1, 2});
            }),
            message);
}

// Copy assignment takes the queue over and keeps the implementation, without a word. So an engine
// can come to stand on a device without a road, and generate is where it is told.
TEST(frame_on_an_accelerator, generate_refuses_the_device_after_the_other_checks) {
  rng::philox4x32x10 engine(tarn_test::cpu_queue(), 9);
  rng::philox4x32x10 stranded(tarn_test::cpu_queue(), 9);
  stranded.get_queue() = tarn_test::accelerator_queue();
  const std::string name = stranded.get_queue().get_device().get_info<sycl::info::device::name>();
  float value = 4.0f;
  EXPECT_EQ(message_of<tarn::unsupported_device>(
                [&] { rng::generate(rng::uniform<float>(), stranded, 1, &value); }),
            "kestrel::tarn::rng::generate: unsupported device: " + name);
  EXPECT_EQ(value, 4.0f);
  EXPECT_EQ(pointer_refusal(stranded, -1, &value), bad_n);
  EXPECT_EQ(pointer_refusal(stranded, 1, nullptr), bad_r);

  engine = stranded;
  EXPECT_EQ(engine.get_queue(), stranded.get_queue());
  engine.get_queue() = tarn_test::cpu_queue();
  rng::philox4x32x10 fresh(tarn_test::cpu_queue(), 9);
  EXPECT_EQ(draw(rng::bits<>(), engine, 6), draw(rng::bits<>(), fresh, 6));

  EXPECT_EQ(message_of<tarn::unsupported_device>([&] { rng::philox4x32x10 copy(stranded); }),
            "kestrel::tarn::rng::philox4x32x10: unsupported device: " + name);
}

TEST(frame_on_a_gpu, a_range_past_the_limit_raises_the_runtimes_error_and_writes_nothing) {
  rng::philox4x32x10 engine(tarn_test::gpu_queue(), 21);
  float value = 6.0f;
  const std::string limit =
      "Provided range is out of integer limits. Pass `-fno-sycl-id-queries-fit-in-int' to disable "
      "range check.";
  const std::int64_t first_refused = 4 * ((std::int64_t{1} << 31) - 1) + 1;
  for (const std::int64_t n : {first_refused, std::numeric_limits<std::int64_t>::max()}) {
    EXPECT_EQ(message_of<sycl::exception>(
                  [&] { rng::generate(rng::uniform<float>(), engine, n, &value); }),
              limit);
  }
  // Two results for each work-item.
  rng::philox4x32x10 pairs(tarn_test::gpu_queue(), 21);
  std::uint64_t pair = 6;
  EXPECT_EQ(message_of<sycl::exception>([&] {
              rng::generate(rng::uniform_bits<std::uint64_t>(), pairs,
                            2 * ((std::int64_t{1} << 31) - 1) + 1, &pair);
            }),
            limit);
  EXPECT_EQ(value, 6.0f);
  EXPECT_EQ(pair, 6u);
  // The stream had moved before the launch failed, and it stays moved.
  rng::philox4x32x10 moved(tarn_test::gpu_queue(), 21);
  rng::skip_ahead(moved, static_cast<std::uint64_t>(first_refused));
  rng::skip_ahead(moved, static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max()));
  EXPECT_EQ(draw(rng::bits<>(), engine, 8), draw(rng::bits<>(), moved, 8));
}

TEST(frame_on_a_gpu, calls_in_flight_give_consecutive_stretches) {
  sycl::queue queue = tarn_test::gpu_queue();
  rng::philox4x32x10 engine(queue, 77);
  constexpr int calls = 200;
  constexpr std::int64_t size = 1003;  // every call but the first begins in the middle of a block
  auto* values = sycl::malloc_shared<std::uint32_t>(calls * size, queue);
  std::vector<sycl::event> events;
  for (int call = 0; call < calls; ++call) {
    events.push_back(rng::generate(rng::bits<>(), engine, size, values + call * size));
  }
  sycl::event::wait(events);
  rng::philox4x32x10 again(queue, 77);
  EXPECT_EQ(std::vector<std::uint32_t>(values, values + calls * size),
            draw(rng::bits<>(), again, calls * size));
  sycl::free(values, queue);
}

TEST(outputs_wider_than_n, need_a_buffer_for_every_value) {
  using rng::detail::check_output;
  using rng::detail::values_per_result;
  EXPECT_EQ(values_per_result<rng::mcg59>(rng::gaussian_mv<float>(2, {0, 0}, {1, 0, 0, 1})), 2);
  EXPECT_EQ(values_per_result<rng::mcg59>(rng::multinomial<>(3, {0.2, 0.3, 0.5})), 3);
  EXPECT_EQ(values_per_result<rng::mcg59>(rng::gamma<float>()), 1);
  EXPECT_EQ(values_per_result<rng::mcg59>(rng::bits<>()), 2);
  EXPECT_EQ(values_per_result<rng::mcg31m1>(rng::bits<>()), 1);
  EXPECT_EQ(values_per_result<rng::mcg59>(rng::uniform_bits<>()), 1);
  const auto refusal = [](std::int64_t n, std::size_t size, std::int64_t values) {
    return message_of<tarn::invalid_argument>([=] { check_output(n, size, values); });
  };
  EXPECT_EQ(refusal(5, 15, 3), "[nothing raised]");
  EXPECT_EQ(refusal(5, 14, 3), bad_n);
  EXPECT_EQ(refusal(std::numeric_limits<std::int64_t>::max(), 15, 3), bad_n);
  EXPECT_EQ(refusal(0, 0, 3), "[nothing raised]");
}

// A buffer is refused unless it holds all values of n results, and then nothing is written.
template <typename Engine, typename Distr>
std::string buffer_refusal(const Distr& distr, std::int64_t n, std::size_t size) {
  using T = typename Distr::result_type;
  Engine engine(tarn_test::cpu_queue());
  std::vector<T> values(size, T(3));
  std::string message;
  {
    sycl::buffer<T, 1> buffer(values.data(), sycl::range<1>(size));
    message = message_of<tarn::exception>([&] { rng::generate(distr, engine, n, buffer); });
    if (message == "[nothing raised]") {
      return message;
    }
    message = message_of<tarn::invalid_argument>([&] { rng::generate(distr, engine, n, buffer); });
  }
  EXPECT_EQ(values, std::vector<T>(size, T(3)));
  return message;
}

TEST(frame_on_a_cpu, buffers_hold_every_value_of_a_result) {
  const rng::multinomial<> rows(9, {0.25, 0.25, 0.5});
  EXPECT_EQ(buffer_refusal<rng::philox4x32x10>(rows, 5, 15), "[nothing raised]");
  EXPECT_EQ(buffer_refusal<rng::philox4x32x10>(rows, 5, 14), bad_n);
  const rng::gaussian_mv<double> vectors(2, {0, 0}, {1, 0, 0, 1});
  EXPECT_EQ(buffer_refusal<rng::mt19937>(vectors, 5, 9), bad_n);
  EXPECT_EQ(buffer_refusal<rng::mcg59>(rng::bits<>(), 5, 10), "[nothing raised]");
  EXPECT_EQ(buffer_refusal<rng::mcg59>(rng::bits<>(), 5, 9), bad_n);
  EXPECT_EQ(buffer_refusal<rng::mcg31m1>(rng::bits<>(), 5, 5), "[nothing raised]");
}

// The other checks of a call come first.
TEST(frame_on_a_cpu, a_rate_for_each_result_is_asked_for) {
  const std::string message =
      "kestrel::tarn::rng::poisson_v: invalid argument: lambda size should be equal to n";
  rng::philox4x32x10 engine(tarn_test::cpu_queue(), 4);
  const rng::poisson_v<> three({1.0, 2.0, 3.0});
  std::vector<std::int32_t> values(8, -7);
  const auto refusal = [&](std::int64_t n, std::int32_t* r) {
    return message_of<tarn::invalid_argument>([&] { rng::generate(three, engine, n, r); });
  };
  EXPECT_EQ(refusal(2, values.data()), message);
  EXPECT_EQ(refusal(4, values.data()), message);
  EXPECT_EQ(refusal(0, values.data()), message);
  EXPECT_EQ(refusal(-1, values.data()), bad_n);
  EXPECT_EQ(refusal(4, nullptr), bad_r);
  EXPECT_EQ(buffer_refusal<rng::sobol>(three, 4, 8), message);
  EXPECT_EQ(buffer_refusal<rng::sobol>(three, 4, 3), bad_n);
  EXPECT_EQ(values, std::vector<std::int32_t>(8, -7));
  rng::philox4x32x10 untouched(tarn_test::cpu_queue(), 4);
  EXPECT_EQ(draw(rng::bits<>(), engine, 6), draw(rng::bits<>(), untouched, 6));
  engine.get_queue() = tarn_test::accelerator_queue();
  EXPECT_NE(message_of<tarn::unsupported_device>([&] {
              rng::generate(three, engine, 4, values.data());
            }).find("generate: unsupported device"),
            std::string::npos);
}

// Six engines have no words for equidistributed bits.
template <typename Engine>
std::string uniform_bits_refusal() {
  static_assert(rng::detail::is_refused<rng::uniform_bits<std::uint32_t>, Engine> &&
                rng::detail::is_refused<rng::uniform_bits<std::uint64_t>, Engine> &&
                !rng::detail::is_refused<rng::bits<std::uint32_t>, Engine>);
  return message_of<tarn::unimplemented>([] { rng::detail::refuse_uniform_bits<Engine>(); });
}

TEST(refused_combinations, name_the_engine) {
  const auto text = [](const std::string& engine) {
    return "kestrel::tarn::rng::generate: unimplemented functionality: uniform_bits distribution "
           "and " +
           engine + " engine combination";
  };
  EXPECT_EQ(uniform_bits_refusal<rng::mcg31m1>(), text("mcg31m1"));
  EXPECT_EQ(uniform_bits_refusal<rng::mrg32k3a>(), text("mrg32k3a"));
  EXPECT_EQ(uniform_bits_refusal<rng::sobol>(), text("sobol"));
  EXPECT_EQ(uniform_bits_refusal<rng::niederreiter>(), text("niederreiter"));
  EXPECT_EQ(uniform_bits_refusal<rng::r250>(), text("r250"));
  EXPECT_EQ(uniform_bits_refusal<rng::wichmann_hill>(), text("wichmann_hill"));
  int offered = 0;
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits_)                                                           \
  offered += rng::detail::is_refused<rng::uniform_bits<std::uint32_t>, rng::name> ? 0 : 1;
#include "engines/engines.def"
  EXPECT_EQ(offered, 13 - 6);
}

}  // namespace
