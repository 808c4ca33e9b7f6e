// SPDX-License-Identifier: Apache-2.0
// The words, jumps and transition matrices of mrg32k3a against published answers.
#include <map>
#include <sstream>
#include <stdexcept>

#include "../../kat/kat_file.hpp"
#include "plain_mrg32k3a.hpp"

namespace {

using plain_mrg::cpp_int;
using plain_mrg::model;
using plain_mrg::stream;
using kat = support::on_simd_target;

// "2^127+2^76", "2*2^76", "1000000007"; -1 is one less than the period.
cpp_int count_of(const std::string& text) {
  if (text == "-1")
    return plain_mrg::period() - 1;
  cpp_int sum = 0;
  std::istringstream terms(text);
  for (std::string term; std::getline(terms, term, '+');) {
    cpp_int value = 1;
    std::istringstream factors(term);
    for (std::string factor; std::getline(factors, factor, '*');) {
      const std::size_t hat = factor.find('^');
      const unsigned exponent =
          hat == std::string::npos ? 1 : static_cast<unsigned>(std::stoul(factor.substr(hat + 1)));
      value *= pow(cpp_int(factor.substr(0, hat)), exponent);
    }
    sum += value;
  }
  if (sum == 0)
    throw std::runtime_error("no count: " + text);
  return sum;
}

model model_of(const std::vector<std::uint32_t>& v) {
  return {{v.at(0), v.at(1), v.at(2)}, {v.at(3), v.at(4), v.at(5)}};
}

void expect_words(stream& s, const std::vector<std::uint32_t>& known) {
  EXPECT_EQ(s.words(known.size()), known);
}

// A jump by E, in one piece; if E is short enough for it, by the plain skip as well.
void expect_jump(const model& start, const cpp_int& count, const model& known) {
  stream far(start);
  far.skip_far(plain_mrg::digits(count));
  EXPECT_TRUE(far.place() == known);
  if (count >> 64 == 0) {
    stream near(start);
    near.skip(static_cast<std::uint64_t>(count));
    EXPECT_EQ(near.image(), far.image());
  }
}

// Columns of A^E: the images of the unit vectors.
void expect_matrix(bool second, const cpp_int& count, const std::vector<std::uint32_t>& known) {
  for (std::size_t j = 0; j < 3; ++j) {
    plain_mrg::triple unit{};
    unit[j] = 1;
    stream s(model{unit, unit});
    s.skip_far(plain_mrg::digits(count));
    const model image = s.place();
    for (std::size_t i = 0; i < 3; ++i)
      EXPECT_EQ((second ? image.y : image.x)[i], known.at(3 * i + j)) << i << ", " << j;
  }
}

TEST_F(kat, published_words_jumps_and_matrices) {
  std::map<std::string, int> seen;
  model start{};
  model jumped{};
  for (const tarn::kat::line& line : tarn::kat::read_file(TARN_KAT_FOLDER, "mrg32k3a")) {
    SCOPED_TRACE("line " + std::to_string(line.number));
    const std::string& form = line.fields.at(0);
    ++seen[form];
    if (form == "stream") {
      start = model_of(tarn::kat::words(line, 1, 7, 10));
      continue;
    }
    const std::size_t colon = form == "after" ? 3 : 2;
    ASSERT_EQ(line.fields.at(colon), ":");
    const std::vector<std::uint32_t> known = tarn::kat::answers(line, colon + 1, 10);
    const std::string& count = line.fields[colon - 1];
    if (form == "at") {
      stream skipped(start), drawn(start);
      const std::uint64_t index = std::stoull(count);
      skipped.skip(index);
      expect_words(skipped, known);
      drawn.words(static_cast<std::size_t>(index));
      expect_words(drawn, known);
    } else if (form == "after") {
      stream s(jumped);
      expect_words(s, known);
    } else if (form == "state_at") {
      stream s(start);
      s.words(std::stoul(count));
      EXPECT_TRUE(s.place() == model_of(known));
    } else if (form == "state_jump") {
      jumped = model_of(known);
      expect_jump(start, count_of(count), jumped);
    } else if (form == "state_jump12345") {
      const plain_mrg::triple same = {12345, 12345, 12345};
      expect_jump({same, same}, count_of(count), model_of(known));
    } else if (form == "matrix") {
      const std::size_t bracket = count.find('(');
      ASSERT_TRUE(count.substr(0, 3) == "A1^" || count.substr(0, 3) == "A2^") << count;
      expect_matrix(count[1] == '2',
                    count_of(count.substr(bracket + 1, count.size() - bracket - 2)), known);
    } else {
      FAIL() << "unknown form " << form;
    }
  }
  const std::map<std::string, int> all = {{"stream", 2},         {"at", 4},    {"state_at", 2},
                                          {"state_jump", 14},    {"after", 4}, {"matrix", 12},
                                          {"state_jump12345", 8}};
  EXPECT_EQ(seen, all);
}

}  // namespace
