# SPDX-License-Identifier: Apache-2.0
# Sees that cmake/check_cuda_resources.cmake passes kernels without spills, fails for one with them,
# for one that is missing and for no kernels at all, and says which it was.
#   cmake -DCHECK=<check_cuda_resources.cmake> -DCXXFILT=<c++filt> -DFIXTURE=<scratch folder>
#         -P resources_selftest.cmake
cmake_minimum_required(VERSION 3.25)

set(engines philox4x32x10 mrg32k3a mcg31m1 mcg59)
set(functors uniform_std exponential_icdf weibull_icdf rayleigh_icdf gumbel_icdf cauchy_icdf
    laplace_icdf gaussian_icdf lognormal_icdf gaussian_box_muller gaussian_box_muller2
    lognormal_box_muller2 bernoulli_icdf geometric_icdf)
set(accessor "sycl::lumen_1::accessor<float, 1, (sycl::lumen_1::access_mode)1, (sycl::lumen_1::target)0, (sycl::lumen_1::access::placeholder)0>")

# What ptxas says of a kernel, whose name may be mangled, and behind it of a function that it calls.
function(kernel_lines out name architecture properties)
  set(called "")
  if(ARGC GREATER 4)
    set(called "ptxas info    : Function properties for __internal_trig_reduction_slowpathd
    ${ARGV4}
")
  endif()
  set(${out} "ptxas info    : Compiling entry function '${name}' for '${architecture}'
ptxas info    : Function properties for ${name}
    ${properties}
ptxas info    : Used 24 registers, used 0 barriers, 412 bytes cmem[0]
ptxas info    : Compile time = 1.002 ms
${called}" PARENT_SCOPE)
endfunction()

# write_log(ENGINE LEFT_OUT): a log of all kernels of an engine, for both architectures.
function(write_log engine left_out)
  set(text "ptxas info    : 37744 bytes gmem, 16 bytes cmem[4]\n")
  foreach(functor IN LISTS functors)
    foreach(form "float*" "${accessor}")
      foreach(architecture sm_80 sm_90)
        set(rng kestrel::tarn::rng)
        set(name "void sycl::lumen_1::detail::cuda_range<1, ${rng}::detail::engine_func<${rng}::${engine}, float, float, ${rng}::detail::gpu::${functor}<float>, ${form}> >(${rng}::detail::engine_func<${rng}::${engine}, float, float, ${rng}::detail::gpu::${functor}<float>, ${form}>, sycl::lumen_1::range<1>, sycl::lumen_1::id<1>, unsigned int)")
        kernel_lines(lines "${name}" ${architecture}
                     "0 bytes stack frame, 0 bytes spill stores, 0 bytes spill loads")
        if(NOT functor STREQUAL left_out)
          string(APPEND text "${lines}")
        endif()
      endforeach()
    endforeach()
  endforeach()
  file(WRITE "${FIXTURE}/${engine}_gpu.log" "${text}")
endfunction()

function(write_logs)
  file(REMOVE_RECURSE "${FIXTURE}")
  foreach(engine IN LISTS engines)
    write_log(${engine} "")
  endforeach()
endfunction()

# A kernel as the compiler names it: uniform_std<float, float> of philox4x32x10 to a pointer.
set(mangled "_ZN4sycl7lumen_16detail10cuda_rangeILi1EN7kestrel4tarn3rng6detail11engine_funcINS5_13philox4x32x10EffNS6_3gpu11uniform_stdIffEEPfEEEEvT0_NS0_5rangeIXT_EEENS0_2idIXT_EEEj")

# expect(CASE PASSES WORDS): runs the check and looks at its verdict and for WORDS in what it says.
function(expect case passes words)
  execute_process(COMMAND ${CMAKE_COMMAND} "-DLOGS=${FIXTURE}" "-DCXXFILT=${CXXFILT}" -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_VARIABLE said ERROR_VARIABLE said)
  if((passes AND NOT result EQUAL 0) OR (NOT passes AND result EQUAL 0))
    message(SEND_ERROR "${case}: status ${result}\n${said}")
  endif()
  string(REGEX REPLACE "[ \n]+" " " said "${said}")
  string(FIND "${said}" "${words}" at)
  if(at EQUAL -1)
    message(SEND_ERROR "${case}: '${words}' not in\n${said}")
  endif()
endfunction()

write_logs()
expect("all in registers" TRUE "mcg59 gaussian_box_muller2<float> pointer sm_90 24 0 0")
expect("both forms" TRUE "mcg59 gaussian_box_muller2<float> accessor sm_80 24 0 0")

# Stack frames pass; what a called function needs counts with its kernel.
kernel_lines(lines ${mangled} sm_90 "32 bytes stack frame, 0 bytes spill stores, 0 bytes spill loads"
             "40 bytes stack frame, 0 bytes spill stores, 0 bytes spill loads")
file(APPEND "${FIXTURE}/other.log" "${lines}")
expect("stack frames" TRUE "philox4x32x10 uniform_std<float, float> pointer sm_90 24 0 72")

foreach(spill "12 bytes spill stores, 0" "0 bytes spill stores, 12")
  write_logs()
  kernel_lines(lines ${mangled} sm_90 "0 bytes stack frame, ${spill} bytes spill loads")
  file(APPEND "${FIXTURE}/other.log" "${lines}")
  expect("spilled" FALSE "1 kernels spill, 0 are missing")
  expect("spilled" FALSE "philox4x32x10 uniform_std<float, float> pointer sm_90 24 12 0")
endforeach()

# In a called function, of a kernel with others behind it and of the last one.
foreach(log a_first.log z_last.log)
  write_logs()
  kernel_lines(lines ${mangled} sm_90 "0 bytes stack frame, 0 bytes spill stores, 0 bytes spill loads"
               "40 bytes stack frame, 4 bytes spill stores, 8 bytes spill loads")
  file(WRITE "${FIXTURE}/${log}" "${lines}")
  expect("called function spills" FALSE "1 kernels spill, 0 are missing")
endforeach()
write_logs()
file(READ "${FIXTURE}/philox4x32x10_gpu.log" others)
file(WRITE "${FIXTURE}/philox4x32x10_gpu.log" "${lines}${others}")
expect("called function spills" FALSE "1 kernels spill, 0 are missing")

# Of kernels that reject, or of engines with state on the device, nothing is asked.
write_logs()
string(REPLACE "11uniform_std" "11unknown_std" unasked ${mangled})
kernel_lines(lines ${unasked} sm_90 "8 bytes stack frame, 8 bytes spill stores, 8 bytes spill loads")
file(APPEND "${FIXTURE}/other.log" "${lines}")
string(REPLACE "13philox4x32x10" "7mt19937" unasked ${mangled})
kernel_lines(lines ${unasked} sm_90 "8 bytes stack frame, 8 bytes spill stores, 8 bytes spill loads")
file(APPEND "${FIXTURE}/other.log" "${lines}")
expect("others" TRUE "mcg59 uniform_std<float> accessor")

write_log(mrg32k3a weibull_icdf)
expect("missing" FALSE "missing: mrg32k3a weibull_icdf accessor for sm_80")
expect("missing" FALSE "0 kernels spill, 4 are missing")

write_logs()
file(REMOVE "${FIXTURE}/mcg31m1_gpu.log")
expect("an engine missing" FALSE "missing: mcg31m1 uniform_std pointer for sm_90")

file(REMOVE_RECURSE "${FIXTURE}")
expect("no folder" FALSE "no kernel to look at")
file(WRITE "${FIXTURE}/philox4x32x10_gpu.log" "")
expect("an empty log" FALSE "no kernel to look at")
