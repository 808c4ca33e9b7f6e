! SPDX-License-Identifier: Apache-2.0
! As offload.c: a stream draws on a device and then goes on on the host, and what comes out is one
! sequence. The functions of virtual_device.h stand in for the OpenMP compiler.
module virtual_device
  use, intrinsic :: iso_c_binding, only: c_ptr, c_size_t
  implicit none
  interface
    type(c_ptr) function device_interop() bind(C)
      import
    end function
    subroutine device_release(object) bind(C)
      import
      type(c_ptr), value :: object
    end subroutine
    type(c_ptr) function device_alloc(bytes) bind(C)
      import
      integer(c_size_t), value :: bytes
    end function
    subroutine device_free(memory) bind(C)
      import
      type(c_ptr), value :: memory
    end subroutine
    subroutine device_read(host, memory, bytes) bind(C)
      import
      type(c_ptr), value :: host, memory
      integer(c_size_t), value :: bytes
    end subroutine
  end interface
end module

program offload
  use, intrinsic :: iso_c_binding
  use tarn_rvx
  use tarn_rvx_offload
  use virtual_device
  implicit none
  integer(c_int64_t), parameter :: half = 10000
  real(c_float), target :: values(2 * half)
  real(c_float) :: serial(2 * half)
  type(c_ptr) :: stream, other

  call check(rvxNewStream(stream, RVX_BRNG_PHILOX4X32X10, 2026_c_int64_t), 'new stream')
  call check(rvxCopyStream(other, stream), 'copy')

  call draw_on_device(stream, values)
  call check(rvxsRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, half, values(half + 1:), &
      0.0_c_float, 1.0_c_float), 'gaussians on the host')

  call check(rvxsRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, other, 2 * half, serial, &
      0.0_c_float, 1.0_c_float), 'one sequence')
  call check(rvxDeleteStream(stream), 'delete')
  call check(rvxDeleteStream(other), 'delete')
  if (any(transfer(values, [0_c_int32_t]) /= transfer(serial, [0_c_int32_t]))) then
    error stop 'not one sequence'
  end if
  print '(i0, a, i0, a)', half, ' gaussians from the device, ', half, &
      ' more from the host: one sequence'

contains

  subroutine check(status, what)
    integer(c_int), intent(in) :: status
    character(*), intent(in) :: what
    if (status /= RVX_STATUS_OK) then
      print '(a, a, i0)', what, ': status ', status
      error stop
    end if
  end subroutine

  ! The first half from 64-bit integers, the second from 32-bit ones: the generic name finds the
  ! entry. It has waited when it returns.
  subroutine draw_on_device(stream, values)
    type(c_ptr), intent(in) :: stream
    real(c_float), target, intent(out) :: values(:)
    integer(c_size_t), parameter :: bytes = half * c_sizeof(0.0_c_float)
    integer(c_int32_t), parameter :: method = int(RVX_RNG_METHOD_GAUSSIAN_ICDF, c_int32_t)
    integer(c_int64_t), parameter :: quarter = half / 2
    type(c_ptr) :: interop, memory
    interop = device_interop()
    if (.not. c_associated(interop)) error stop 'no device'
    memory = device_alloc(bytes)
    if (.not. c_associated(memory)) error stop 'no memory'
    call check(tarn_rvx_offload_vsrnggaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, quarter, memory, &
        0.0_c_float, 1.0_c_float, interop), 'gaussians on the device')
    call device_read(c_loc(values), memory, bytes / 2)
    call check(tarn_rvx_offload_vsrnggaussian(method, stream, int(quarter, c_int32_t), memory, &
        0.0_c_float, 1.0_c_float, interop), 'more gaussians on the device')
    call device_read(c_loc(values(quarter + 1)), memory, bytes / 2)
    call device_free(memory)
    call device_release(interop)
  end subroutine
end program
