// SPDX-License-Identifier: Apache-2.0
// Unified shared memory (SYCL 2020, section 4.8): allocation, release, and what kind of memory
// a pointer belongs to. Sizes are bytes for void forms, elements for typed ones. What cannot be
// allocated is a null pointer; memory is aligned to 64 bytes unless more is asked for.
#pragma once

#include <cstddef>
#include <type_traits>

#include "queue.hpp"

LUMEN_NAMESPACE_BEGIN

namespace usm {
enum class alloc : char { host, device, shared, unknown };
}  // namespace usm

LUMEN_EXPORT void* aligned_alloc(std::size_t alignment, std::size_t bytes, const device& dev,
                                 const context& ctx, usm::alloc kind,
                                 const property_list& properties = {});
// Throws errc::invalid for a pointer that no allocation of the context begins at.
LUMEN_EXPORT void free(void* pointer, const context& ctx);
inline void free(void* pointer, const queue& q) {
  free(pointer, q.get_context());
}

// The kind of the allocation that the pointer lies in, usm::alloc::unknown for any other.
LUMEN_EXPORT usm::alloc get_pointer_type(const void* pointer, const context& ctx);
// Throws errc::invalid for a pointer outside every allocation of the context.
LUMEN_EXPORT device get_pointer_device(const void* pointer, const context& ctx);

inline void* aligned_alloc(std::size_t alignment, std::size_t bytes, const queue& q,
                           usm::alloc kind, const property_list& properties = {}) {
  return aligned_alloc(alignment, bytes, q.get_device(), q.get_context(), kind, properties);
}
inline void* malloc(std::size_t bytes, const device& dev, const context& ctx, usm::alloc kind,
                    const property_list& properties = {}) {
  return aligned_alloc(0, bytes, dev, ctx, kind, properties);
}
inline void* malloc(std::size_t bytes, const queue& q, usm::alloc kind,
                    const property_list& properties = {}) {
  return aligned_alloc(0, bytes, q, kind, properties);
}

namespace detail {
// Null when `count` elements of T cannot be counted in bytes.
template <typename T, typename... Place>
T* allocate_elements(std::size_t alignment, std::size_t count, const Place&... place) {
  if (count > static_cast<std::size_t>(-1) / sizeof(T)) {
    return nullptr;
  }
  const std::size_t natural = alignof(T) > alignment ? alignof(T) : alignment;
  return static_cast<T*>(sycl::aligned_alloc(natural, count * sizeof(T), place...));
}
LUMEN_EXPORT device first_device(const context& ctx);
}  // namespace detail

template <typename T>
T* aligned_alloc(std::size_t alignment, std::size_t count, const device& dev, const context& ctx,
                 usm::alloc kind, const property_list& properties = {}) {
  return detail::allocate_elements<T>(alignment, count, dev, ctx, kind, properties);
}
template <typename T>
T* aligned_alloc(std::size_t alignment, std::size_t count, const queue& q, usm::alloc kind,
                 const property_list& properties = {}) {
  return detail::allocate_elements<T>(alignment, count, q, kind, properties);
}
template <typename T>
T* malloc(std::size_t count, const device& dev, const context& ctx, usm::alloc kind,
          const property_list& properties = {}) {
  return detail::allocate_elements<T>(0, count, dev, ctx, kind, properties);
}
template <typename T>
T* malloc(std::size_t count, const queue& q, usm::alloc kind,
          const property_list& properties = {}) {
  return detail::allocate_elements<T>(0, count, q, kind, properties);
}

// malloc_device, malloc_shared and their aligned forms, void and typed.
#define LUMEN_USM_FORMS(kind)                                                                    \
  inline void* malloc_##kind(std::size_t bytes, const device& dev, const context& ctx,           \
                             const property_list& properties = {}) {                             \
    return aligned_alloc(0, bytes, dev, ctx, usm::alloc::kind, properties);                      \
  }                                                                                              \
  inline void* malloc_##kind(std::size_t bytes, const queue& q,                                  \
                             const property_list& properties = {}) {                             \
    return aligned_alloc(0, bytes, q, usm::alloc::kind, properties);                             \
  }                                                                                              \
  inline void* aligned_alloc_##kind(std::size_t alignment, std::size_t bytes, const device& dev, \
                                    const context& ctx, const property_list& properties = {}) {  \
    return aligned_alloc(alignment, bytes, dev, ctx, usm::alloc::kind, properties);              \
  }                                                                                              \
  inline void* aligned_alloc_##kind(std::size_t alignment, std::size_t bytes, const queue& q,    \
                                    const property_list& properties = {}) {                      \
    return aligned_alloc(alignment, bytes, q, usm::alloc::kind, properties);                     \
  }                                                                                              \
  template <typename T>                                                                          \
  T* malloc_##kind(std::size_t count, const device& dev, const context& ctx,                     \
                   const property_list& properties = {}) {                                       \
    return aligned_alloc<T>(0, count, dev, ctx, usm::alloc::kind, properties);                   \
  }                                                                                              \
  template <typename T>                                                                          \
  T* malloc_##kind(std::size_t count, const queue& q, const property_list& properties = {}) {    \
    return aligned_alloc<T>(0, count, q, usm::alloc::kind, properties);                          \
  }                                                                                              \
  template <typename T>                                                                          \
  T* aligned_alloc_##kind(std::size_t alignment, std::size_t count, const device& dev,           \
                          const context& ctx, const property_list& properties = {}) {            \
    return aligned_alloc<T>(alignment, count, dev, ctx, usm::alloc::kind, properties);           \
  }                                                                                              \
  template <typename T>                                                                          \
  T* aligned_alloc_##kind(std::size_t alignment, std::size_t count, const queue& q,              \
                          const property_list& properties = {}) {                                \
    return aligned_alloc<T>(alignment, count, q, usm::alloc::kind, properties);                  \
  }
LUMEN_USM_FORMS(device)
LUMEN_USM_FORMS(shared)
#undef LUMEN_USM_FORMS

// Host allocations belong to a context alone.
inline void* aligned_alloc_host(std::size_t alignment, std::size_t bytes, const context& ctx,
                                const property_list& properties = {}) {
  return aligned_alloc(alignment, bytes, detail::first_device(ctx), ctx, usm::alloc::host,
                       properties);
}
inline void* aligned_alloc_host(std::size_t alignment, std::size_t bytes, const queue& q,
                                const property_list& properties = {}) {
  return aligned_alloc(alignment, bytes, q, usm::alloc::host, properties);
}
inline void* malloc_host(std::size_t bytes, const context& ctx,
                         const property_list& properties = {}) {
  return aligned_alloc_host(0, bytes, ctx, properties);
}
inline void* malloc_host(std::size_t bytes, const queue& q, const property_list& properties = {}) {
  return aligned_alloc_host(0, bytes, q, properties);
}
template <typename T>
T* aligned_alloc_host(std::size_t alignment, std::size_t count, const context& ctx,
                      const property_list& properties = {}) {
  return aligned_alloc<T>(alignment, count, detail::first_device(ctx), ctx, usm::alloc::host,
                          properties);
}
template <typename T>
T* aligned_alloc_host(std::size_t alignment, std::size_t count, const queue& q,
                      const property_list& properties = {}) {
  return aligned_alloc<T>(alignment, count, q, usm::alloc::host, properties);
}
template <typename T>
T* malloc_host(std::size_t count, const context& ctx, const property_list& properties = {}) {
  return aligned_alloc_host<T>(0, count, ctx, properties);
}
template <typename T>
T* malloc_host(std::size_t count, const queue& q, const property_list& properties = {}) {
  return aligned_alloc_host<T>(0, count, q, properties);
}

// A standard allocator over host or shared allocations; throws errc::memory_allocation.
template <typename T, usm::alloc Kind, std::size_t Alignment = 0>
class usm_allocator {
  static_assert(Kind == usm::alloc::host || Kind == usm::alloc::shared,
                "usm_allocator serves host and shared memory");

 public:
  using value_type = T;
  using propagate_on_container_copy_assignment = std::true_type;
  using propagate_on_container_move_assignment = std::true_type;
  using propagate_on_container_swap = std::true_type;
  template <typename U>
  struct rebind {
    using other = usm_allocator<U, Kind, Alignment>;
  };

  usm_allocator() = delete;
  usm_allocator(const context& ctx, const device& dev, const property_list& = {})
      : context_(ctx), device_(dev) {}
  usm_allocator(const queue& q, const property_list& = {})
      : context_(q.get_context()), device_(q.get_device()) {}
  template <typename U>
  usm_allocator(const usm_allocator<U, Kind, Alignment>& other) noexcept
      : context_(other.context_), device_(other.device_) {}

  T* allocate(std::size_t count) {
    T* place = aligned_alloc<T>(Alignment, count, device_, context_, Kind);
    if (place == nullptr && count != 0) {
      throw exception(make_error_code(errc::memory_allocation), "usm_allocator: out of memory");
    }
    return place;
  }
  void deallocate(T* place, std::size_t) {
    if (place != nullptr) {
      sycl::free(place, context_);
    }
  }

  template <typename U>
  friend bool operator==(const usm_allocator& a, const usm_allocator<U, Kind, Alignment>& b) {
    return a.same_place(b);
  }
  template <typename U>
  friend bool operator!=(const usm_allocator& a, const usm_allocator<U, Kind, Alignment>& b) {
    return !(a == b);
  }

 private:
  template <typename U, usm::alloc K, std::size_t A>
  friend class usm_allocator;
  template <typename U>
  bool same_place(const usm_allocator<U, Kind, Alignment>& other) const {
    return context_ == other.context_ && device_ == other.device_;
  }

  context context_;
  device device_;
};

LUMEN_NAMESPACE_END
