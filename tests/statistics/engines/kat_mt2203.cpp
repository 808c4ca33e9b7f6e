// SPDX-License-Identifier: Apache-2.0
// The recurrence and the tempering of mt2203 against published answers. These belong to members of
// another family of the same shape, so the kernels are compiled into this program and run with
// their constants; the plain model, which the library's own members are held to, is run as well.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/kat_mt2203.cpp"
#include <hwy/foreach_target.h>
#include <hwy/highway.h>

#include "engines/mt2203.hpp"
#include "engines/twister_simd.hpp"

HWY_BEFORE_NAMESPACE();
namespace known_members::HWY_NAMESPACE {

using tarn::statistics::twister_constants;
using tarn::statistics::mt2203::shape;

void extend(const twister_constants& constants, std::uint32_t* words, std::size_t count) {
  tarn::statistics::HWY_NAMESPACE::extend_twister<shape>(constants, words, count);
}

void temper(const twister_constants& constants, const std::uint32_t* words, std::size_t n,
            std::uint32_t* out) {
  tarn::statistics::HWY_NAMESPACE::temper<shape>(constants, words, n, out);
}

}  // namespace known_members::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
#include "../../kat/kat_file.hpp"
#include "../../models/block_model.hpp"
#include "../any_stream.hpp"

namespace {

using tarn::statistics::twister_constants;

constexpr std::size_t order = 69;

struct target_kernels {
  const char* target;
  decltype(&known_members::HWY_NAMESPACE::extend) extend;
  decltype(&known_members::HWY_NAMESPACE::temper) temper;
};

#define KERNELS_OF(name) \
  { #name, known_members::N_##name::extend, known_members::N_##name::temper }
constexpr target_kernels all_kernels[] = {
#if HWY_TARGETS & HWY_AVX3
    KERNELS_OF(AVX3),
#endif
#if HWY_TARGETS & HWY_AVX2
    KERNELS_OF(AVX2),
#endif
#if HWY_TARGETS & HWY_SSE4
    KERNELS_OF(SSE4),
#endif
#if HWY_TARGETS & HWY_SSSE3
    KERNELS_OF(SSSE3),
#endif
#if HWY_TARGETS & HWY_SCALAR
    KERNELS_OF(SCALAR),
#endif
};
#undef KERNELS_OF

// A member with known answers, and its answers: outputs from index `at` on, for a seed.
struct known {
  std::size_t line;
  twister_constants constants;
  std::uint32_t seed;
  std::size_t at;
  std::vector<std::uint32_t> words;
};

std::vector<known> known_answers() {
  std::vector<known> all;
  known current{};
  for (const tarn::kat::line& next : tarn::kat::read_file(TARN_KAT_FOLDER, "mt2203")) {
    const std::string& kind = next.fields.at(0);
    if (kind == "id") {
      const auto field = [&](std::size_t i) { return tarn::kat::words(next, i, i + 1, 16)[0]; };
      current.constants = {field(3), field(5), field(7)};
    } else if (kind == "seed") {
      current.seed = tarn::kat::words(next, 1, 2, 10)[0];
    } else if (kind == "at") {
      current.line = next.number;
      current.at = std::stoull(next.fields.at(1));
      current.words = tarn::kat::answers(next, 3, 16);
      all.push_back(current);
    }
  }
  return all;
}

// The kernels of the target that the library itself runs.
class kat_mt2203 : public support::on_simd_target {
 protected:
  static const target_kernels* kernels() {
    support::any_stream(RVX_BRNG_MT2203, {1}).words(1);
    for (const target_kernels& k : all_kernels) {
      if (std::string(k.target) == __rvxGetSimdTarget())
        return &k;
    }
    return nullptr;
  }
};

TEST_F(kat_mt2203, kernels_with_the_constants_of_known_members) {
  const target_kernels* const run = kernels();
  ASSERT_NE(run, nullptr) << __rvxGetSimdTarget();
  const auto answers = known_answers();
  ASSERT_EQ(answers.size(), 8u * 4u + 24u);
  constexpr std::size_t longest = 1'000'016;
  std::vector<std::uint32_t> words(order + longest + 16);
  for (const known& k : answers) {
    const auto start = tarn_test::words_from_seed(order, k.seed);
    std::copy(start.begin(), start.end(), words.begin());
    const std::size_t end = k.at + k.words.size();
    ASSERT_LE(end, longest);
    run->extend(k.constants, words.data(), end);
    std::vector<std::uint32_t> out(k.words.size(), 0xA5A5A5A5);
    run->temper(k.constants, words.data() + order + k.at, out.size(), out.data());
    EXPECT_EQ(out, k.words) << "line " << k.line;
  }
}

TEST(kat_mt2203_model, the_plain_model_gives_the_known_answers) {
  const auto answers = known_answers();
  ASSERT_EQ(answers.size(), 8u * 4u + 24u);
  for (const known& k : answers) {
    tarn_test::sequence<tarn_test::mt2203_rule> x(
        tarn_test::words_from_seed(order, k.seed),
        {k.constants.matrix, k.constants.mask_b, k.constants.mask_c});
    for (std::size_t i = 0; i < k.words.size(); ++i)
      EXPECT_EQ(x.output(order + k.at + i), k.words[i]) << "line " << k.line << ", word " << i;
  }
}

}  // namespace
#endif
