! SPDX-License-Identifier: Apache-2.0
! A user's Fortran program: what consumer_offload.c does, and the same text printed. The entries get
! an array in place of values, and an address in place of addresses.
program consumer_offload
  use, intrinsic :: iso_c_binding
  use tarn_rvx
  use tarn_rvx_offload
  implicit none
  integer(c_int64_t), parameter :: count = 100
  real(c_float), target :: values(count)
  real(c_float) :: others(count)
  type(c_ptr) :: stream, copy

  call check(rvxNewStream(stream, RVX_BRNG_PHILOX4X32X10, 42_c_int64_t))
  call check(rvxCopyStream(copy, stream))
  call draw_to_array(stream, 0.0_c_float, 1.0_c_float)
  call draw_to_address(stream, 0.0_c_float, 1.0_c_float)
  call draw_to_array(stream, 1.0_c_float, 1.0_c_float)
  call draw_to_address(stream, 1.0_c_float, 1.0_c_float)
  call check(rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, count, values, &
      0.0_c_float, 1.0_c_float))
  call check(rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, copy, count, others, &
      0.0_c_float, 1.0_c_float))
  if (any(transfer(values, [0_c_int32_t]) /= transfer(others, [0_c_int32_t]))) then
    error stop 'the stream has moved'
  end if
  print '(a)', 'the stream has not moved'
  call check(rvxDeleteStream(stream))
  call check(rvxDeleteStream(copy))

contains

  subroutine check(status)
    integer(c_int), intent(in) :: status
    if (status /= RVX_STATUS_OK) error stop 'a function of the host failed'
  end subroutine

  subroutine draw_to_array(stream, a, b)
    type(c_ptr), intent(in) :: stream
    real(c_float), intent(in) :: a, b
    print '(a, 2(1x, i0))', 'by value', &
        tarn_rvx_offload_vsrnguniform(0_c_int32_t, stream, int(count, c_int32_t), values, a, b, &
        c_null_ptr), &
        tarn_rvx_offload_vsrnguniform(0_c_int64_t, stream, count, values, a, b, c_null_ptr)
  end subroutine

  subroutine draw_to_address(stream, a, b)
    type(c_ptr), intent(in) :: stream
    real(c_float), intent(in) :: a, b
    print '(a, 2(1x, i0))', 'by address', &
        tarn_rvx_offload_vsrnguniform(0_c_int32_t, stream, int(count, c_int32_t), c_loc(values), &
        a, b, c_null_ptr), &
        tarn_rvx_offload_vsrnguniform(0_c_int64_t, stream, count, c_loc(values), a, b, c_null_ptr)
  end subroutine
end program
