// SPDX-License-Identifier: Apache-2.0
// accessor and host_accessor (SYCL 2020, sections 4.7.6.9 and 4.7.6.10): typed windows into
// buffers. Making one inside a command group orders the group after the buffer's earlier users.
#pragma once

#include <memory>
#include <utility>

#include "access.hpp"
#include "accessor_base.hpp"
#include "buffer.hpp"
#include "multi_ptr.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
template <typename DataT, access_mode Mode>
using element_for = std::conditional_t<Mode == access_mode::read, const DataT, DataT>;

template <int Dimensions>
inline void check_window(const range<Dimensions>& memory, const range<Dimensions>& part,
                         const id<Dimensions>& offset) {
  for (int d = 0; d < Dimensions; ++d) {
    if (offset[d] > memory[d] || part[d] > memory[d] - offset[d]) {
      throw_invalid("the range and offset of an accessor exceed its buffer");
    }
  }
}

// Whether an accessor gives up all that the buffer's memory holds.
template <access_mode Mode, typename Buffer, int Dimensions>
bool discards(const Buffer& source, const range<Dimensions>& part,
              const property_list& properties) {
  const bool gives_up = Mode == access_mode::discard_write ||
                        Mode == access_mode::discard_read_write ||
                        (mode_writes(Mode) && property_access::has<property::no_init>(properties));
  return gives_up &&
         part.size() * sizeof(typename Buffer::value_type) == buffer_access::core(source)->bytes();
}
}  // namespace detail

template <typename DataT, int Dimensions = 1,
          access_mode Mode = std::is_const_v<DataT> ? access_mode::read : access_mode::read_write,
          target Target = target::device,
          access::placeholder Placeholder = access::placeholder::false_t>
class accessor : public detail::window<detail::element_for<DataT, Mode>, Dimensions> {
  using base = detail::window<detail::element_for<DataT, Mode>, Dimensions>;
  using buffer_element = std::remove_const_t<DataT>;
  template <typename Allocator>
  using buffer_of = buffer<buffer_element, Dimensions, Allocator>;

 public:
  static constexpr access::address_space pointer_space = access::address_space::global_space;
  using element_type = detail::element_for<DataT, Mode>;
  template <access::decorated Decorated>
  using accessor_ptr = multi_ptr<element_type, pointer_space, Decorated>;

  accessor() = default;

  // Placeholders: bound to a command group by handler::require.
  template <typename Allocator>
  accessor(buffer_of<Allocator>& source, const property_list& properties = {})
      : accessor(source, source.get_range(), id<Dimensions>(), properties) {}
  template <typename Allocator, typename Tag,
            std::enable_if_t<detail::tag_traits<Tag>::is_tag, int> = 0>
  accessor(buffer_of<Allocator>& source, Tag, const property_list& properties = {})
      : accessor(source, source.get_range(), id<Dimensions>(), properties) {}
  template <typename Allocator>
  accessor(buffer_of<Allocator>& source, range<Dimensions> part,
           const property_list& properties = {})
      : accessor(source, part, id<Dimensions>(), properties) {}
  template <typename Allocator, typename Tag,
            std::enable_if_t<detail::tag_traits<Tag>::is_tag, int> = 0>
  accessor(buffer_of<Allocator>& source, range<Dimensions> part, Tag,
           const property_list& properties = {})
      : accessor(source, part, id<Dimensions>(), properties) {}
  template <typename Allocator>
  accessor(buffer_of<Allocator>& source, range<Dimensions> part, id<Dimensions> offset,
           const property_list& properties = {})
      : base(detail::buffer_access::data(source), source.get_range(), part, offset),
        core_(detail::buffer_access::core(source).get()),
        keeps_(!detail::discards<Mode>(source, part, properties)) {
    detail::check_window(source.get_range(), part, offset);
  }
  template <typename Allocator, typename Tag,
            std::enable_if_t<detail::tag_traits<Tag>::is_tag, int> = 0>
  accessor(buffer_of<Allocator>& source, range<Dimensions> part, id<Dimensions> offset, Tag,
           const property_list& properties = {})
      : accessor(source, part, offset, properties) {}

  // Bound to the command group at once. The rest is as above: part, offset, tag, properties.
  template <typename Allocator, typename... Rest>
  accessor(buffer_of<Allocator>& source, handler& group, const Rest&... rest)
      : accessor(source, rest...) {
    placeholder_ = false;
    if constexpr (Target == target::device) {
      if (core_ != nullptr) {
        this->first_ = static_cast<element_type*>(
            detail::require_on_device(group, *core_, host_address(), use()));
      }
    } else {
      bind(group);
    }
  }

  // Reading through an accessor made for more.
  template <typename Other, access_mode OtherMode,
            typename = std::enable_if_t<
                Mode == access_mode::read &&
                std::is_same_v<std::remove_const_t<Other>, std::remove_const_t<DataT>> &&
                (OtherMode == access_mode::read_write ||
                 (OtherMode == access_mode::read && !std::is_same_v<Other, DataT>))>>
  accessor(const accessor<Other, Dimensions, OtherMode, Target, Placeholder>& other)
      : base(const_cast<buffer_element*>(other.memory_start()), other.memory_, other.range_,
             other.offset_),
        core_(other.core_),
        placeholder_(other.placeholder_),
        keeps_(other.keeps_) {}

  bool is_placeholder() const { return placeholder_; }
  void swap(accessor& other) { std::swap(*this, other); }

  template <access::decorated Decorated>
  SYCL_EXTERNAL accessor_ptr<Decorated> get_multi_ptr() const noexcept {
    return accessor_ptr<Decorated>(this->memory_start());
  }
  // The start of the whole buffer, also for a ranged accessor.
  SYCL_EXTERNAL std::add_pointer_t<element_type> get_pointer() const noexcept {
    return this->memory_start();
  }

  friend bool operator==(const accessor& a, const accessor& b) {
    return a.core_ == b.core_ && a.first_ == b.first_ && a.range_ == b.range_;
  }
  friend bool operator!=(const accessor& a, const accessor& b) { return !(a == b); }

 private:
  friend class handler;
  friend struct std::hash<accessor>;
  template <typename D, int N, access_mode M, target G, access::placeholder P>
  friend class accessor;
  detail::access_kind use() const { return {detail::mode_writes(Mode), keeps_}; }
  void* host_address() const { return const_cast<buffer_element*>(this->first_); }
  void bind(handler& group) const {
    if (core_ != nullptr) {
      detail::require_on_host(group, *core_, use());
    }
  }
  // The same window of the host's memory, which the group then uses in place of its device's.
  accessor on_host(handler& group) const {
    accessor result = *this;
    if (core_ != nullptr) {
      result.first_ =
          static_cast<element_type*>(detail::back_on_host(group, *core_, host_address()));
    }
    return result;
  }

  detail::buffer_core* core_ = nullptr;
  bool placeholder_ = true;
  bool keeps_ = true;
};

namespace detail {
template <typename T>
inline constexpr bool is_accessor = false;
template <typename T, int D, access_mode M, target G, access::placeholder P>
inline constexpr bool is_accessor<accessor<T, D, M, G, P>> = true;
}  // namespace detail

// The tag, wherever it stands, decides mode and target.
namespace detail {
template <typename... Arguments>
struct find_tag {
  static constexpr access_mode mode = access_mode::read_write;
  static constexpr sycl::target target = sycl::target::device;
};
template <typename First, typename... Rest>
struct find_tag<First, Rest...>
    : std::conditional_t<tag_traits<First>::is_tag, tag_traits<First>, find_tag<Rest...>> {};
}  // namespace detail

template <typename T, int D, typename A, typename... Rest>
accessor(buffer<T, D, A>&, handler&, const Rest&...)
    -> accessor<T, D, detail::find_tag<Rest...>::mode, detail::find_tag<Rest...>::target,
                access::placeholder::false_t>;
template <typename T, int D, typename A, typename... Rest>
accessor(buffer<T, D, A>&, const Rest&...)
    -> accessor<T, D, detail::find_tag<Rest...>::mode, detail::find_tag<Rest...>::target,
                access::placeholder::true_t>;

// Access from the host program: waits for the buffer, and locks command groups out until the
// last copy is destroyed.
template <typename DataT, int Dimensions = 1,
          access_mode Mode = std::is_const_v<DataT> ? access_mode::read : access_mode::read_write>
class host_accessor : public detail::window<detail::element_for<DataT, Mode>, Dimensions> {
  using base = detail::window<detail::element_for<DataT, Mode>, Dimensions>;
  template <typename Allocator>
  using buffer_of = buffer<std::remove_const_t<DataT>, Dimensions, Allocator>;

 public:
  host_accessor() = default;

  template <typename Allocator>
  host_accessor(buffer_of<Allocator>& source, const property_list& properties = {})
      : host_accessor(source, source.get_range(), id<Dimensions>(), properties) {}
  template <typename Allocator, access_mode M>
  host_accessor(buffer_of<Allocator>& source, mode_tag_t<M>, const property_list& properties = {})
      : host_accessor(source, source.get_range(), id<Dimensions>(), properties) {}
  template <typename Allocator>
  host_accessor(buffer_of<Allocator>& source, range<Dimensions> part,
                const property_list& properties = {})
      : host_accessor(source, part, id<Dimensions>(), properties) {}
  template <typename Allocator, access_mode M>
  host_accessor(buffer_of<Allocator>& source, range<Dimensions> part, mode_tag_t<M>,
                const property_list& properties = {})
      : host_accessor(source, part, id<Dimensions>(), properties) {}
  template <typename Allocator>
  host_accessor(buffer_of<Allocator>& source, range<Dimensions> part, id<Dimensions> offset,
                const property_list& properties = {})
      : base(detail::buffer_access::data(source), source.get_range(), part, offset) {
    detail::check_window(source.get_range(), part, offset);
    hold_ = detail::hold_for_host(
        detail::buffer_access::core(source),
        {detail::mode_writes(Mode), !detail::discards<Mode>(source, part, properties)});
  }
  template <typename Allocator, access_mode M>
  host_accessor(buffer_of<Allocator>& source, range<Dimensions> part, id<Dimensions> offset,
                mode_tag_t<M>, const property_list& properties = {})
      : host_accessor(source, part, offset, properties) {}

  std::add_pointer_t<detail::element_for<DataT, Mode>> get_pointer() const noexcept {
    return this->memory_start();
  }
  void swap(host_accessor& other) { std::swap(*this, other); }

  friend bool operator==(const host_accessor& a, const host_accessor& b) {
    return a.hold_ == b.hold_ && a.first_ == b.first_;
  }
  friend bool operator!=(const host_accessor& a, const host_accessor& b) { return !(a == b); }

 private:
  friend struct std::hash<host_accessor>;
  std::shared_ptr<void> hold_;
};

template <typename T, int D, typename A, typename... Rest>
host_accessor(buffer<T, D, A>&, const Rest&...)
    -> host_accessor<T, D, detail::find_tag<Rest...>::mode>;

LUMEN_NAMESPACE_END

namespace std {
template <typename T, int D, sycl::access_mode M, sycl::target G, sycl::access::placeholder P>
struct hash<sycl::accessor<T, D, M, G, P>> {
  size_t operator()(const sycl::accessor<T, D, M, G, P>& a) const noexcept {
    return hash<const void*>()(a.first_);
  }
};
template <typename T, int D, sycl::access_mode M>
struct hash<sycl::host_accessor<T, D, M>> {
  size_t operator()(const sycl::host_accessor<T, D, M>& a) const noexcept {
    return hash<const void*>()(a.hold_.get());
  }
};
}  // namespace std
