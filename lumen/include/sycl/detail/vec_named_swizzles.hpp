// SPDX-License-Identifier: Apache-2.0
// The named swizzles of two, three and four letters, such as xy(), zyx() or rgba(). Included in
// the body of a class that has swizzle<...>(); made by pasting every letter to every shorter name.
// No include guard: this is a list of members, not a header.

#define LUMEN_SWIZZLE(name, ...)                  \
  SYCL_EXTERNAL constexpr auto name() {           \
    return this->template swizzle<__VA_ARGS__>(); \
  }                                               \
  SYCL_EXTERNAL constexpr auto name() const {     \
    return this->template swizzle<__VA_ARGS__>(); \
  }

#define LUMEN_SWIZZLES_OF_4(A, B, C, D, name, ...) \
  LUMEN_SWIZZLE(name##A, __VA_ARGS__, elem::A)     \
  LUMEN_SWIZZLE(name##B, __VA_ARGS__, elem::B)     \
  LUMEN_SWIZZLE(name##C, __VA_ARGS__, elem::C)     \
  LUMEN_SWIZZLE(name##D, __VA_ARGS__, elem::D)
#define LUMEN_SWIZZLES_OF_3(A, B, C, D, name, ...) \
  LUMEN_SWIZZLE(name, __VA_ARGS__)                 \
  LUMEN_SWIZZLES_OF_4(A, B, C, D, name, __VA_ARGS__)
#define LUMEN_SWIZZLES_OF_2(A, B, C, D, name, ...)               \
  LUMEN_SWIZZLE(name, __VA_ARGS__)                               \
  LUMEN_SWIZZLES_OF_3(A, B, C, D, name##A, __VA_ARGS__, elem::A) \
  LUMEN_SWIZZLES_OF_3(A, B, C, D, name##B, __VA_ARGS__, elem::B) \
  LUMEN_SWIZZLES_OF_3(A, B, C, D, name##C, __VA_ARGS__, elem::C) \
  LUMEN_SWIZZLES_OF_3(A, B, C, D, name##D, __VA_ARGS__, elem::D)
#define LUMEN_SWIZZLES_FROM(A, B, C, D, first)                    \
  LUMEN_SWIZZLES_OF_2(A, B, C, D, first##A, elem::first, elem::A) \
  LUMEN_SWIZZLES_OF_2(A, B, C, D, first##B, elem::first, elem::B) \
  LUMEN_SWIZZLES_OF_2(A, B, C, D, first##C, elem::first, elem::C) \
  LUMEN_SWIZZLES_OF_2(A, B, C, D, first##D, elem::first, elem::D)
#define LUMEN_SWIZZLES(A, B, C, D)   \
  LUMEN_SWIZZLES_FROM(A, B, C, D, A) \
  LUMEN_SWIZZLES_FROM(A, B, C, D, B) \
  LUMEN_SWIZZLES_FROM(A, B, C, D, C) \
  LUMEN_SWIZZLES_FROM(A, B, C, D, D)

LUMEN_SWIZZLES(x, y, z, w)
LUMEN_SWIZZLES(r, g, b, a)

#undef LUMEN_SWIZZLES
#undef LUMEN_SWIZZLES_FROM
#undef LUMEN_SWIZZLES_OF_2
#undef LUMEN_SWIZZLES_OF_3
#undef LUMEN_SWIZZLES_OF_4
#undef LUMEN_SWIZZLE
