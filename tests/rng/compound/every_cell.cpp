// SPDX-License-Identifier: Apache-2.0
// Every engine that has a device road with every distribution there is, on a GPU in both output
// forms: results of the support, the same bits in either form, nothing left out and nothing behind
// them. What is refused instead is refused by rule, and nothing else is.
#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "frame/rows.hpp"
#include "level_calls.hpp"
#include "message.hpp"
#include "routine_samples.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

constexpr std::int64_t n = 37;

/// The distribution of a row for n results. A device counts few trials over many categories, which
/// a host's parameters are not.
template <typename Distr>
struct cell : sample<Distr> {};
template <typename T, typename Method>
struct cell<rng::multinomial<T, Method>> {
  static constexpr std::int32_t ntrial = 3;
  static constexpr std::size_t categories = 50;
  static auto make(std::int64_t) {
    return rng::multinomial<T, Method>(ntrial, std::vector<double>(categories, 1.0 / categories));
  }
};

std::size_t values_of(const std::string& family, std::int64_t engine_code) {
  constexpr std::size_t categories = cell<rng::multinomial<>>::categories;
  const std::size_t width = family == "multinomial"
                                ? categories
                                : static_cast<std::size_t>(width_of(family, engine_code));
  return static_cast<std::size_t>(n) * width;
}

struct support {
  double lo, hi;
};

/// Where the results of the samples lie. Ends that a law has not are those of what is finite, or so
/// far out that no seed gets there: a poisson of rate 50 passes 500 once in 10^300 results.
support support_of(const std::string& family) {
  constexpr double most = std::numeric_limits<double>::max();
  const struct {
    const char* family;
    support values;
  } known[] = {
      {"uniform", {3, 1000}},
      {"gaussian", {-most, most}},
      {"lognormal", {-3, most}},
      {"exponential", {-1, most}},
      {"gamma", {0.25, most}},
      {"beta", {-1, 2}},
      {"chi_square", {0, most}},
      {"weibull", {-2, most}},
      {"rayleigh", {-1, most}},
      {"gumbel", {-most, most}},
      {"laplace", {-most, most}},
      {"cauchy", {-most, most}},
      {"gaussian_mv", {-most, most}},
      {"poisson", {0, 500}},
      {"poisson_v", {0, 500}},
      {"binomial", {0, 200}},
      {"negative_binomial", {0, 1000}},
      {"hypergeometric", {0, 150}},
      {"multinomial", {0, cell<rng::multinomial<>>::ntrial}},
      {"geometric", {0, 1000}},
      {"bernoulli", {0, 1}},
      {"bits", {0, std::numeric_limits<std::uint32_t>::max()}},
      {"uniform_bits", {0, 0x1p64}},
  };
  for (const auto& one : known) {
    if (family == one.family) {
      return one.values;
    }
  }
  ADD_FAILURE() << "no support is known of " << family;
  return {};
}

/// generate without its types, over on return: all that is compiled for each pair of an engine and
/// a distribution.
using generate_form = void (*)(const void* distr, void* engine, void* output);

template <typename Distr, typename Engine>
void generate_into_memory(const void* distr, void* engine, void* r) {
  rng::generate(*static_cast<const Distr*>(distr), *static_cast<Engine*>(engine), n,
                static_cast<typename Distr::result_type*>(r))
      .wait_and_throw();
}

template <typename Distr, typename Engine>
void generate_into_buffer(const void* distr, void* engine, void* buffer) {
  rng::generate(*static_cast<const Distr*>(distr), *static_cast<Engine*>(engine), n,
                *static_cast<sycl::buffer<typename Distr::result_type, 1>*>(buffer));
}

struct forms {
  generate_form memory, buffer;
};

/// One form of a cell: the elements of the output, guard included, and what was raised instead.
template <typename T>
struct outcome {
  std::vector<T> values;
  std::string refusal;
};

template <typename Distr>
auto into_memory(generate_form form, void* engine, const sycl::queue& queue, std::size_t size) {
  using T = typename Distr::result_type;
  const Distr distr = cell<Distr>::make(n);
  const results<T> memory(queue, size + guard_size);
  const std::string refusal =
      message_of<kestrel::tarn::unimplemented>([&] { form(&distr, engine, memory.get()); });
  return outcome<T>{memory.values(), refusal};
}

template <typename Distr>
auto into_buffer(generate_form form, void* engine, std::size_t size) {
  using T = typename Distr::result_type;
  const Distr distr = cell<Distr>::make(n);
  outcome<T> of{std::vector<T>(size + guard_size, marker<T>()), ""};
  {
    sycl::buffer<T, 1> buffer(of.values.data(), sycl::range<1>(of.values.size()));
    of.refusal = message_of<kestrel::tarn::unimplemented>([&] { form(&distr, engine, &buffer); });
  }
  return of;
}

template <typename T>
bool is_marker(const T& value) {
  return same_bits(value, marker<T>());
}

/// All of the results are there, they lie where they may, and they are not one number.
template <typename T>
void expect_results(const std::vector<T>& values, std::size_t size, const support& of) {
  const auto behind = values.begin() + static_cast<std::ptrdiff_t>(size);
  EXPECT_TRUE(std::none_of(values.begin(), behind, is_marker<T>)) << "a value is not written";
  EXPECT_TRUE(std::all_of(behind, values.end(), is_marker<T>)) << "stray store";
  EXPECT_TRUE(std::all_of(values.begin(), behind, [&](T value) {
    const auto x = static_cast<double>(value);
    return x >= of.lo && x <= of.hi;
  })) << "a value is outside of the support";
  EXPECT_TRUE(std::any_of(values.begin(), behind, [&](T value) { return value != values[0]; }));
}

/// What a row has to know of an engine.
struct engine_face {
  const char* name;
  std::int64_t code;
  bool uniform_bits;
  sycl::queue queue;
};

/// A row without its types. `run` takes two equal engines and returns what was raised, the same in
/// both forms.
struct row_case {
  std::string type, family, method;
  bool on_gpus;
  std::string (*run)(const row_case& row, const forms& form, const engine_face& on, void* engine,
                     void* same);
};

template <typename Distr>
std::string run_cell(const row_case& row, const forms& form, const engine_face& on, void* engine,
                     void* same) {
  const std::size_t size = values_of(row.family, on.code);
  const auto memory = into_memory<Distr>(form.memory, engine, on.queue, size);
  const auto buffer = into_buffer<Distr>(form.buffer, same, size);
  EXPECT_EQ(memory.refusal, buffer.refusal);
  EXPECT_TRUE(std::equal(memory.values.begin(), memory.values.end(), buffer.values.begin(),
                         buffer.values.end(), same_bits<typename Distr::result_type>))
      << "the two forms part";
  if (memory.refusal == "[nothing raised]") {
    expect_results(memory.values, size, support_of(row.family));
  } else {
    EXPECT_TRUE(std::all_of(memory.values.begin(), memory.values.end(),
                            is_marker<typename Distr::result_type>))
        << "a refused call has written";
  }
  return memory.refusal;
}

template <typename Distr>
row_case row_of(const char* type, const char* family, const char* method) {
  return {type, family, method, rng::detail::distribution_row<Distr>::gpu, &run_cell<Distr>};
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

/// What the call of a row has to raise.
std::string refusal_of(const row_case& row, const engine_face& on) {
  const std::string begin = "kestrel::tarn::rng::generate: unimplemented functionality: ";
  if (row.family == "uniform_bits" && !on.uniform_bits) {
    return begin + "uniform_bits distribution and " + on.name + " engine combination";
  }
  if (row.family == "poisson" && row.method == "ptpe") {
    return begin + "poisson distribution with ptpe method on a GPU device";
  }
  return "[nothing raised]";
}

TARN_REPORTS_CUDA(cells)

TEST(cells, rows_on_cpu_queues_alone_are_those_of_the_method_that_devices_lack) {
  int rows_without = 0;
  for (const row_case& row : rows()) {
    EXPECT_EQ(row.on_gpus, row.method != "ptpe") << row.type;
    rows_without += row.on_gpus ? 0 : 1;
  }
  EXPECT_EQ(rows_without, 2);
  EXPECT_EQ(rows().size(), 89u);
}

template <typename... Cases>
constexpr std::size_t count_of(testing::Types<Cases...>) {
  return sizeof...(Cases);
}
static_assert(count_of(device_cases()) == 7);

template <typename Case>
class cells_of : public testing::Test {};
TYPED_TEST_SUITE(cells_of, device_cases, case_name);

TYPED_TEST(cells_of, every_row_in_both_forms) {
  using Engine = typename TypeParam::Engine;
  const engine_face on{TypeParam::name, TypeParam::code, TypeParam::uniform_bits, gpu_queue()};
  const std::vector<row_case> all = rows();
  const std::vector<forms> of_engine = forms_of_rows<Engine>();
  ASSERT_EQ(all.size(), of_engine.size());
  std::size_t drawn = 0;
  std::size_t refused = 0;
  for (std::size_t i = 0; i < all.size(); ++i) {
    SCOPED_TRACE(all[i].type);
    Engine engine = TypeParam::make(on.queue);
    Engine same = TypeParam::make(on.queue);
    const std::string refusal = all[i].run(all[i], of_engine[i], on, &engine, &same);
    EXPECT_EQ(refusal, refusal_of(all[i], on));
    ++(refusal == "[nothing raised]" ? drawn : refused);
    EXPECT_EQ(next(engine, 3), next(same, 3)) << "the forms leave the engine at two places";
    if (refusal != "[nothing raised]") {
      expect_next<TypeParam>(engine, 3, 3);
    }
  }
  EXPECT_EQ(drawn + refused, 89u);
  EXPECT_EQ(refused, TypeParam::uniform_bits ? 2u : 4u);
}

}  // namespace
