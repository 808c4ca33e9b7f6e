// SPDX-License-Identifier: Apache-2.0
// Where results may go: to any element of an array, aligned for wide stores or not, in memory of
// each kind. The results are always the same, and the elements around them keep theirs.
#include <algorithm>
#include <cstdint>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

const std::vector<std::int64_t> counts = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 130, 1001};
/// Elements before the first result: over all places that a store of 16 bytes can meet.
constexpr std::size_t most_before = 5;

template <typename T>
std::vector<T> marked(std::size_t size) {
  return std::vector<T>(size, marker<T>());
}

/// `values` behind `before` elements of an array, and what lies around them.
template <typename T>
std::vector<T> framed(std::size_t before, const std::vector<T>& values) {
  std::vector<T> all = marked<T>(before + values.size() + guard_size);
  std::copy(values.begin(), values.end(), all.begin() + static_cast<std::ptrdiff_t>(before));
  return all;
}

template <typename T>
bool same_array(const std::vector<T>& x, const std::vector<T>& y) {
  return x.size() == y.size() && std::equal(x.begin(), x.end(), y.begin(), same_bits<T>);
}

/// An array of memory of one kind, on the host and back by copies.
template <typename T>
class array_of {
 public:
  array_of(const sycl::queue& queue, sycl::usm::alloc kind, const std::vector<T>& from)
      : queue_(queue), size_(from.size()), data_(sycl::malloc<T>(size_, queue_, kind)) {
    queue_.copy(from.data(), data_, size_).wait_and_throw();
  }
  array_of(const array_of&) = delete;
  array_of& operator=(const array_of&) = delete;
  ~array_of() { sycl::free(data_, queue_); }

  T* data() const { return data_; }
  std::vector<T> values() {
    std::vector<T> all(size_);
    queue_.copy(static_cast<const T*>(data_), all.data(), size_).wait_and_throw();
    return all;
  }

 private:
  sycl::queue queue_;
  std::size_t size_;
  T* data_;
};

template <typename T, typename Distr, typename Engine>
std::vector<T> draw_behind(sycl::usm::alloc kind, std::size_t before, const Distr& distr,
                           Engine& engine, std::int64_t n) {
  array_of<T> memory(engine.get_queue(), kind,
                     marked<T>(before + static_cast<std::size_t>(n) + guard_size));
  rng::generate(distr, engine, n, memory.data() + before).wait_and_throw();
  return memory.values();
}

template <typename T, typename Distr, typename Engine>
std::vector<T> draw_into_buffer_behind(std::size_t before, const Distr& distr, Engine& engine,
                                       std::int64_t n) {
  std::vector<T> all = marked<T>(before + static_cast<std::size_t>(n) + guard_size);
  {
    sycl::buffer<T, 1> buffer(all.data() + before, sycl::range<1>(all.size() - before));
    rng::generate(distr, engine, n, buffer);
  }
  return all;
}

/// A distribution through every place, in shared memory and in a buffer.
template <typename Engine, typename Distr>
void expect_any_place(const sycl::queue& queue, const Distr& distr) {
  using T = typename Distr::result_type;
  for (const std::int64_t n : counts) {
    Engine plain(queue, 7);
    const std::vector<T> values = draw(distr, plain, n);
    for (std::size_t before = 0; before <= most_before; ++before) {
      SCOPED_TRACE(std::to_string(n) + " results behind " + std::to_string(before));
      Engine engine(queue, 7);
      Engine same(queue, 7);
      const std::vector<T> expected = framed(before, values);
      ASSERT_TRUE(
          same_array(draw_behind<T>(sycl::usm::alloc::shared, before, distr, engine, n), expected));
      ASSERT_TRUE(same_array(draw_into_buffer_behind<T>(before, distr, same, n), expected));
    }
  }
}

/// Results of four and eight bytes, in fours and in pairs.
template <typename Engine>
void expect_any_place_of_every_width(const sycl::queue& queue) {
  expect_any_place<Engine>(queue, rng::uniform<float>(-1.0f, 2.0f));
  expect_any_place<Engine>(queue, rng::uniform<double>(-1.0, 2.0));
  expect_any_place<Engine>(queue, rng::bernoulli<std::int32_t>(0.25f));
  expect_any_place<Engine>(queue, rng::gaussian<float, rng::gaussian_method::box_muller>());
  expect_any_place<Engine>(queue, rng::gaussian<double, rng::gaussian_method::box_muller>());
  expect_any_place<Engine>(queue, rng::gaussian<float, rng::gaussian_method::box_muller2>());
  expect_any_place<Engine>(queue, rng::gaussian<double, rng::gaussian_method::box_muller2>());
}

class output_memory : public over_queues {};
TARN_OVER_QUEUES(output_memory);
TARN_REPORTS_CUDA(output_memory)

TEST_P(output_memory, begins_at_any_element_for_engines_by_value) {
  expect_any_place_of_every_width<rng::philox4x32x10>(queue());
  expect_any_place_of_every_width<rng::mrg32k3a>(queue());
  expect_any_place<rng::philox4x32x10>(queue(), rng::uniform_bits<std::uint64_t>());
  expect_any_place<rng::mcg31m1>(queue(), rng::uniform<float>());
  expect_any_place<rng::mcg59>(queue(), rng::uniform<double>());
}

TEST_P(output_memory, begins_at_any_element_for_teams) {
  expect_any_place_of_every_width<rng::mt19937>(queue());
  expect_any_place<rng::mt19937>(queue(), rng::uniform_bits<std::uint64_t>());
}

// The seed is the count of dimensions: with one, results of a work-item are neighbours.
TEST_P(output_memory, begins_at_any_element_for_points) {
  const auto any_place = [this](std::uint32_t dimensions, const auto& distr) {
    using T = typename std::decay_t<decltype(distr)>::result_type;
    for (const std::int64_t n : counts) {
      rng::sobol plain(queue(), dimensions);
      const std::vector<T> values = draw(distr, plain, n);
      for (std::size_t before = 0; before <= most_before; ++before) {
        SCOPED_TRACE(std::to_string(n) + " results behind " + std::to_string(before));
        rng::sobol engine(queue(), dimensions);
        ASSERT_TRUE(same_array(draw_behind<T>(sycl::usm::alloc::shared, before, distr, engine, n),
                               framed(before, values)));
      }
    }
  };
  for (const std::uint32_t dimensions : {1u, 2u, 3u}) {
    any_place(dimensions, rng::uniform<float>(-1.0f, 2.0f));
    any_place(dimensions, rng::uniform<double>(-1.0, 2.0));
    any_place(dimensions, rng::gaussian<float, rng::gaussian_method::box_muller>());
    any_place(dimensions, rng::gaussian<double, rng::gaussian_method::box_muller2>());
  }
}

// Memory of a device cannot be read on the host; it is copied.
TEST_P(output_memory, is_of_any_kind) {
  const rng::uniform<float> distr(-1.0f, 2.0f);
  for (const std::int64_t n : counts) {
    rng::philox4x32x10 plain(queue(), 7);
    const std::vector<float> values = draw(distr, plain, n);
    for (const sycl::usm::alloc kind :
         {sycl::usm::alloc::device, sycl::usm::alloc::host, sycl::usm::alloc::shared}) {
      rng::philox4x32x10 engine(queue(), 7);
      ASSERT_TRUE(same_array(draw_behind<float>(kind, 1, distr, engine, n), framed(1, values)))
          << n << " into kind " << static_cast<int>(kind);
    }
  }
}

TEST_P(output_memory, of_a_device_takes_what_several_kernels_make) {
  const rng::gamma<double> distr(2.5);
  rng::philox4x32x10 plain(queue(), 7);
  const std::vector<double> values = draw(distr, plain, 3001);
  rng::philox4x32x10 engine(queue(), 7);
  EXPECT_TRUE(same_array(draw_behind<double>(sycl::usm::alloc::device, 3, distr, engine, 3001),
                         framed(3, values)));
}

}  // namespace
