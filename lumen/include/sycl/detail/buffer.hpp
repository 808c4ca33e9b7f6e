// SPDX-License-Identifier: Apache-2.0
// buffer (SYCL 2020, section 4.7.2): typed memory whose users are ordered by their accessors.
// A buffer works on a copy of the data it was made from, unless told to use the host pointer.
#pragma once

#include <algorithm>
#include <functional>
#include <iterator>
#include <memory>
#include <type_traits>
#include <utility>

#include "access.hpp"
#include "buffer_core.hpp"
#include "exception.hpp"
#include "property.hpp"
#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

template <typename DataT, int Dimensions, access_mode Mode, target Target,
          access::placeholder Placeholder>
class accessor;
template <typename DataT, int Dimensions, access_mode Mode>
class host_accessor;

namespace detail {

template <typename T, typename Allocator>
class typed_buffer final : public buffer_core {
 public:
  // Owns `count` elements, or uses `place` where it is given.
  typed_buffer(std::size_t count, T* place, const Allocator& allocator)
      : buffer_core(count * sizeof(T)), count_(count), allocator_(allocator) {
    if (place == nullptr && count != 0) {
      owned_ = std::allocator_traits<Allocator>::allocate(allocator_, count);
      place = owned_;
    } else {
      define();
    }
    data_ = place;
  }
  ~typed_buffer() override {
    if (owned_ != nullptr) {
      std::allocator_traits<Allocator>::deallocate(allocator_, owned_, count_);
    }
  }
  void write_back() override {
    const bool wanted = enabled_ && (final_ || owned_ == nullptr);
    if (wanted && come_home() && final_) {
      final_(static_cast<const T*>(data_), count_);
    }
  }
  void set_final(std::function<void(const T*, std::size_t)> place) { final_ = std::move(place); }
  void enable_write_back(bool enabled) { enabled_ = enabled; }
  const Allocator& allocator() const { return allocator_; }
  T* elements() const { return static_cast<T*>(data_); }

 private:
  std::size_t count_;
  Allocator allocator_;
  T* owned_ = nullptr;
  bool enabled_ = true;
  std::function<void(const T*, std::size_t)> final_;
};

struct buffer_access;

template <typename Container, typename T>
using enable_if_container = std::enable_if_t<
    std::is_convertible_v<decltype(std::data(std::declval<Container&>())), const T*> &&
        !std::is_array_v<Container>,
    decltype(std::size(std::declval<Container&>()))>;
}  // namespace detail

template <typename T, int Dimensions = 1,
          typename AllocatorT = buffer_allocator<std::remove_const_t<T>>>
class buffer {
  static_assert(!std::is_const_v<T>, "the element type of a buffer is not const");
  using core_type = detail::typed_buffer<T, AllocatorT>;

 public:
  using value_type = T;
  using reference = value_type&;
  using const_reference = const value_type&;
  using allocator_type = AllocatorT;

  buffer(const range<Dimensions>& sizes, const property_list& properties = {})
      : buffer(sizes, AllocatorT{}, properties) {}
  buffer(const range<Dimensions>& sizes, AllocatorT allocator, const property_list& properties = {})
      : range_(sizes), properties_(properties) {
    make(nullptr, allocator);
  }
  // The contents return to host_data when the last copy of the buffer is destroyed.
  buffer(T* host_data, const range<Dimensions>& sizes, const property_list& properties = {})
      : buffer(host_data, sizes, AllocatorT{}, properties) {}
  buffer(T* host_data, const range<Dimensions>& sizes, AllocatorT allocator,
         const property_list& properties = {})
      : range_(sizes), properties_(properties) {
    if (detail::property_access::has<property::buffer::use_host_ptr>(properties)) {
      make(host_data, allocator);
    } else {
      make(nullptr, allocator);
      if (host_data != nullptr) {
        load(host_data);
        set_final_data(host_data);
      }
    }
  }
  // The const original is only read.
  buffer(const T* host_data, const range<Dimensions>& sizes, const property_list& properties = {})
      : buffer(host_data, sizes, AllocatorT{}, properties) {}
  buffer(const T* host_data, const range<Dimensions>& sizes, AllocatorT allocator,
         const property_list& properties = {})
      : range_(sizes), properties_(properties) {
    make(nullptr, allocator);
    if (host_data != nullptr) {
      load(host_data);
    }
  }
  buffer(const std::shared_ptr<T>& host_data, const range<Dimensions>& sizes,
         const property_list& properties = {})
      : buffer(host_data, sizes, AllocatorT{}, properties) {}
  buffer(const std::shared_ptr<T>& host_data, const range<Dimensions>& sizes, AllocatorT allocator,
         const property_list& properties = {})
      : range_(sizes), properties_(properties) {
    from_shared(host_data, host_data.get(), allocator);
  }
  buffer(const std::shared_ptr<T[]>& host_data, const range<Dimensions>& sizes,
         const property_list& properties = {})
      : buffer(host_data, sizes, AllocatorT{}, properties) {}
  buffer(const std::shared_ptr<T[]>& host_data, const range<Dimensions>& sizes,
         AllocatorT allocator, const property_list& properties = {})
      : range_(sizes), properties_(properties) {
    from_shared(host_data, host_data.get(), allocator);
  }
  // A copy of the elements [first, last), never written back unless asked to.
  template <typename InputIterator, int D = Dimensions,
            typename = std::enable_if_t<
                D == 1 && std::is_convertible_v<
                              typename std::iterator_traits<InputIterator>::iterator_category,
                              std::input_iterator_tag>>>
  buffer(InputIterator first, InputIterator last, const property_list& properties = {})
      : buffer(first, last, AllocatorT{}, properties) {}
  template <typename InputIterator, int D = Dimensions,
            typename = std::enable_if_t<
                D == 1 && std::is_convertible_v<
                              typename std::iterator_traits<InputIterator>::iterator_category,
                              std::input_iterator_tag>>>
  buffer(InputIterator first, InputIterator last, AllocatorT allocator,
         const property_list& properties = {})
      : range_(static_cast<std::size_t>(std::distance(first, last))), properties_(properties) {
    make(nullptr, allocator);
    std::copy(first, last, core().elements());
    core().define();
  }
  // A contiguous container; written back when it is not const.
  template <typename Container, int D = Dimensions, typename = std::enable_if_t<D == 1>,
            typename = detail::enable_if_container<Container, T>>
  buffer(Container& container, const property_list& properties = {})
      : buffer(container, AllocatorT{}, properties) {}
  template <typename Container, int D = Dimensions, typename = std::enable_if_t<D == 1>,
            typename = detail::enable_if_container<Container, T>>
  buffer(Container& container, AllocatorT allocator, const property_list& properties = {})
      : buffer(std::data(container), range<1>(std::size(container)), allocator, properties) {}
  // A part of another buffer, which must lie in it without gaps: errc::invalid otherwise.
  buffer(buffer& parent, const id<Dimensions>& base, const range<Dimensions>& sizes)
      : handle_(parent.handle_), range_(sizes), properties_(parent.properties_), sub_(true) {
    const range<Dimensions>& outer = parent.range_;
    bool partial = false;  // a slower dimension may be cut only where all faster ones are whole
    bool fits = true;
    for (int d = Dimensions - 1; d >= 0; --d) {
      fits = fits && base[d] <= outer[d] && sizes[d] <= outer[d] - base[d];
      fits = fits && (!partial || sizes[d] == 1);
      partial = partial || sizes[d] != outer[d];
    }
    if (parent.sub_) {
      detail::throw_invalid("a sub-buffer cannot be made from a sub-buffer");
    }
    if (!fits) {
      detail::throw_invalid("a sub-buffer must be a contiguous part of its buffer");
    }
    first_ = detail::linear_index<Dimensions>(base, outer);
  }

  range<Dimensions> get_range() const { return range_; }
  std::size_t byte_size() const noexcept { return size() * sizeof(T); }
  std::size_t size() const noexcept { return range_.size(); }
  allocator_type get_allocator() const {
    if constexpr (std::is_default_constructible_v<AllocatorT>) {
      auto* typed = dynamic_cast<core_type*>(handle_->core.get());
      return typed != nullptr ? typed->allocator() : AllocatorT{};
    } else {
      return core().allocator();
    }
  }
  bool is_sub_buffer() const noexcept { return sub_; }

  template <access_mode Mode = access_mode::read_write, target Target = target::device>
  auto get_access(handler& group) {
    return accessor<T, Dimensions, Mode, Target, access::placeholder::false_t>(*this, group);
  }
  template <access_mode Mode = access_mode::read_write, target Target = target::device>
  auto get_access(handler& group, range<Dimensions> sizes, id<Dimensions> offset = {}) {
    return accessor<T, Dimensions, Mode, Target, access::placeholder::false_t>(*this, group, sizes,
                                                                               offset);
  }
  template <typename... Arguments>
  auto get_access(handler& group, Arguments... arguments) {
    return sycl::accessor(*this, group, arguments...);
  }
  template <typename... Arguments>
  auto get_host_access(Arguments... arguments) {
    return sycl::host_accessor(*this, arguments...);
  }

  // Where the contents go at the end: a pointer, an output iterator or a weak_ptr; nullptr for
  // nowhere.
  template <typename Destination = std::nullptr_t>
  void set_final_data(Destination final_data = nullptr) {
    if constexpr (std::is_null_pointer_v<Destination>) {
      core().set_final(nullptr);
    } else {
      core().set_final([final_data](const T* from, std::size_t count) {
        if constexpr (std::is_same_v<Destination, std::weak_ptr<T>> ||
                      std::is_same_v<Destination, std::weak_ptr<T[]>>) {
          if (auto alive = final_data.lock()) {
            std::copy_n(from, count, alive.get());
          }
        } else {
          std::copy_n(from, count, final_data);
        }
      });
    }
  }
  void set_write_back(bool flag = true) { core().enable_write_back(flag); }

  // The same bytes as another type and shape; errc::invalid when the sizes differ or a sub-buffer
  // does not begin at a multiple of the new element's size.
  template <typename ReinterpretT, int ReinterpretDim,
            typename ReinterpretAllocator = typename std::allocator_traits<
                AllocatorT>::template rebind_alloc<std::remove_const_t<ReinterpretT>>>
  buffer<ReinterpretT, ReinterpretDim, ReinterpretAllocator> reinterpret(
      range<ReinterpretDim> sizes) const {
    if (sizes.size() * sizeof(ReinterpretT) != byte_size()) {
      detail::throw_invalid("reinterpret: the byte size of the new shape differs");
    }
    if (first_ * sizeof(T) % sizeof(ReinterpretT) != 0) {
      detail::throw_invalid("reinterpret: the sub-buffer begins inside an element of the new type");
    }
    return buffer<ReinterpretT, ReinterpretDim, ReinterpretAllocator>(
        handle_, sizes, properties_, first_ * sizeof(T) / sizeof(ReinterpretT), sub_);
  }
  template <typename ReinterpretT, int ReinterpretDim = Dimensions,
            typename ReinterpretAllocator = typename std::allocator_traits<
                AllocatorT>::template rebind_alloc<std::remove_const_t<ReinterpretT>>,
            std::enable_if_t<ReinterpretDim == 1 || (ReinterpretDim == Dimensions &&
                                                     sizeof(ReinterpretT) == sizeof(T)),
                             int> = 0>
  buffer<ReinterpretT, ReinterpretDim, ReinterpretAllocator> reinterpret() const {
    if constexpr (ReinterpretDim == 1) {
      return reinterpret<ReinterpretT, 1, ReinterpretAllocator>(
          range<1>(byte_size() / sizeof(ReinterpretT)));
    } else {
      return reinterpret<ReinterpretT, ReinterpretDim, ReinterpretAllocator>(range_);
    }
  }

  template <typename Property>
  bool has_property() const noexcept {
    return detail::property_access::has<Property>(properties_);
  }

  template <typename Property>
  Property get_property() const {
    return detail::property_access::get<Property>(properties_);
  }

  friend bool operator==(const buffer& a, const buffer& b) {
    return a.handle_ == b.handle_ && a.first_ == b.first_ && a.range_ == b.range_;
  }
  friend bool operator!=(const buffer& a, const buffer& b) { return !(a == b); }

 private:
  friend struct detail::buffer_access;
  friend struct std::hash<buffer>;
  template <typename U, int D, typename A>
  friend class buffer;

  buffer(std::shared_ptr<detail::buffer_handle> handle, const range<Dimensions>& sizes,
         const property_list& properties, std::size_t first, bool sub)
      : handle_(std::move(handle)),
        range_(sizes),
        properties_(properties),
        first_(first),
        sub_(sub) {}

  void make(T* place, const AllocatorT& allocator) {
    if (detail::byte_count(range_, sizeof(T)) == static_cast<std::size_t>(-1)) {
      throw exception(make_error_code(errc::memory_allocation),
                      "the bytes of the buffer cannot be counted");
    }
    handle_ = std::make_shared<detail::buffer_handle>(
        std::make_shared<core_type>(range_.size(), place, allocator));
  }
  void load(const T* from) {
    std::copy_n(from, range_.size(), core().elements());
    core().define();
  }
  template <typename Shared>
  void from_shared(const Shared& shared, T* raw, const AllocatorT& allocator) {
    make(detail::property_access::has<property::buffer::use_host_ptr>(properties_) ? raw : nullptr,
         allocator);
    if (raw != nullptr) {
      load_unless_same(raw);
    }
    core().set_final([shared](const T* from, std::size_t count) {
      if (shared && shared.get() != from) {
        std::copy_n(from, count, shared.get());
      }
    });
  }
  void load_unless_same(const T* from) {
    if (core().elements() != from) {
      load(from);
    }
  }
  core_type& core() const {
    // A reinterpreted buffer has no say over the original's elements.
    auto* typed = dynamic_cast<core_type*>(handle_->core.get());
    if (typed == nullptr) {
      detail::throw_invalid("this is not possible through a reinterpreted buffer");
    }
    return *typed;
  }

  std::shared_ptr<detail::buffer_handle> handle_;
  range<Dimensions> range_;
  property_list properties_;
  std::size_t first_ = 0;
  bool sub_ = false;
};

template <typename T, int Dimensions, typename Allocator>
buffer(const T*, const range<Dimensions>&, Allocator, const property_list& = {})
    -> buffer<T, Dimensions, Allocator>;
template <typename T, int Dimensions>
buffer(const T*, const range<Dimensions>&, const property_list& = {}) -> buffer<T, Dimensions>;
template <typename InputIterator,
          typename = typename std::iterator_traits<InputIterator>::iterator_category>
buffer(InputIterator, InputIterator, const property_list& = {})
    -> buffer<typename std::iterator_traits<InputIterator>::value_type, 1>;
template <typename Container, typename = typename Container::value_type>
buffer(Container&, const property_list& = {}) -> buffer<typename Container::value_type, 1>;

namespace detail {
// How accessors reach what a buffer keeps private.
struct buffer_access {
  template <typename Buffer>
  static const std::shared_ptr<buffer_core>& core(const Buffer& b) {
    return b.handle_->core;
  }
  template <typename T, int Dimensions, typename Allocator>
  static T* data(const buffer<T, Dimensions, Allocator>& b) {
    return static_cast<T*>(b.handle_->core->data()) + b.first_;
  }
};
}  // namespace detail

LUMEN_NAMESPACE_END

namespace std {
template <typename T, int Dimensions, typename Allocator>
struct hash<sycl::buffer<T, Dimensions, Allocator>> {
  size_t operator()(const sycl::buffer<T, Dimensions, Allocator>& b) const noexcept {
    return hash<const void*>()(b.handle_.get()) + b.first_;
  }
};
}  // namespace std
