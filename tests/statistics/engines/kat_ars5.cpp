// SPDX-License-Identifier: Apache-2.0
// The words of ars5 against published answers, through the public C interface; its AES against
// FIPS-197.
#include "../../kat/counter_cases.hpp"
#include "any_stream.hpp"
#include "engines/aes_tables.hpp"
#include "plain_ars5.hpp"

namespace {

using kat = support::on_simd_target;

TEST_F(kat, published_words_of_every_case) {
  const auto cases = tarn::kat::counter_cases<4>(TARN_KAT_FOLDER, "ars5");
  ASSERT_GE(cases.size(), 9u + 10u + 3u);  // blocks, stream positions, carries and far blocks
  for (const auto& known : cases) {
    std::vector<std::uint32_t> seed(known.key.begin(), known.key.end());
    seed.insert(seed.end(), known.ctr.begin(), known.ctr.end());
    support::any_stream stream(RVX_BRNG_ARS5, seed);
    ASSERT_EQ(rvxSkipAheadStreamEx(stream, 2, known.skip.data()), 0);
    EXPECT_EQ(stream.words(known.words.size()), known.words) << "line " << known.line;

    plain::ars5_stream model{{known.key[0] | std::uint64_t{known.key[1]} << 32,
                              known.key[2] | std::uint64_t{known.key[3]} << 32},
                             0,
                             0};
    for (unsigned i = 4; i-- > 0;)
      model.block = model.block << 32 | known.ctr[i];
    model.skip(known.skip[0] >> 2 | plain::u128{known.skip[1]} << 62,
               static_cast<unsigned>(known.skip[0] % 4));
    for (const std::uint32_t word : known.words)
      EXPECT_EQ(model.next(), word) << "the model, line " << known.line;
  }
}

// Appendix B: the rounds of the model, under the key schedule of section 5.2.
TEST(fips_197, the_model_enciphers_the_example) {
  namespace aes = plain::aes;
  aes::bytes key = {0x2b, 0x7e, 0x15, 0x16, 0x28, 0xae, 0xd2, 0xa6,
                    0xab, 0xf7, 0x15, 0x88, 0x09, 0xcf, 0x4f, 0x3c};
  const aes::bytes input = {0x32, 0x43, 0xf6, 0xa8, 0x88, 0x5a, 0x30, 0x8d,
                            0x31, 0x31, 0x98, 0xa2, 0xe0, 0x37, 0x07, 0x34};
  const aes::bytes output = {0x39, 0x25, 0x84, 0x1d, 0x02, 0xdc, 0x09, 0xfb,
                             0xdc, 0x11, 0x85, 0x97, 0x19, 0x6a, 0x0b, 0x32};
  aes::bytes state = aes::sum(input, key);
  std::uint8_t constant = 1;
  for (int round = 1; round <= 10; ++round) {
    aes::bytes next = key;
    for (std::size_t i = 0; i < 4; ++i)
      next[i] ^= aes::s_box()[key[12 + (i + 1) % 4]];
    next[0] ^= constant;
    for (std::size_t i = 4; i < 16; ++i)
      next[i] ^= next[i - 4];
    key = next;
    constant = aes::product(constant, 2);
    state = aes::round(state, key, round == 10);
  }
  EXPECT_EQ(state, output);
}

// Section 5.1.1 gives {53} -> {ed}; all others by definition.
TEST(fips_197, the_table_of_the_library_is_the_s_box) {
  EXPECT_EQ(tarn::statistics::aes::sub_bytes.of[0x53], 0xED);
  for (unsigned a = 0; a < 256; ++a)
    EXPECT_EQ(tarn::statistics::aes::sub_bytes.of[a], plain::aes::s_box()[a]) << a;
}

}  // namespace
