// SPDX-License-Identifier: Apache-2.0
// What tells programs apart: hashes against a model in other numbers, comparisons, and what names
// of kernels tell.
#include <array>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "kernel_key.hpp"
#include "kernel_name.hpp"

namespace {

using namespace kestrel::tarn::gpu;

const void* device_at(std::uint64_t address) {
  return reinterpret_cast<const void*>(address);
}

/// The hash in signed numbers without overflow: what name and key add is small.
std::uint64_t model(std::uint64_t device, int domain, const std::string& name,
                    const std::string& key) {
  constexpr std::int64_t words = std::int64_t{1} << 32;
  std::int64_t start = (std::int64_t{domain} * 35) % words;
  start += start >= words / 2 ? -words : start < -words / 2 ? words : 0;
  std::int64_t sum = 0;
  const auto add = [&sum](const std::string& text) {
    for (int i = 0; i < 64 && i < static_cast<int>(text.size()); ++i) {
      const int letter = static_cast<unsigned char>(text[static_cast<std::size_t>(i)]);
      sum += std::int64_t{i} * 69 * (letter < 128 ? letter : letter - 256);
    }
  };
  if (key.empty() || static_cast<unsigned char>(key[0]) != 0xFF) {
    add(name);
  }
  add(key);
  const std::uint64_t low = device % 0x100000000;
  return (static_cast<std::uint64_t>(start) ^ low) + static_cast<std::uint64_t>(sum);
}

std::uint64_t hash(std::uint64_t device, int domain, const char* name, const std::string& key) {
  return kernel_hash(device_at(device), {domain, name, {key.data(), key.size()}});
}

TEST(KernelHash, CasesByHand) {
  EXPECT_EQ(hash(0, 1, nullptr, ""), 35U);
  EXPECT_EQ(hash(0, 1, "a", ""), 35U);  // the first character has weight 0
  EXPECT_EQ(hash(0, 1, "ab", ""), 35U + 69 * 98);
  EXPECT_EQ(hash(0, 1, "ab", "cd"), 35U + 69 * 98 + 69 * 100);
  EXPECT_EQ(hash(0xFFFFFFFF12345678, 2, nullptr, ""), 0x1234563EU);
  EXPECT_EQ(hash(0, -1, nullptr, ""), ~std::uint64_t{0} - 34);
  EXPECT_EQ(hash(0, 2147483647, nullptr, ""), 2147483613U);
  EXPECT_EQ(hash(0, 1, nullptr, "\x01\x80"), ~std::uint64_t{0} - 8796);
  EXPECT_EQ(hash(0, 1, "\x01\x80", ""), ~std::uint64_t{0} - 8796);
}

TEST(KernelHash, ASelfNamingKeyLeavesTheNameOut) {
  EXPECT_EQ(hash(0, 1, "ab", "\xFF"), 35U);
  EXPECT_EQ(hash(0, 1, "ab", "\xFF\x02"), 35U + 69 * 2);
  EXPECT_EQ(hash(0, 1, "ab", "\x02\xFF"), 35U + 69 * 98 - 69);
}

TEST(KernelHash, IsTheModelsForRandomKeys) {
  std::mt19937_64 words(20261121);
  const auto text = [&words](std::uint64_t lowest, std::uint64_t highest) {
    std::string made(words() % 100, '\0');
    for (char& letter : made) {
      letter = static_cast<char>(lowest + words() % (highest - lowest + 1));
    }
    return made;
  };
  for (int i = 0; i < 10000; ++i) {
    const std::uint64_t device = words();
    const int domain = static_cast<int>(words());
    const std::string name = text(1, 255);
    const std::string key = text(0, 255);
    ASSERT_EQ(hash(device, domain, name.c_str(), key), model(device, domain, name, key)) << i;
  }
}

TEST(KernelHash, StopsAfterThe64thByte) {
  const std::string long_text(80, 'x');
  std::string other = long_text;
  other[64] = 'y';
  EXPECT_EQ(hash(1, 1, long_text.c_str(), ""), hash(1, 1, other.c_str(), ""));
  EXPECT_EQ(hash(1, 1, "n", long_text), hash(1, 1, "n", other));
  other[63] = 'y';
  EXPECT_NE(hash(1, 1, long_text.c_str(), ""), hash(1, 1, other.c_str(), ""));
  EXPECT_NE(hash(1, 1, "n", long_text), hash(1, 1, "n", other));
}

TEST(KernelKey, IsSelfNamingByItsFirstByte) {
  const auto is_self_naming = [](const std::string& blob) {
    return kernel_key{0, "n", {blob.data(), blob.size()}}.is_self_naming();
  };
  EXPECT_TRUE(is_self_naming("\xFF"));
  EXPECT_TRUE(is_self_naming("\xFFyz"));
  EXPECT_FALSE(is_self_naming(""));
  EXPECT_FALSE(is_self_naming("\xFEyz"));
  EXPECT_FALSE(is_self_naming("y\xFF"));
  const char mark = '\xFF';
  EXPECT_FALSE((kernel_key{0, "n", bytes_of(&mark, 0)}.is_self_naming()));
  EXPECT_FALSE((kernel_key{0, "n", bytes_of(nullptr, 1)}.is_self_naming()));
}

TEST(KernelKey, TextsCountUpTo4096Characters) {
  EXPECT_EQ(text_bytes(nullptr).size, 0U);
  EXPECT_EQ(text_bytes("").size, 0U);
  EXPECT_EQ(text_bytes(std::string(4096, 'x').c_str()).size, 4096U);
  EXPECT_EQ(text_bytes(std::string(4097, 'x').c_str()).size, 4096U);
}

TEST(KernelKey, NamesDifferInTheirFirst260Characters) {
  EXPECT_TRUE(same_names("same", "same"));
  EXPECT_FALSE(same_names("same", "sane"));
  EXPECT_FALSE(same_names("same", "samen"));
  EXPECT_TRUE(same_names(nullptr, nullptr));
  EXPECT_TRUE(same_names(nullptr, ""));
  EXPECT_FALSE(same_names(nullptr, "n"));
  std::string one(300, 'x');
  std::string other = one;
  other[260] = 'y';
  EXPECT_TRUE(same_names(one.c_str(), other.c_str()));
  EXPECT_TRUE(same_names(one.c_str(), one.substr(0, 260).c_str()));
  EXPECT_FALSE(same_names(one.c_str(), one.substr(0, 259).c_str()));
  other[259] = 'y';
  EXPECT_FALSE(same_names(one.c_str(), other.c_str()));
}

TEST(KernelName, TheLibrarysNamespaceStandsBeforeIt) {
  EXPECT_EQ(full_kernel_name(1, "dgemm"), "kestrel::tarn::blas::dgemm");
  EXPECT_EQ(full_kernel_name(2, "fft_d"), "kestrel::tarn::dft::fft_d");
  EXPECT_EQ(full_kernel_name(5, "zgetrf"), "kestrel::tarn::lapack::zgetrf");
  for (const int domain : {-1, 0, 3, 4, 6, 1000}) {
    EXPECT_EQ(full_kernel_name(domain, "k"), "k");
  }
}

TEST(KernelName, TellsDoublePrecisionByTheLibrarysConvention) {
  struct row {
    const char* name;
    std::array<bool, 3> expected;  // of domains 1, 2, 5
  };
  const std::vector<row> rows = {
      {"dgemm", {true, false, true}},    {"zgemm", {true, false, true}},
      {"idamax", {true, false, false}},  {"izamax", {true, false, false}},
      {"isamax", {false, false, false}}, {"sgemm", {false, false, false}},
      {"i", {false, false, false}},      {"d", {true, false, true}},
      {"", {false, false, false}},       {"_d", {false, true, false}},
      {"fft_d", {false, true, false}},   {"fft_s", {false, false, false}},
      {"fft_dd", {false, false, false}}, {"dfft_d", {true, true, true}},
      {"iid", {false, false, false}},    {"Dgemm", {false, false, false}},
  };
  for (const row& each : rows) {
    const std::array<int, 3> domains = {1, 2, 5};
    for (std::size_t i = 0; i < domains.size(); ++i) {
      EXPECT_EQ(seems_double(domains[i], each.name), each.expected[i])
          << each.name << " of " << domains[i];
    }
    for (const int domain : {0, 3, 4, -5}) {
      EXPECT_FALSE(seems_double(domain, each.name)) << each.name;
    }
  }
}

}  // namespace
