/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * Core services of the Tarn libraries: memory, locks, time, messages, verbose lines, reports of
 * bad arguments, threads, loading of the statistics library, and the end of the process.
 * Usable from C and C++. All functions may be called from any thread at any time. */
#ifndef TARN_SERV_H
#define TARN_SERV_H

#include <stddef.h>
#include <stdio.h>

/** \cond */
#define TARN_SERV_API __attribute__((visibility("default")))
#define TARN_SERV_PRINTF(format_at, first_at) \
  __attribute__((__format__(__printf__, format_at, first_at)))
/** \endcond */

#ifdef __cplusplus
extern "C" {
#endif

/** \defgroup serv_memory Memory
 * `alignment` is a power of two >= 1, in bytes, and is always met. NULL comes back when the
 * alignment is not a power of two, when a size overflows, or when memory is exhausted. A size of
 * 0 gives a valid block that holds nothing. Every block is given back by tarn_serv_free.
 * \{ */
/** A block of `size` bytes, whose contents are whatever was there. */
TARN_SERV_API void* tarn_serv_malloc(size_t size, size_t alignment);
/** As above for `count` elements of `size` bytes, all bytes zero. */
TARN_SERV_API void* tarn_serv_calloc(size_t count, size_t size, size_t alignment);
/** Moves a block to a new size, keeping the contents up to the lesser size. NULL `ptr` allocates.
 * When NULL comes back the old block is untouched and still the caller's. */
TARN_SERV_API void* tarn_serv_realloc(void* ptr, size_t size, size_t alignment);
/** NULL is ignored. */
TARN_SERV_API void tarn_serv_free(void* ptr);
/** \} */

/** \defgroup serv_locks Locks
 * A lock is a 32-bit word, 0 when free; a zeroed word is a ready lock. Not recursive.
 * \{ */
/** Waits until the lock is free and takes it. */
TARN_SERV_API void tarn_serv_lock(int* word);
/** Frees a lock that the caller holds. */
TARN_SERV_API void tarn_serv_unlock(int* word);
/** \} */

/** \defgroup serv_time Time
 * \{ */
/** Wall-clock seconds from an arbitrary origin; never goes backwards. */
TARN_SERV_API double tarn_serv_dsecnd(void);
/** Writes `seconds` for people: "N/A" for values <= 0 (and NaN), else "%.2fs" above one second,
 * "%.2fms" above one millisecond, "%.2fus" above one microsecond, and "%.0fns" below. The text is
 * cut to `size` bytes with its terminating NUL; 24 bytes hold any duration below 1e15 seconds. */
TARN_SERV_API void tarn_serv_format_seconds(char* out, size_t size, double seconds);
/** \} */

/** \defgroup serv_messages Messages
 * `channel` is 0 for standard output; any other value means standard error. Lines are written
 * whole: those of different threads do not mix.
 * \{ */
/** Prints the message `message_id` of core/src/messages.def with its `count` values, each a
 * const char *. An unknown number, or a count that the message does not take, prints a line that
 * names the number. */
TARN_SERV_API void tarn_serv_print(int channel, int message_id, int count, ...);
/** Prints as printf does; `count` is the number of values that follow. */
TARN_SERV_API void tarn_serv_format_print(int channel, const char* format, int count, ...)
    TARN_SERV_PRINTF(2, 4);
/** The same to an open file. */
TARN_SERV_API void tarn_serv_file_format_print(FILE* file, const char* format, int count, ...)
    TARN_SERV_PRINTF(2, 4);
/** \} */

/** \defgroup serv_verbose Verbose mode
 * \{ */
/** The current mode, which the caller may change: 0 off, 1 on, 2 on with device timing. It starts
 * as TARN_VERBOSE says. Never NULL. */
TARN_SERV_API int* tarn_serv_verbose_mode(void);
/** The file that verbose lines are appended to, from TARN_VERBOSE_OUTPUT_FILE; an empty string
 * means standard output. Never NULL. */
TARN_SERV_API const char* tarn_serv_verbose_output_file_mode(void);
/** Prints the banner (name, version, processor, threads, first interface used), the first time it
 * is called with the mode on. `iface`: 1 the OpenMP offload interface, 2 the SYCL interface, any
 * other value the host stream services. */
TARN_SERV_API void tarn_serv_print_verbose_header(int iface);
/** Prints the banner if it is still due, then "TARN_VERBOSE <text> <time>". Prints nothing when
 * the mode is off. */
TARN_SERV_API void tarn_serv_print_verbose_info(double seconds, const char* text);
/** Prints "TARN_VERBOSE <text> <times>" and a newline, whatever the mode. */
TARN_SERV_API void tarn_serv_print_verbose_line(const char* text, const char* times);
/** Prints `text` as it is, whatever the mode. This is the one way of all verbose output: to the
 * output file, opened anew for each call so that processes can share it, or to standard output.
 * If the file cannot be opened, a warning goes to standard error, and the text to standard
 * output. */
TARN_SERV_API void tarn_serv_print_verbose_text(const char* text);
/** \} */

/** \defgroup serv_reports Reports of bad arguments
 * \{ */
/** Receives a report: the function's name, of `name_length` characters, and the argument's number.
 */
typedef void (*tarn_serv_xerbla_callback)(const char* name, const int* position, int name_length);
/** Chooses who receives the reports. `callback`, a tarn_serv_xerbla_callback, takes the place of
 * the present receiver. With NULL, `kind` 0 leaves the receiver as it is (this is how a library
 * routine announces that it is about to report), and any other kind brings the default back.
 * Returns the callback that was in force, NULL for the default. */
TARN_SERV_API void* tarn_serv_set_xerbla_interface(void* callback, int kind);
/** Reports that the argument number `*position` (from 1) of the function `name`, of `name_length`
 * characters, is bad: to the callback, or in a line on standard error. */
TARN_SERV_API void tarn_serv_xerbla(const char* name, const int* position, int name_length);
/** \} */

/** \defgroup serv_threads Threads
 * \{ */
/** 1 if the number of threads may be adapted to the work, else 0; from TARN_DYNAMIC. */
TARN_SERV_API int tarn_serv_get_dynamic(void);
/** The most threads that one call may use, >= 1: as set, else as TARN_NUM_THREADS says, else the
 * CPUs that this process may run on. */
TARN_SERV_API int tarn_serv_get_max_threads(void);
/** `threads` >= 1; a lesser value is reported by tarn_serv_xerbla and changes nothing. */
TARN_SERV_API void tarn_serv_set_max_threads(int threads);
/** \} */

/** \defgroup serv_settings Settings
 * \{ */
/** Prints the table of the environment variables that the core reads, in Markdown. Each variable
 * is read once, when first needed; a malformed value is reported once on standard error, and the
 * default is taken. */
TARN_SERV_API void tarn_serv_print_settings(int channel);
/** \} */

/** \defgroup serv_vlx The statistics library
 * \{ */
/** Loads the statistics library: by name, as the dynamic loader searches (LD_LIBRARY_PATH comes
 * first), and failing that from the folder of this library. NULL if there is none; a later call
 * tries again. */
TARN_SERV_API void* tarn_serv_load_vlx(void);
/** The address of `name` in `module`, or NULL if either is missing. */
TARN_SERV_API void* tarn_serv_find_symbol(void* module, const char* name);
/** \} */

/** \defgroup serv_end The end of the process
 * \{ */
/** Decides about the end of the process with status `code`: it returns, or ends the process without
 * running exit functions (_exit, abort), since its caller may hold locks that they take. */
typedef void (*tarn_serv_exit_hook)(int code);
/** Sets who decides about tarn_serv_exit; NULL brings the default back. Returns the former hook. */
TARN_SERV_API tarn_serv_exit_hook tarn_serv_set_exit_hook(tarn_serv_exit_hook hook);
/** Calls the hook, and returns if the hook does. Without a hook: flushes the standard streams and
 * ends the process at once with `code`, running no clean-up. */
TARN_SERV_API void tarn_serv_exit(int code);
/** Remembers a function to be called when the process ends normally, or before this library is
 * unloaded, whichever comes first; latest first. The library that holds the function stays
 * loaded until then. NULL is ignored. */
TARN_SERV_API void tarn_serv_core_register_sycl_destructor(void (*function)(void));

/** \} */

#ifdef __cplusplus
}
#endif

#undef TARN_SERV_PRINTF

#endif
