// SPDX-License-Identifier: Apache-2.0
// Every engine with every distribution on a CPU queue, in both output forms, against the routine of
// the statistics library on a stream of the same seed: the same bits, and the same state
// afterwards.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <dlfcn.h>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "distributions/all.hpp"
#include "every_engine.hpp"
#include "frame/rows.hpp"
#include "queues.hpp"
#include "routine_samples.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

constexpr unsigned char marker = 0xA5;
constexpr std::size_t guard = 64;  // bytes behind the results

/// Results of one call, filled with the marker, with a guard behind them.
class results {
 public:
  results(std::size_t count, std::size_t value_size)
      : size_(count * value_size), value_size_(value_size), bytes_(size_ + guard, marker) {}

  void* data() { return bytes_.data(); }

  void expect_written() const {
    const std::vector<unsigned char> untouched(guard, marker);
    for (std::size_t i = 0; i < size_; i += value_size_) {
      ASSERT_NE(std::memcmp(bytes_.data() + i, untouched.data(), value_size_), 0)
          << "value " << i / value_size_ << " is not written";
    }
    EXPECT_TRUE(std::equal(untouched.begin(), untouched.end(), bytes_.begin() + offset()))
        << "stray store";
  }
  bool operator==(const results& other) const { return bytes_ == other.bytes_; }

 private:
  std::ptrdiff_t offset() const { return static_cast<std::ptrdiff_t>(size_); }

  std::size_t size_;
  std::size_t value_size_;
  std::vector<unsigned char> bytes_;
};

/// generate without its types. They are many, so this is all that is compiled for each pair of an
/// engine and a distribution.
using generate_form = void (*)(const void* distr, void* engine, std::int64_t n, void* output);

template <typename Distr, typename Engine>
void generate_into_memory(const void* distr, void* engine, std::int64_t n, void* r) {
  rng::generate(*static_cast<const Distr*>(distr), *static_cast<Engine*>(engine), n,
                static_cast<typename Distr::result_type*>(r));
}

template <typename Distr, typename Engine>
void generate_into_buffer(const void* distr, void* engine, std::int64_t n, void* buffer) {
  rng::generate(*static_cast<const Distr*>(distr), *static_cast<Engine*>(engine), n,
                *static_cast<sycl::buffer<typename Distr::result_type, 1>*>(buffer));
}

/// What a form is given: a distribution for n results, and memory or a buffer of the values.
template <typename Distr>
void with_memory(generate_form form, void* engine, std::int64_t n, void* r, std::size_t) {
  const Distr distr = sample<Distr>::make(n);
  form(&distr, engine, n, r);
}

template <typename Distr>
void with_buffer(generate_form form, void* engine, std::int64_t n, void* r, std::size_t values) {
  using T = typename Distr::result_type;
  const Distr distr = sample<Distr>::make(n);
  sycl::buffer<T, 1> buffer(static_cast<T*>(r), sycl::range<1>(values));
  form(&distr, engine, n, &buffer);
}

template <typename Distr>
int call_routine(std::int64_t code, rvx_stream stream, std::int64_t n, void* r) {
  return sample<Distr>::draw(code, stream, n, static_cast<typename Distr::result_type*>(r));
}

/// A row without its types.
struct row_case {
  using caller = void (*)(generate_form, void* engine, std::int64_t n, void* r, std::size_t values);

  std::string type, family, method;
  std::size_t value_size;
  const char* entry;
  int (*routine)(std::int64_t code, rvx_stream stream, std::int64_t n, void* r);
  caller memory, buffer;
};

template <typename Distr>
row_case row_of(const char* type, const char* family, const char* method) {
  return {type,
          family,
          method,
          sizeof(typename Distr::result_type),
          sample<Distr>::entry,
          &call_routine<Distr>,
          &with_memory<Distr>,
          &with_buffer<Distr>};
}

std::vector<row_case> rows() {
  using namespace rng;
  using rng::gamma;  // <math.h> has one as well
  return {
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  row_of<TARN_UNWRAP type>(#type, #family, #method),
#include "distributions/distributions.def"
  };
}

struct forms {
  generate_form memory, buffer;
};

template <typename Engine>
std::vector<forms> forms_of_rows() {
  using namespace rng;
  using rng::gamma;
  return {
#define TARN_FORMS(...) \
  forms{&generate_into_memory<__VA_ARGS__, Engine>, &generate_into_buffer<__VA_ARGS__, Engine>},
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) TARN_FORMS type
#include "distributions/distributions.def"
  };
}

/// One row on one engine in one form.
template <typename Engine>
void expect_the_routines_values(const engine_case<Engine>& on, const row_case& row, std::int64_t n,
                                row_case::caller call, generate_form form) {
  const auto count = static_cast<std::size_t>(n * width_of(row.family, on.code));
  Engine engine = on.make(cpu_queue());
  results drawn(count, row.value_size);
  call(form, &engine, n, drawn.data(), count);
  drawn.expect_written();
  if (on.repeats()) {
    const plain_stream stream(on.code, on.seed);
    results expected(count, row.value_size);
    ASSERT_EQ(row.routine(code_of(row.family, row.method), stream, n, expected.data()), 0);
    EXPECT_EQ(drawn, expected);
    EXPECT_EQ(image_of(engine), stream.bytes());
  }
}

template <typename Distr, typename = void>
inline constexpr bool has_method = false;
template <typename Distr>
inline constexpr bool has_method<Distr, std::void_t<typename Distr::method_type>> = true;

template <typename Engine>
void expect_refusal(const engine_case<Engine>& on, const row_case& row, const forms& form) {
  Engine engine = on.make(cpu_queue());
  results drawn(2, row.value_size);
  EXPECT_THROW(row.memory(form.memory, &engine, 1, drawn.data(), 2), kestrel::tarn::unimplemented);
  EXPECT_THROW(row.buffer(form.buffer, &engine, 1, drawn.data(), 2), kestrel::tarn::unimplemented);
  EXPECT_EQ(drawn, results(2, row.value_size));
}

TEST(host_rows, give_the_values_of_their_routines_on_every_engine) {
  int combinations = 0;
  const std::vector<row_case> all = rows();
  for_every_engine([&](const auto& on) {
    using Engine = typename std::decay_t<decltype(on)>::Engine;
    const std::vector<forms> of_engine = forms_of_rows<Engine>();
    for (std::size_t i = 0; i < all.size(); ++i) {
      const row_case& row = all[i];
      const forms& form = of_engine[i];
      SCOPED_TRACE(row.type);
      ++combinations;
      if (row.family == "uniform_bits" && !on.uniform_bits) {
        expect_refusal(on, row, form);
        continue;
      }
      // Calling an entry that the library lacks ends the process.
      if (dlsym(RTLD_DEFAULT, row.entry) == nullptr) {
        ADD_FAILURE() << "the statistics library has no " << row.entry;
        continue;
      }
      for (const std::int64_t n : {3, 2050}) {  // on either side of the block of integer uniforms
        expect_the_routines_values(on, row, n, row.memory, form.memory);
        expect_the_routines_values(on, row, n, row.buffer, form.buffer);
      }
    }
  });
  EXPECT_EQ(combinations, 13 * 89);
}

template <typename Distr>
void expect_code(const std::string& family, const std::string& method) {
  if constexpr (has_method<Distr>) {
    EXPECT_EQ(rng::detail::method_code<typename Distr::method_type>, code_of(family, method))
        << family << ' ' << method;
  } else {
    EXPECT_EQ(method, "none");
  }
}

// Values seldom tell whether the flag of an accurate method is there.
TEST(host_rows, have_the_codes_of_their_methods) {
  using namespace rng;
  using rng::gamma;
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  expect_code<TARN_UNWRAP type>(#family, #method);
#include "distributions/distributions.def"
}

}  // namespace
