// SPDX-License-Identifier: Apache-2.0
// Shapes of arguments of the offload routines, each behind a comma: as parameters by value and by
// address, what stands at the addresses, and the names. `T` is the type of a value of the results,
// `Int` the integer of the entry. Lists of reals are given by their address in either form.
#pragma once

// TARN_OFFLOAD_APPLY(MACRO, ..., TARN_OFFLOAD_NAMES (a, b)): the macro, with the names apart.
#define TARN_OFFLOAD_APPLY(macro, ...) macro(__VA_ARGS__)
#define TARN_OFFLOAD_NAMES(...) __VA_ARGS__

#define TARN_BY_VALUE_nothing(T, Int, none)
#define TARN_BY_ADDRESS_nothing(T, Int, none)
#define TARN_CONTENTS_nothing(none)
#define TARN_VALUES_nothing(none)

#define TARN_BY_VALUE_one_real(T, Int, x) , double x
#define TARN_BY_ADDRESS_one_real(T, Int, x) , const double* x
#define TARN_CONTENTS_one_real(x) , *x
#define TARN_VALUES_one_real(x) , x

#define TARN_BY_VALUE_two_reals(T, Int, x, y) , T x, T y
#define TARN_BY_ADDRESS_two_reals(T, Int, x, y) , const T *x, const T *y
#define TARN_CONTENTS_two_reals(x, y) , *x, *y
#define TARN_VALUES_two_reals(x, y) , x, y

#define TARN_BY_VALUE_two_doubles(T, Int, x, y) , double x, double y
#define TARN_BY_ADDRESS_two_doubles(T, Int, x, y) , const double *x, const double *y
#define TARN_CONTENTS_two_doubles(x, y) , *x, *y
#define TARN_VALUES_two_doubles(x, y) , x, y

#define TARN_BY_VALUE_three_reals(T, Int, x, y, z) , T x, T y, T z
#define TARN_BY_ADDRESS_three_reals(T, Int, x, y, z) , const T *x, const T *y, const T *z
#define TARN_CONTENTS_three_reals(x, y, z) , *x, *y, *z
#define TARN_VALUES_three_reals(x, y, z) , x, y, z

#define TARN_BY_VALUE_four_reals(T, Int, x, y, z, w) , T x, T y, T z, T w
#define TARN_BY_ADDRESS_four_reals(T, Int, x, y, z, w) \
  , const T *x, const T *y, const T *z, const T *w
#define TARN_CONTENTS_four_reals(x, y, z, w) , *x, *y, *z, *w
#define TARN_VALUES_four_reals(x, y, z, w) , x, y, z, w

#define TARN_BY_VALUE_one_integer(T, Int, k) , Int k
#define TARN_BY_ADDRESS_one_integer(T, Int, k) , const Int* k
#define TARN_CONTENTS_one_integer(k) , *k
#define TARN_VALUES_one_integer(k) , k

#define TARN_BY_VALUE_two_integers(T, Int, k, l) , Int k, Int l
#define TARN_BY_ADDRESS_two_integers(T, Int, k, l) , const Int *k, const Int *l
#define TARN_CONTENTS_two_integers(k, l) , *k, *l
#define TARN_VALUES_two_integers(k, l) , k, l

#define TARN_BY_VALUE_three_integers(T, Int, k, l, m) , Int k, Int l, Int m
#define TARN_BY_ADDRESS_three_integers(T, Int, k, l, m) , const Int *k, const Int *l, const Int *m
#define TARN_CONTENTS_three_integers(k, l, m) , *k, *l, *m
#define TARN_VALUES_three_integers(k, l, m) , k, l, m

#define TARN_BY_VALUE_integer_and_real(T, Int, k, x) , Int k, double x
#define TARN_BY_ADDRESS_integer_and_real(T, Int, k, x) , const Int *k, const double *x
#define TARN_CONTENTS_integer_and_real(k, x) , *k, *x
#define TARN_VALUES_integer_and_real(k, x) , k, x

#define TARN_BY_VALUE_vector_law(T, Int, k, l, v, w) , Int k, Int l, const T *v, const T *w
#define TARN_BY_ADDRESS_vector_law(T, Int, k, l, v, w) \
  , const Int *k, const Int *l, const T *v, const T *w
#define TARN_CONTENTS_vector_law(k, l, v, w) , *k, *l, v, w
#define TARN_VALUES_vector_law(k, l, v, w) , k, l, v, w

#define TARN_BY_VALUE_counts_law(T, Int, k, l, v) , Int k, Int l, const double *v
#define TARN_BY_ADDRESS_counts_law(T, Int, k, l, v) , const Int *k, const Int *l, const double *v
#define TARN_CONTENTS_counts_law(k, l, v) , *k, *l, v
#define TARN_VALUES_counts_law(k, l, v) , k, l, v

#define TARN_BY_VALUE_rates(T, Int, v) , const double* v
#define TARN_BY_ADDRESS_rates(T, Int, v) , const double* v
#define TARN_CONTENTS_rates(v) , v
#define TARN_VALUES_rates(v) , v
