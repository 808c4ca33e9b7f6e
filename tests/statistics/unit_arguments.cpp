// SPDX-License-Identifier: Apache-2.0
// Every bad argument of the public functions: its status, its report, and nothing written. The raw
// entries, called without the checks in front, refuse the same.
#include <tuple>

#include "good_parameters.hpp"
#include "statistics/common/parameters.hpp"
#include "support.hpp"

namespace {

namespace parameters = tarn::statistics::parameters;
using list = support::reports::list;
constexpr std::int64_t above_int = std::int64_t{1} << 31;

// A stream whose mark was damaged, mended before it is deleted.
class unmarked {
 public:
  unmarked() { mark() = 0; }
  ~unmarked() { mark() = 1; }
  operator rvx_stream() const { return stream_; }

 private:
  std::uint8_t& mark() { return static_cast<std::uint8_t*>(rvx_stream(stream_))[4]; }
  support::stream stream_;
};

// routine(method, stream, n, r) with these parameters behind.
template <class Routine, class... Formal>
auto with_parameters(const Routine& routine, const std::tuple<Formal...>& values) {
  return [=](auto method, rvx_stream stream, auto n, auto* r) {
    return std::apply([&](Formal... p) { return routine(method, stream, n, r, p...); }, values);
  };
}

class arguments : public testing::Test {
 protected:
  // The call returned `status` and reported `position` of `name`, once.
  void expect(int returned, int status, const char* name, int position) {
    EXPECT_EQ(returned, status) << name;
    EXPECT_EQ(reports_.take(), (list{{name, position}}));
  }

  // The head that all routines share: of a plain name, then of its raw entry.
  template <class Value, class Plain, class Raw, class... Formal>
  void check_head(const char* name, const Plain& plain, const Raw& raw,
                  const std::tuple<Formal...>& good) {
    support::results<Value> r(8);
    Value* const none = nullptr;
    const std::tuple<Formal...> bad{bad::value<Formal>()...};
    const support::record before = stream_.state();
    const auto draw = with_parameters(plain, good);
    expect(draw(-1, stream_, 4, r.data()), -1, name, 1);
    expect(draw(std::int64_t{1} << 32, stream_, 4, r.data()), -1, name, 1);
    expect(draw(0, nullptr, 4, r.data()), -5, name, 2);
    expect(draw(0, unmarked_, 4, r.data()), -1006, name, 2);
    expect(draw(0, stream_, -1, r.data()), -3, name, 3);
    expect(draw(0, stream_, 4, none), -4, name, 4);
    // In the order of the arguments: the first bad one is reported.
    expect(draw(-1, nullptr, -1, none), -1, name, 1);
    expect(draw(0, nullptr, -1, none), -5, name, 2);
    expect(draw(0, stream_, -1, none), -3, name, 3);
    EXPECT_EQ(with_parameters(plain, bad)(0, stream_, 0, none), 0) << name;
    EXPECT_EQ(draw(0x20000000, stream_, 0, none), 0) << name << ": checked before n = 0";

    const auto draw_raw = with_parameters(raw, good);
    EXPECT_EQ(draw_raw(-1, nullptr, -1, none), -1) << name;
    EXPECT_EQ(draw_raw(0, nullptr, -1, none), -5) << name;
    EXPECT_EQ(draw_raw(0, unmarked_, -1, none), -1006) << name;
    EXPECT_EQ(draw_raw(0, stream_, -1, none), -3) << name;
    EXPECT_EQ(draw_raw(0, stream_, 4, none), -4) << name;
    EXPECT_EQ(with_parameters(raw, bad)(0, stream_, 0, none), 0) << name;

    expect_unmoved(name, before, r);
    // Nothing but what was tried was wrong.
    EXPECT_EQ(draw(0, stream_, 4, r.data()), 0) << name;
    EXPECT_EQ(draw_raw(0, stream_, 4, r.data()), 0) << name;
    EXPECT_TRUE(reports_.take().empty()) << name;
  }

  // Each bit that is none of `methods`, and the code 3 of gaussian, which is no method.
  template <class Value, class Plain, class Raw, class Parameters>
  void check_methods(const char* name, const Plain& plain, const Raw& raw, const Parameters& good,
                     int methods) {
    support::results<Value> r(8);
    const support::record before = stream_.state();
    const auto expect_refused = [&](int method) {
      expect(with_parameters(plain, good)(method, stream_, 4, r.data()), -1, name, 1);
      EXPECT_EQ(with_parameters(raw, good)(method, stream_, 4, r.data()), -1) << name;
    };
    for (int bit = 0; bit < 31; ++bit)
      if ((methods >> bit & 1) == 0)
        expect_refused(1 << bit);
    if (methods == parameters::gaussian_methods)
      expect_refused(3);
    expect_unmoved(name, before, r);
  }

  template <class Value>
  void expect_unmoved(const char* name, const support::record& before,
                      const support::results<Value>& r) {
    const support::record after = stream_.state();
    EXPECT_EQ(std::memcmp(&before, &after, sizeof before), 0) << name;
    EXPECT_TRUE(r.untouched()) << name;
  }

  support::reports reports_;
  support::stream stream_;
  unmarked unmarked_;
};

TEST_F(arguments, heads_of_the_routines) {
#define TARN_ROUTINE(name, value, methods, width, parameters, arguments, check) \
  check_head<value>("rvx" #name, rvx##name, _rvx##name, good::name);
#include "statistics/common/routines.def"
  check_head<std::int32_t>("rvxiRngPoissonV", rvxiRngPoissonV, _rvxiRngPoissonV,
                           std::make_tuple(good::numbers<double>));
}

TEST_F(arguments, methods_of_the_routines) {
  int with_methods = 0;
#define TARN_ROUTINE(name, value, methods, width, parameters_, arguments, check)               \
  if (parameters::methods != parameters::any_method) {                                         \
    check_methods<value>("rvx" #name, rvx##name, _rvx##name, good::name, parameters::methods); \
    ++with_methods;                                                                            \
  }
#include "statistics/common/routines.def"
  EXPECT_GT(with_methods, 0);
}

TEST_F(arguments, bad_parameters_with_a_bad_method) {
  // Under the plain name the parameters are looked at before the bits of the method.
  support::results<float> r(4);
  expect(rvxsRngUniform(2, stream_, 4, r.data(), 1, 1), -5, "rvxsRngUniform", 5);
  EXPECT_EQ(_rvxsRngUniform(2, stream_, 4, r.data(), 1, 1), -1);
  EXPECT_TRUE(r.untouched());
}

TEST_F(arguments, making_streams) {
  rvx_stream made = &made;  // a value that must survive
  const rvx_stream before = made;
  const std::uint32_t seed = 1;
  expect(rvxNewStream(nullptr, RVX_BRNG_PHILOX4X32X10, 1), -5, "rvxNewStream", 1);
  expect(rvxNewStream(&made, -1, 1), -1000, "rvxNewStream", 2);
  expect(rvxNewStream(&made, above_int, 1), -1000, "rvxNewStream", 2);
  expect(rvxNewStream(&made, 0, 1), -1000, "rvxNewStream", 2);
  expect(rvxNewStream(&made, 0x12300000, 1), -1000, "rvxNewStream", 2);
  expect(rvxNewStream(&made, RVX_BRNG_PHILOX4X32X10 + 1, 1), -1000, "rvxNewStream", 2);
  expect(rvxNewStreamEx(nullptr, RVX_BRNG_PHILOX4X32X10, 1, &seed), -5, "rvxNewStreamEx", 1);
  expect(rvxNewStreamEx(&made, above_int, 1, &seed), -1000, "rvxNewStreamEx", 2);
  expect(rvxNewStreamEx(&made, 0x12300000, 1, &seed), -1000, "rvxNewStreamEx", 2);
  expect(rvxNewStreamEx(&made, RVX_BRNG_PHILOX4X32X10, -1, &seed), -3, "rvxNewStreamEx", 3);
  expect(rvxNewStreamEx(&made, RVX_BRNG_PHILOX4X32X10, above_int, &seed), -3, "rvxNewStreamEx", 3);
  expect(rvxNewStreamEx(&made, RVX_BRNG_PHILOX4X32X10, 1, nullptr), -4, "rvxNewStreamEx", 4);
  EXPECT_EQ(made, before);
}

TEST_F(arguments, stream_services) {
  std::uint8_t image[64] = {};
  const std::uint64_t digit = 1;
  rvx_stream made = nullptr, none = nullptr, bad = unmarked_;
  expect(rvxDeleteStream(nullptr), -5, "rvxDeleteStream", 1);
  expect(rvxDeleteStream(&none), -5, "rvxDeleteStream", 1);
  expect(rvxDeleteStream(&bad), -1006, "rvxDeleteStream", 1);
  expect(rvxCopyStream(nullptr, stream_), -5, "rvxCopyStream", 1);
  expect(rvxCopyStream(&made, nullptr), -5, "rvxCopyStream", 2);
  expect(rvxCopyStream(&made, unmarked_), -1006, "rvxCopyStream", 2);
  expect(rvxSkipAheadStream(nullptr, 1), -5, "rvxSkipAheadStream", 1);
  expect(rvxSkipAheadStream(unmarked_, 1), -1006, "rvxSkipAheadStream", 1);
  expect(rvxSkipAheadStreamEx(nullptr, 1, &digit), -5, "rvxSkipAheadStreamEx", 1);
  expect(rvxSkipAheadStreamEx(unmarked_, 1, &digit), -1006, "rvxSkipAheadStreamEx", 1);
  expect(rvxSkipAheadStreamEx(stream_, -1, &digit), -2, "rvxSkipAheadStreamEx", 2);
  expect(rvxSkipAheadStreamEx(stream_, above_int, &digit), -2, "rvxSkipAheadStreamEx", 2);
  expect(rvxSkipAheadStreamEx(stream_, 1, nullptr), -3, "rvxSkipAheadStreamEx", 3);
  expect(rvxLeapfrogStream(nullptr, 0, 2), -5, "rvxLeapfrogStream", 1);
  expect(rvxLeapfrogStream(unmarked_, 0, 2), -1006, "rvxLeapfrogStream", 1);
  expect(rvxLeapfrogStream(stream_, -1, 2), -2, "rvxLeapfrogStream", 2);
  expect(rvxLeapfrogStream(stream_, 0, 0), -3, "rvxLeapfrogStream", 3);
  expect(rvxLeapfrogStream(stream_, 0, 2), RVX_STATUS_UNSUPPORTED, "rvxLeapfrogStream", 1);
  expect(rvxGetStreamSize(nullptr), -5, "rvxGetStreamSize", 1);
  expect(rvxGetStreamSize(unmarked_), -1006, "rvxGetStreamSize", 1);
  expect(rvxSaveStreamM(nullptr, image), -5, "rvxSaveStreamM", 1);
  expect(rvxSaveStreamM(unmarked_, image), -1006, "rvxSaveStreamM", 1);
  expect(rvxSaveStreamM(stream_, nullptr), -2, "rvxSaveStreamM", 2);
  expect(rvxLoadStreamM(nullptr, image), -5, "rvxLoadStreamM", 1);
  expect(rvxLoadStreamM(&made, nullptr), -2, "rvxLoadStreamM", 2);
  expect(rvxSaveStreamF(nullptr, "x", -1), -5, "rvxSaveStreamF", 1);
  expect(rvxSaveStreamF(unmarked_, "x", -1), -1006, "rvxSaveStreamF", 1);
  expect(rvxSaveStreamF(stream_, nullptr, -1), -2, "rvxSaveStreamF", 2);
  expect(rvxSaveStreamF(stream_, "x", -2), -3, "rvxSaveStreamF", 3);
  expect(rvxLoadStreamF(nullptr, "x", -1), -5, "rvxLoadStreamF", 1);
  expect(rvxLoadStreamF(&made, nullptr, -1), -2, "rvxLoadStreamF", 2);
  expect(rvxLoadStreamF(&made, "x", -2), -3, "rvxLoadStreamF", 3);
  EXPECT_EQ(made, nullptr);
}

TEST(streams, copies_go_on_independently) {
  support::stream original(9);
  std::uint32_t a[7], b[7], c[7];
  ASSERT_EQ(rvxiRngUniformBits(0, original, 3, a), 0);
  rvx_stream copy = nullptr;
  ASSERT_EQ(rvxCopyStream(&copy, original), 0);
  ASSERT_EQ(rvxiRngUniformBits(0, copy, 7, b), 0);
  ASSERT_EQ(rvxiRngUniformBits(0, original, 7, c), 0);
  EXPECT_TRUE(std::equal(b, b + 7, c));
  EXPECT_EQ(rvxDeleteStream(&copy), 0);
  EXPECT_EQ(copy, nullptr);
}

// A record that no engine function may run on is refused, not followed.
TEST(streams, impossible_states_are_refused) {
  support::stream s;
  support::record r = s.state();
  r.idx = 5;
  s.set(r);
  support::results<std::uint32_t> out(4);
  rvx_stream copy = nullptr;
  std::uint8_t image[64];
  // Each is reported, since callers may drop the status.
  support::reports reports;
  EXPECT_EQ(rvxiRngUniformBits(0, s, 4, out.data()), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(rvxSaveStreamM(s, image), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(rvxGetStreamSize(s), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(rvxCopyStream(&copy, s), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(reports.take(), (list{{"rvxiRngUniformBits", 2},
                                  {"rvxSaveStreamM", 2},
                                  {"rvxGetStreamSize", 1},
                                  {"rvxSkipAheadStream", 1},
                                  {"rvxCopyStream", 2}}));
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(copy, nullptr);
}

TEST(streams, images_that_cannot_be_had_are_reported) {
  support::stream s;
  support::reports reports;
  rvx_stream loaded = nullptr;
  EXPECT_EQ(rvxLoadStreamF(&loaded, "no/such/file", -1), RVX_STATUS_FILE_OPEN);
  EXPECT_EQ(rvxSaveStreamF(s, "no/such/folder/file", -1), RVX_STATUS_FILE_OPEN);
  const std::uint8_t zeros[64] = {};
  EXPECT_EQ(rvxLoadStreamM(&loaded, zeros), RVX_STATUS_BAD_IMAGE);
  EXPECT_EQ(reports.take(),
            (list{{"rvxLoadStreamF", 2}, {"rvxSaveStreamF", 2}, {"rvxLoadStreamM", 2}}));
  EXPECT_EQ(loaded, nullptr);
}

// Routines with a single method take any code that is not negative.
TEST(methods, of_integer_routines_are_taken_as_they_are) {
  support::stream one;
  support::stream other;
  support::results<std::uint32_t> x(5);
  support::results<std::uint32_t> y(5);
  EXPECT_EQ(rvxiRngUniformBits(0x40000000, one, 5, x.data()), 0);
  EXPECT_EQ(rvxiRngUniformBits(0, other, 5, y.data()), 0);
  for (std::size_t i = 0; i < 5; ++i)
    EXPECT_EQ(x[i], y[i]);
}

TEST(raw_entries, of_streams_are_safe_without_the_checks_in_front) {
  support::stream s;
  const unmarked bad;
  void* made = nullptr;
  std::uint8_t image[64] = {};
  EXPECT_EQ(__rvxNewStreamEx(nullptr, RVX_BRNG_PHILOX4X32X10, 0, nullptr), -5);
  EXPECT_EQ(__rvxNewStreamEx(&made, -1, 0, nullptr), -1000);
  EXPECT_EQ(__rvxNewStreamEx(&made, RVX_BRNG_PHILOX4X32X10, -1, nullptr), -3);
  EXPECT_EQ(__rvxNewStreamEx(&made, RVX_BRNG_PHILOX4X32X10, 2, nullptr), -4);
  EXPECT_EQ(__rvxDeleteStream(nullptr), -5);
  EXPECT_EQ(__rvxDeleteStream(&made), -5);
  EXPECT_EQ(__rvxCopyStream(nullptr, s), -5);
  EXPECT_EQ(__rvxCopyStream(&made, bad), -1006);
  EXPECT_EQ(__rvxSkipAheadStream(bad, 1), -1006);
  EXPECT_EQ(__rvxSkipAheadStreamEx(s, -1, nullptr), -2);
  EXPECT_EQ(__rvxSkipAheadStreamEx(s, 1, nullptr), -3);
  EXPECT_EQ(__rvxSkipAheadStreamEx(s, 0, nullptr), 0);
  EXPECT_EQ(__rvxLeapfrogStream(s, 0, 2), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(__rvxGetStreamSize(nullptr), -5);
  EXPECT_EQ(__rvxSaveStreamM(s, nullptr), -2);
  EXPECT_EQ(__rvxSaveStreamM(nullptr, image), -5);
  EXPECT_EQ(__rvxLoadStreamM(nullptr, image), -5);
  EXPECT_EQ(__rvxLoadStreamM(&made, nullptr), -2);
  EXPECT_EQ(__rvxLoadStreamM(&made, image), RVX_STATUS_BAD_IMAGE);
  EXPECT_EQ(__rvxSaveStreamF(s, nullptr, -1), -2);
  EXPECT_EQ(__rvxSaveStreamF(s, "x", -2), -3);
  EXPECT_EQ(__rvxLoadStreamF(nullptr, "x", -1), -5);
  EXPECT_EQ(__rvxLoadStreamF(&made, "x", -7), -3);
  EXPECT_EQ(made, nullptr);
}

}  // namespace
