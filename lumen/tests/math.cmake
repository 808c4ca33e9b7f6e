# SPDX-License-Identifier: Apache-2.0
# Tests of vec, the built-in functions, the function objects and atomic_ref.
tarn_test(unit_lumen_vec SOURCES vec_elements.cpp vec_operators.cpp vec_conversions.cpp
          LIBS tarn_lumen)
target_compile_definitions(unit_lumen_vec PRIVATE SYCL_SIMPLE_SWIZZLES)
tarn_test(unit_lumen_math SOURCES math_accuracy.cpp math_exact.cpp math_geometric.cpp
          math_integer.cpp math_relational.cpp LIBS tarn_lumen)
tarn_test(unit_lumen_atomic SOURCES atomic_ref.cpp LIBS tarn_lumen ENV "${LUMEN_TEST_DEVICES}")
# What kernels may call, on every device, against the host's results.
set(DEVICE_PASS device_pass_exact.cpp device_pass_groups.cpp device_pass_math.cpp
                device_pass_objects.cpp)
tarn_test(unit_lumen_device_pass SOURCES ${DEVICE_PASS} LIBS tarn_lumen
          ENV "${LUMEN_TEST_DEVICES}")
tarn_kernel_sources(${DEVICE_PASS})
if(TARN_CUDA)
  add_library(lumen_vec_store OBJECT vec_store.cu)
  set_target_properties(lumen_vec_store PROPERTIES CUDA_PTX_COMPILATION ON
                        CUDA_ARCHITECTURES 80-virtual)
  target_link_libraries(lumen_vec_store PRIVATE tarn_lumen)
  tarn_warnings(lumen_vec_store)
  add_test(NAME unit_lumen_vec_store COMMAND ${CMAKE_COMMAND}
           -DPTX=$<TARGET_OBJECTS:lumen_vec_store>
           -P ${CMAKE_CURRENT_SOURCE_DIR}/check_vec_store.cmake)
  set_tests_properties(unit_lumen_vec_store PROPERTIES LABELS unit)
endif()
