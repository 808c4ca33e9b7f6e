// SPDX-License-Identifier: Apache-2.0
// Bounded text: what fits is whole, what goes beyond 399 characters is cut, and nothing follows.
#include "report_text.hpp"

#include <string>

#include <gtest/gtest.h>

namespace {

using kestrel::tarn::gpu::report_text;

constexpr std::size_t room = 399;

TEST(report_text, is_empty_at_first_and_adds_what_printf_prints) {
  report_text text;
  EXPECT_STREQ(text.c_str(), "");
  text.append("host:%s", "N/A");
  text.append(" GPU%d", 3);
  EXPECT_STREQ(text.c_str(), "host:N/A GPU3");
}

TEST(report_text, takes_399_characters) {
  const std::string whole(room, 'x');
  report_text text;
  text.append("%s", whole.c_str());
  EXPECT_EQ(text.c_str(), whole);
  text.append("y");
  EXPECT_EQ(text.c_str(), whole);
}

TEST(report_text, cuts_the_piece_that_does_not_fit_and_adds_no_later_one) {
  report_text text;
  text.append("%s", std::string(room - 2, 'x').c_str());
  text.append("abc");
  text.append("d");
  EXPECT_EQ(text.c_str(), std::string(room - 2, 'x') + "ab");
}

TEST(report_text, cuts_one_long_piece) {
  report_text text;
  text.append("%s!", std::string(5000, 'x').c_str());
  EXPECT_EQ(text.c_str(), std::string(room, 'x'));
}

}  // namespace
