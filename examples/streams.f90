! SPDX-License-Identifier: Apache-2.0
! Streams in Fortran, without any SYCL: as streams.c, whose lines it prints. Independent workers in
! three ways, a saved stream that goes on, and a quasi-random estimate of pi.
!
! Build: gfortran $(pkg-config --variable=fortrandir tarn_statistics)/tarn_rvx.f90 streams.f90
!        $(pkg-config --libs tarn_statistics) -o streams
program streams
  use, intrinsic :: iso_c_binding
  use tarn_rvx
  implicit none
  integer, parameter :: workers = 4
  integer(c_int64_t), parameter :: words_per_worker = 5, seed = 2026

  call blocks()
  call cards()
  call family()
  call saved()
  call pi()

contains

  ! Every function returns a status; a bad argument is also told on standard error.
  subroutine check(status, what)
    integer(c_int), intent(in) :: status
    character(len=*), intent(in) :: what
    if (status /= RVX_STATUS_OK) then
      print '(a, a, i0)', what, ": status ", status
      error stop 1
    end if
  end subroutine

  subroutine print_words(label, worker, stream)
    character(len=*), intent(in) :: label
    integer, intent(in) :: worker
    type(c_ptr), intent(in) :: stream
    integer(c_int32_t) :: words(words_per_worker)
    call check(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, words_per_worker, words), "words")
    print '("  ", a, " ", i0, ":", *(:, " ", z8.8))', label, worker, words
  end subroutine

  ! One sequence in blocks: worker w starts w * 10^12 words further on.
  subroutine blocks()
    type(c_ptr) :: stream
    integer :: w
    print '(a)', "Blocks of one sequence (skip-ahead, philox4x32x10)"
    do w = 0, workers - 1
      call check(rvxNewStream(stream, RVX_BRNG_PHILOX4X32X10, seed), "new stream")
      call check(rvxSkipAheadStream(stream, w * 1000000000000_c_int64_t), "skip")
      call print_words("worker", w, stream)
      call check(rvxDeleteStream(stream), "delete")
    end do
  end subroutine

  ! One sequence dealt out like cards: worker w receives words w, w + workers, ...
  subroutine cards()
    type(c_ptr) :: stream
    integer :: w
    print '(a)', "One sequence dealt out (leapfrog, mcg31m1)"
    do w = 0, workers - 1
      call check(rvxNewStream(stream, RVX_BRNG_MCG31, seed), "new stream")
      call check(rvxLeapfrogStream(stream, int(w, c_int64_t), int(workers, c_int64_t)), "leapfrog")
      call print_words("worker", w, stream)
      call check(rvxDeleteStream(stream), "delete")
    end do
  end subroutine

  ! A generator of its own for each worker: members of a family.
  subroutine family()
    type(c_ptr) :: stream
    integer :: w
    print '(a)', "A family of generators (mt2203)"
    do w = 0, workers - 1
      call check(rvxNewStream(stream, RVX_BRNG_MT2203 + w, seed), "new stream")
      call print_words("member", w, stream)
      call check(rvxDeleteStream(stream), "delete")
    end do
  end subroutine

  ! A stream that was saved goes on where it stood.
  subroutine saved()
    type(c_ptr) :: stream, loaded
    integer(c_int32_t) :: skipped(1000)
    integer(c_int8_t), allocatable :: image(:)
    print '(a)', "Saved and loaded (mt19937)"
    call check(rvxNewStream(stream, RVX_BRNG_MT19937, 5489_c_int64_t), "new stream")
    call check(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, 1000_c_int64_t, skipped), "words")
    allocate (image(rvxGetStreamSize(stream)))
    call check(rvxSaveStreamM(stream, image), "save")
    call check(rvxLoadStreamM(loaded, image), "load")
    call print_words("saved ", 0, stream)
    call print_words("loaded", 0, loaded)
    call check(rvxDeleteStream(stream), "delete")
    call check(rvxDeleteStream(loaded), "delete")
  end subroutine

  ! Points of the unit square by sobol: the share that lies in the quarter of a circle.
  subroutine pi()
    integer(c_int64_t), parameter :: points = 2_c_int64_t**16
    integer(c_int32_t), allocatable :: words(:, :)
    real(c_double) :: x(2)
    type(c_ptr) :: stream
    integer(c_int64_t) :: i, inside
    allocate (words(2, points))
    inside = 0
    call check(rvxNewStream(stream, RVX_BRNG_SOBOL, 2_c_int64_t), "new stream")
    call check(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, 2 * points, words), "words")
    do i = 1, points
      ! Integers have a sign here: the upper half of the words is negative.
      x = modulo(words(:, i) / 2.0_c_double**32, 1.0_c_double)
      if (sum(x**2) < 1) inside = inside + 1
    end do
    print '(a, i0, a, f7.5)', "pi by ", points, " points of sobol: ", 4.0_c_double * inside / points
    call check(rvxDeleteStream(stream), "delete")
  end subroutine
end program
