// SPDX-License-Identifier: Apache-2.0
// A caller's stream that cannot be moved: the generator has its results all the same, and tells the
// status of the stream service.
#include <cstdint>
#include <vector>

#include "drawn.hpp"
#include "engines.hpp"
#include "offload/generator.hpp"

namespace {

using namespace tarn_test;
namespace openmp = rng::detail::openmp;

template <typename Engine>
class offload_failed_skip : public testing::Test {
 protected:
  using row = offload_engine<Engine>;
  static constexpr std::int64_t n = 1000;

  /// The results of a generator whose stream loses its mark once the generator is there.
  template <typename Distr>
  std::vector<typename Distr::result_type> drawn_without_mark(const Distr& distr, int status) {
    const caller_stream stream = row::at(3);
    const results<typename Distr::result_type> out(common_queue(), n);
    openmp::generator_impl<Engine, Distr> made(stream, distr, common_queue());
    EXPECT_EQ(made.status, 0);
    auto& mark = static_cast<unsigned char*>(static_cast<rvx_stream>(stream))[4];
    const unsigned char was = mark;
    EXPECT_NE(was, 0);
    mark = 0;
    sycl::event kernels;
    made.generate(kernels, n, out.get());
    mark = was;
    kernels.wait();
    EXPECT_EQ(made.status, status);
    return out.values();
  }
};

// mt2203 is not here: this library moves its records by itself, which cannot fail.
using engines_with_a_skip = testing::Types<rng::mcg31m1, rng::mrg32k3a, rng::mcg59, rng::sobol,
                                           rng::mt19937, rng::philox4x32x10>;
TYPED_TEST_SUITE(offload_failed_skip, engines_with_a_skip, offload_engine_name);

TYPED_TEST(offload_failed_skip, is_the_status_and_the_results_are_there) {
  caller_stream same = offload_engine<TypeParam>::at(3);
  auto engine = engine_at<TypeParam>(same);
  const rng::uniform<float> law(0, 1);
  EXPECT_EQ(this->drawn_without_mark(law, -1006), draw(law, engine, this->n));
}

TYPED_TEST(offload_failed_skip, is_the_status_of_rejecting_families_as_well) {
  caller_stream same = offload_engine<TypeParam>::at(3);
  auto engine = engine_at<TypeParam>(same);
  const rng::gamma<double> law(2.5, 0, 1);
  EXPECT_EQ(this->drawn_without_mark(law, -1006), draw(law, engine, this->n));
}

// A rejecting family has its results before the stream is to be moved: here they are put over the
// stream's mark.
TEST(offload_failed_skip_in_an_entry, is_what_it_returns_and_nobody_is_told) {
  const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
  gpu_interop interop(common_queue());
  const std::int32_t expected =
      draw_wide(drawing_of<offload::viBinomial>(0, taken::by_rejection, rng::binomial<>(200, 0.3),
                                                200, 0.3),
                caller_stream(stream), 1, interop)
          .at(0);
  interop.set_completion([](void*) { ADD_FAILURE() << "told of a call that failed"; });
  auto* const mark = static_cast<std::int32_t*>(static_cast<rvx_stream>(stream)) + 1;
  const std::int32_t was = *mark;
  for (const bool nowait : {false, true}) {
    interop.set_nowait(nowait);
    const int status =
        tarn_rvx_viRngBinomial_omp_offload_lp64(0, stream, 1, mark, 200, 0.3, interop.handle());
    const std::int32_t value = *mark;
    *mark = was;
    EXPECT_EQ(status, -1006);
    EXPECT_EQ(value, expected);
  }
  EXPECT_EQ(omptarget::mistakes(), 0);
}

}  // namespace
