// SPDX-License-Identifier: Apache-2.0
// The words of philox4x32x10 against published answers, through the public C interface.
#include "../../kat/philox_cases.hpp"
#include "support.hpp"

namespace {

using kat = support::on_simd_target;

TEST_F(kat, published_words_of_every_case) {
  const auto cases = tarn::kat::philox_cases(TARN_KAT_FOLDER);
  ASSERT_GE(cases.size(), 9u + 10u + 3u);  // blocks, stream positions, carries and far blocks
  for (const auto& known : cases) {
    const std::uint32_t seed[] = {known.key[0], known.key[1], known.ctr[0],
                                  known.ctr[1], known.ctr[2], known.ctr[3]};
    rvx_stream stream = nullptr;
    ASSERT_EQ(rvxNewStreamEx(&stream, RVX_BRNG_PHILOX4X32X10, 6, seed), 0);
    ASSERT_EQ(rvxSkipAheadStreamEx(stream, 2, known.skip.data()), 0);
    support::results<std::uint32_t> r(known.words.size());
    ASSERT_EQ(
        rvxiRngUniformBits(0, stream, static_cast<std::int64_t>(known.words.size()), r.data()), 0);
    for (std::size_t i = 0; i < known.words.size(); ++i)
      EXPECT_EQ(r[i], known.words[i]) << "line " << known.line << ", word " << i;
    EXPECT_TRUE(r.guards_intact());
    rvxDeleteStream(&stream);
  }
}

// The reader itself: what proves nothing must fail.
TEST(kat_reader, refuses_files_that_prove_nothing) {
  EXPECT_THROW(tarn::kat::read_file(TARN_KAT_FOLDER, "no_such_engine"), std::runtime_error);
  const tarn::kat::line zeros{1, {"block", "00000000", "0"}};
  EXPECT_THROW(tarn::kat::answers(zeros, 1, 16), std::runtime_error);
  EXPECT_THROW(tarn::kat::answers(zeros, 3, 16), std::runtime_error);
  const tarn::kat::line bad{1, {"block", "12g4"}};
  EXPECT_THROW(tarn::kat::answers(bad, 1, 16), std::runtime_error);

  std::string folder = testing::TempDir() + "tarn_kat_XXXXXX";
  ASSERT_NE(mkdtemp(folder.data()), nullptr);
  const auto write = [&](const char* text) { std::ofstream(folder + "/made.txt") << text; };
  write("");
  EXPECT_THROW(tarn::kat::read_file(folder, "made"), std::runtime_error);
  write("# Origin: here\n\n");
  EXPECT_THROW(tarn::kat::read_file(folder, "made"), std::runtime_error);
  write("block 1 2\n");
  EXPECT_THROW(tarn::kat::read_file(folder, "made"), std::runtime_error);
  write("# Origin: here\nblock 1 2\n");
  EXPECT_EQ(tarn::kat::read_file(folder, "made").size(), 1u);
  std::remove((folder + "/made.txt").c_str());
  std::remove(folder.c_str());
}

}  // namespace
