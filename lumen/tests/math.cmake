# SPDX-License-Identifier: Apache-2.0
# Tests of vec, the built-in functions, the function objects and atomic_ref.
tarn_test(unit_lumen_vec SOURCES vec_elements.cpp vec_operators.cpp vec_conversions.cpp
          LIBS tarn_lumen)
target_compile_definitions(unit_lumen_vec PRIVATE SYCL_SIMPLE_SWIZZLES)
tarn_test(unit_lumen_math SOURCES math_accuracy.cpp math_exact.cpp math_geometric.cpp
          math_integer.cpp math_relational.cpp LIBS tarn_lumen)
tarn_test(unit_lumen_atomic SOURCES atomic_ref.cpp LIBS tarn_lumen)
