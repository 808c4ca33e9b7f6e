// SPDX-License-Identifier: Apache-2.0
// Programs that have been built, and kernels of them that are handed out and come back. Each layer
// has a table of its own. A program stays until the table is cleared, and so does a kernel.
//
// A `Layer` has
//   context                       what tells contexts apart; can be compared
//   program                       owns a reference to a program
//   kernel                        owns a kernel, as std::unique_ptr does
//   share(program)                another reference; throws what the driver says
//   give_back(status, program)    releases, and keeps what the driver says
//   give_back_kernel(status, void*)
//   table_made()                  called under the lock of a table that had nothing; false: no
//   memory
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <new>
#include <tarn_serv.h>

#include "kernel_key.hpp"
#include "serv_array.hpp"
#include "serv_lock.hpp"
#include "tarn_gpu.h"
#include "tarn_gpu_kernel.h"

namespace kestrel::tarn::gpu {

constexpr std::size_t entry_alignment = 16;

/// A block of the core's allocator with these bytes and `zeros` more; null for a null view.
inline char* copied(forge::byte_view bytes, std::size_t zeros) {
  if (bytes.data == nullptr) {
    return nullptr;
  }
  auto* const block = static_cast<char*>(tarn_serv_malloc(bytes.size + zeros, entry_alignment));
  if (block == nullptr) {
    throw std::bad_alloc();
  }
  std::memcpy(block, bytes.data, bytes.size);
  std::memset(block + bytes.size, 0, zeros);
  return block;
}

/// Where programs run.
template <typename Layer>
struct program_place {
  void* device;  // native
  typename Layer::context context;
  tarn_gpu_backend_t backend;
};

template <typename Layer>
struct program_entry {
  void* device;
  typename Layer::context context;
  tarn_gpu_backend_t backend;
  std::int32_t domain;
  char* name = nullptr;  // this and the next two are owned, from the core's allocator
  char* key = nullptr;
  std::size_t key_len = 0;
  char* payload = nullptr;
  std::size_t payload_len = 0;
  typename Layer::program program{};
  program_entry* bucket_next = nullptr;
  tarn_gpu_kernel_struct_t* kernels = nullptr;

  program_entry(const program_place<Layer>& place, std::int32_t of_domain)
      : device(place.device), context(place.context), backend(place.backend), domain(of_domain) {}
  program_entry(const program_entry&) = delete;
  program_entry& operator=(const program_entry&) = delete;
  ~program_entry() {
    tarn_serv_free(payload);
    tarn_serv_free(key);
    tarn_serv_free(name);
  }

  bool is_for(const program_place<Layer>& place, const kernel_key& wanted) const {
    return device == place.device && context == place.context && domain == wanted.domain &&
           same_bytes({key, key_len}, wanted.blob) &&
           (wanted.is_self_naming() || same_names(name, wanted.name));
  }
};

template <typename Layer>
class kernel_cache {
 public:
  using entry = program_entry<Layer>;
  using place = program_place<Layer>;
  using program = typename Layer::program;

  static constexpr std::uint64_t bucket_total = 1021;
  static constexpr std::size_t buckets_alignment = 128;

  struct found_program {
    entry* where = nullptr;                      // null: there is none
    program reference{};                         // the finder's own, unless a kernel was taken
    tarn_gpu_kernel_struct_t* kernel = nullptr;  // taken for the finder
  };

  /// Looks a program up, and takes a free kernel of it if one is wanted.
  found_program fetch(const place& at, const kernel_key& key, bool want_kernel) {
    const serv_lock guard(&lock);
    found_program found;
    found.where = bucket_count == 0 ? nullptr : find(at, key);
    if (found.where != nullptr) {
      found.kernel = want_kernel ? take_free(found.where->kernels) : nullptr;
      if (found.kernel == nullptr) {
        found.reference = Layer::share(found.where->program);
      }
    }
    return found;
  }

  /// Adds a program, or puts it in the place of one with the same key. \throws std::bad_alloc, or
  /// what Layer::share does; the table is then as before
  entry* insert(const place& at, const kernel_key& key, forge::byte_view payload,
                const program& built) {
    const serv_lock guard(&lock);
    provide_buckets();
    program shared = Layer::share(built);
    entry* where = find(at, key);
    if (where == nullptr) {
      where = make_entry(at, key, payload).release();
      entry*& first = bucket_of(at, key);
      where->bucket_next = first;
      first = where;
      ++count;
    }
    where->program = std::move(shared);
    return where;
  }

  /// Adds a kernel to those of a program, as taken by the caller. \throws std::bad_alloc
  tarn_gpu_kernel_struct_t* add(entry& where, typename Layer::kernel kernel) {
    tarn_gpu_kernel_struct_t* const handle = make_handle(std::move(kernel), TARN_GPU_KERNEL_TAKEN);
    const serv_lock guard(&lock);
    handle->next = where.kernels;
    where.kernels = handle;
    return handle;
  }

  /// A handle that is in no table.
  static tarn_gpu_kernel_struct_t* make_handle(typename Layer::kernel kernel, std::uint32_t state) {
    record_owner<tarn_gpu_kernel_struct_t> handle =
        make_record<tarn_gpu_kernel_struct_t>(nullptr, state, kernel.get());
    if (handle == nullptr) {
      throw std::bad_alloc();
    }
    static_cast<void>(kernel.release());
    return handle.release();
  }

  /// Releases everything; the table can be used again.
  void clear(int* status) {
    const serv_lock guard(&lock);
    for (std::uint64_t i = 0; i < bucket_count; ++i) {
      while (entry* const first = buckets[i]) {
        buckets[i] = first->bucket_next;
        release(status, record_owner<entry>(first));
      }
    }
    forget_buckets();
  }

  std::uint64_t bucket_count = 0;  // of the array; 0 until first use
  std::uint64_t count = 0;         // of entries
  entry** buckets = nullptr;
  int lock = 0;  // guards the three, what they lead to, and the taking of kernels

 private:
  entry*& bucket_of(const place& at, const kernel_key& key) {
    return buckets[kernel_hash(at.device, key) % bucket_count];
  }

  entry* find(const place& at, const kernel_key& key) {
    entry* each = bucket_of(at, key);
    while (each != nullptr && !each->is_for(at, key)) {
      each = each->bucket_next;
    }
    return each;
  }

  void provide_buckets() {
    if (bucket_count != 0) {
      return;
    }
    buckets =
        static_cast<entry**>(tarn_serv_calloc(bucket_total, sizeof buckets[0], buckets_alignment));
    if (buckets == nullptr || !Layer::table_made()) {
      forget_buckets();
      throw std::bad_alloc();
    }
    bucket_count = bucket_total;
  }

  void forget_buckets() {
    tarn_serv_free(buckets);
    buckets = nullptr;
    bucket_count = count = 0;
  }

  static record_owner<entry> make_entry(const place& at, const kernel_key& key,
                                        forge::byte_view payload) {
    static_assert(alignof(entry) <= entry_alignment);
    void* const memory = tarn_serv_malloc(sizeof(entry), entry_alignment);
    if (memory == nullptr) {
      throw std::bad_alloc();
    }
    record_owner<entry> made(new (memory) entry(at, key.domain));
    made->name = copied(text_bytes(key.name), 1);
    made->key = copied(key.blob, 0);
    made->key_len = key.blob.size;
    made->payload = copied(payload, 0);
    made->payload_len = payload.size;
    return made;
  }

  /// Who gives a kernel back holds no lock: what was done with it before is seen here.
  static tarn_gpu_kernel_struct_t* take_free(tarn_gpu_kernel_struct_t* kernels) {
    for (tarn_gpu_kernel_struct_t* each = kernels; each != nullptr; each = each->next) {
      if (__atomic_load_n(&each->state, __ATOMIC_ACQUIRE) == TARN_GPU_KERNEL_FREE) {
        __atomic_store_n(&each->state, TARN_GPU_KERNEL_TAKEN, __ATOMIC_RELAXED);
        return each;
      }
    }
    return nullptr;
  }

  static void release(int* status, record_owner<entry> last) {
    Layer::give_back(status, std::move(last->program));
    while (tarn_gpu_kernel_struct_t* const each = last->kernels) {
      last->kernels = each->next;
      Layer::give_back_kernel(status, each->kernel);
      tarn_serv_free(each);
    }
  }
};

/// Gives a handle back: to its table, by a plain store without the table's lock, or, if it is in
/// none, for good.
template <typename Layer>
void release_handle(int* status, tarn_gpu_kernel_struct_t* handle) {
  if (handle == nullptr) {
    return;
  }
  if (handle->state == TARN_GPU_KERNEL_PRIVATE) {
    Layer::give_back_kernel(status, handle->kernel);
    tarn_serv_free(handle);
  } else {
    __atomic_store_n(&handle->state, TARN_GPU_KERNEL_FREE, __ATOMIC_RELEASE);
  }
}

}  // namespace kestrel::tarn::gpu
