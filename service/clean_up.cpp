// SPDX-License-Identifier: Apache-2.0
// The list of clean-up callbacks.
#include "clean_up.hpp"

#include <cstddef>
#include <tarn_serv.h>

#include "serv_array.hpp"
#include "serv_lock.hpp"
#include "tarn_gpu.h"

namespace kestrel::tarn::gpu {
namespace {

static_assert(sizeof(sycl_destructor_list) == 264, "32 pointers and a count, padded");

sycl_destructor_list* list = nullptr;
int list_lock = 0;    // held while callbacks run
int adding_lock = 0;  // of the pointer and of what it points to; no other lock is taken under it

/// False when memory is exhausted.
bool provide_list() {
  if (list == nullptr) {
    list = make_record<sycl_destructor_list>().release();
    if (list != nullptr) {
      tarn_serv_core_register_sycl_destructor(tarn_sycl_destructor);
    }
  }
  return list != nullptr;
}

void end_for_full_list() {
  constexpr int standard_output = 0;
  constexpr int full_list_message = 1449;
  constexpr int exit_status = 1;
  tarn_serv_print(standard_output, full_list_message, 0);
  tarn_serv_exit(exit_status);
}

/// The list is no longer the one that is added to, so callbacks may add to the next one.
record_owner<sycl_destructor_list> take_list() {
  const serv_lock guard(&adding_lock);
  sycl_destructor_list* const taken = list;
  list = nullptr;
  return record_owner<sycl_destructor_list>(taken);
}

}  // namespace

namespace {

enum class addition { done, out_of_memory, full };

addition add(clean_up_callback callback) {
  const serv_lock guard(&adding_lock);
  if (!provide_list()) {
    return addition::out_of_memory;
  }
  if (list->count >= sycl_destructor_list::limit) {
    return addition::full;
  }
  list->callbacks[list->count++] = callback;
  return addition::done;
}

// Without a lock of the list: what ends the process may run the clean-up.
bool ends_if_full(addition result) {
  if (result == addition::full) {
    end_for_full_list();
  }
  return result == addition::done;
}

}  // namespace

bool register_sycl_destructor_nolock(clean_up_callback callback) {
  return ends_if_full(add(callback));
}

bool register_sycl_destructor(clean_up_callback callback) {
  addition result = addition::full;
  {
    const serv_lock guard(&list_lock);
    result = add(callback);
  }
  return ends_if_full(result);
}

}  // namespace kestrel::tarn::gpu

void tarn_sycl_destructor_local() {
  using namespace kestrel::tarn::gpu;
  const record_owner<sycl_destructor_list> taken = take_list();
  for (std::int32_t i = taken == nullptr ? 0 : taken->count; i > 0; --i) {
    if (const clean_up_callback callback = taken->callbacks[i - 1]) {
      callback(taken.get());
    }
  }
}

void tarn_sycl_destructor() {
  const kestrel::tarn::gpu::serv_lock guard(&kestrel::tarn::gpu::list_lock);
  tarn_sycl_destructor_local();
}
