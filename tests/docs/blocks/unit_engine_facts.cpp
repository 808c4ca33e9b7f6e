// SPDX-License-Identifier: Apache-2.0
// The comment "facts" of each engine's page, which the tables of the manual are made of, against
// the engine itself: bytes of its state, members of its family, and how its words become reals.
#include <cmath>
#include <cstdint>
#include <fstream>
#include <map>
#include <ostream>
#include <regex>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tarn_rvx.h"

namespace {

struct engine {
  const char* name;
  std::int64_t code;
  int word_bits;
  bool has_dimensions;
};

void PrintTo(const engine& of, std::ostream* out) {
  *out << of.name;
}

enum seed_kind { u32, u64, dim, none };
const engine engines[] = {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {#name, code, word_bits, seed_type == dim},
#include "rng/engines/engines.def"
};

class stream {
 public:
  stream(std::int64_t code, std::uint64_t seed) : status(rvxNewStream(&handle_, code, seed)) {}
  stream(const stream&) = delete;
  stream& operator=(const stream&) = delete;
  ~stream() {
    if (status == RVX_STATUS_OK)
      rvxDeleteStream(&handle_);
  }
  operator rvx_stream() const { return handle_; }

 private:
  rvx_stream handle_ = nullptr;  // in front of the status, whose making sets it

 public:
  const int status;
};

using facts = std::map<std::string, std::string>;

facts facts_of(const std::string& name) {
  std::ifstream page(std::string(TARN_DOCS) + "/engines/" + name + ".md");
  facts found;
  std::string line;
  while (std::getline(page, line) && line != "<!-- facts") {
  }
  while (std::getline(page, line) && line != "-->") {
    const std::size_t colon = line.find(": ");
    if (colon != std::string::npos)
      found[line.substr(0, colon)] = line.substr(colon + 2);
  }
  return found;
}

class unit_docs_engine_facts : public testing::TestWithParam<engine> {
 protected:
  void SetUp() override { ASSERT_FALSE(said.empty()) << "the page has no facts"; }
  const facts said = facts_of(GetParam().name);
};

int state_of(const engine& of, std::uint64_t seed) {
  const stream one(of.code, seed);
  EXPECT_EQ(one.status, RVX_STATUS_OK);
  return rvxGetStreamSize(one) - 16;  // without the image's header
}

TEST_P(unit_docs_engine_facts, state) {
  const std::string& text = said.at("state");
  if (!GetParam().has_dimensions) {
    EXPECT_EQ(std::to_string(state_of(GetParam(), 1)), text);
    return;
  }
  std::smatch numbers;
  ASSERT_TRUE(std::regex_match(text, numbers,
                               std::regex(R"((\d+) \+ (\d+) a dimension, (\d+) above (\d+))")));
  const int base = std::stoi(numbers[1]), few = std::stoi(numbers[2]), many = std::stoi(numbers[3]);
  const int edge = std::stoi(numbers[4]);
  for (const int dimensions : {1, 7, edge, edge + 1, 1000})
    EXPECT_EQ(state_of(GetParam(), static_cast<std::uint64_t>(dimensions)),
              base + (dimensions > edge ? many : few) * dimensions);
}

TEST_P(unit_docs_engine_facts, family) {
  const int members = said.count("family") != 0 ? std::stoi(said.at("family")) : 1;
  EXPECT_EQ(stream(GetParam().code + members - 1, 1).status, RVX_STATUS_OK);
  EXPECT_NE(stream(GetParam().code + members, 1).status, RVX_STATUS_OK);
}

/// What a page says of the reals of one type.
template <typename T>
struct rule {
  bool is_signed, is_middle;
  T divisor;

  T operator()(std::uint64_t word, T a, T b) const {
    const T w = is_signed ? static_cast<T>(static_cast<std::int32_t>(word)) : static_cast<T>(word);
    return std::fma(w, (b - a) / divisor, is_middle ? (a + b) / 2 : a);
  }
};

template <typename T>
rule<T> rule_in(const std::string& text, int word_bits) {
  std::smatch part;
  const std::regex shape(R"((signed|unsigned) (\d+)-bit number \| \(b - a\) (.*) \| (.*))");
  EXPECT_TRUE(std::regex_match(text, part, shape)) << text;
  EXPECT_EQ(std::stoi(part[2]), word_bits);
  std::string scale = part[3];
  const std::string break_of_types = " in `float`, ";
  const std::size_t at = scale.find(break_of_types);
  if (at != std::string::npos) {
    scale =
        sizeof(T) == sizeof(float) ? scale.substr(0, at) : scale.substr(at + break_of_types.size());
  }
  std::smatch number;
  const bool is_power = std::regex_match(scale, number, std::regex(R"(\* 2\^-(\d+))"));
  EXPECT_TRUE(is_power || std::regex_match(scale, number, std::regex(R"(/ (\d+)( in `double`)?)")));
  const double value = std::stod(number[1]);
  return {part[1] == "signed", part[4] == "(a + b) / 2",
          static_cast<T>(is_power ? std::exp2(value) : value)};
}

int draw(rvx_stream from, std::vector<float>& r, float a, float b) {
  return rvxsRngUniform(0, from, static_cast<std::int64_t>(r.size()), r.data(), a, b);
}
int draw(rvx_stream from, std::vector<double>& r, double a, double b) {
  return rvxdRngUniform(0, from, static_cast<std::int64_t>(r.size()), r.data(), a, b);
}

template <typename T>
void compare_reals(const engine& of, const std::string& text) {
  constexpr std::size_t n = 1000;
  const std::size_t parts = of.word_bits > 32 ? 2 : 1;
  const std::uint64_t seed = of.has_dimensions ? 7 : 4242;
  const stream words_of(of.code, seed), reals_of(of.code, seed);
  std::vector<std::uint32_t> words(n * parts);
  ASSERT_EQ(rvxiRngUniformBits(0, words_of, n, words.data()), RVX_STATUS_OK);
  std::vector<T> reals(n, T(-1));
  const T a = T(0.3), b = T(7.9);  // no power of two in sum or difference
  ASSERT_EQ(draw(reals_of, reals, a, b), RVX_STATUS_OK);
  const rule<T> real = rule_in<T>(text, of.word_bits);
  for (std::size_t i = 0; i < n; ++i) {
    std::uint64_t word = words[i * parts];
    if (parts == 2)
      word |= static_cast<std::uint64_t>(words[2 * i + 1]) << 32;
    ASSERT_EQ(real(word, a, b), reals[i]) << i;
  }
}

class unit_docs_engine_reals : public unit_docs_engine_facts {};

TEST_P(unit_docs_engine_reals, rule) {
  compare_reals<float>(GetParam(), said.at("reals"));
  compare_reals<double>(GetParam(), said.at("reals"));
}

// Words and reals are of two streams, which have to be alike.
std::vector<engine> repeatable_engines() {
  std::vector<engine> all;
  for (const engine& of : engines) {
    if (of.name != std::string("nondeterministic"))
      all.push_back(of);
  }
  return all;
}

std::string name_of(const testing::TestParamInfo<engine>& of) {
  return of.param.name;
}

INSTANTIATE_TEST_SUITE_P(all, unit_docs_engine_facts, testing::ValuesIn(engines), name_of);
INSTANTIATE_TEST_SUITE_P(all, unit_docs_engine_reals, testing::ValuesIn(repeatable_engines()),
                         name_of);

}  // namespace
