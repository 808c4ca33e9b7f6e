// SPDX-License-Identifier: Apache-2.0
// Random uses of one buffer, from kernels of all devices, host tasks, host accessors and commands,
// through windows, sub-buffers and other types, against the same changes of a plain array.
#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <random>

#include "every_device.hpp"

namespace {

using word = std::uint32_t;
using half = std::uint16_t;
constexpr std::size_t words = 48;
constexpr std::size_t steps = 80;

// What a change makes of the k-th element of a window.
template <typename T>
SYCL_EXTERNAL T changed(T x, std::size_t k, word salt) {
  return static_cast<T>(x * 31 + static_cast<word>(k) * 7 + salt);
}
SYCL_EXTERNAL word digested(word sum, word x) {
  return sum * 31 + x + 1;
}
SYCL_EXTERNAL std::size_t number_in(sycl::id<1> i, sycl::range<1>) {
  return i[0];
}
SYCL_EXTERNAL std::size_t number_in(sycl::id<2> i, sycl::range<2> sizes) {
  return i[0] * sizes[1] + i[1];
}

// Kernels, and the bodies of host tasks and host accesses.
template <typename Accessor, int D, bool Reads>
struct change {
  Accessor a;
  word salt;
  SYCL_EXTERNAL void operator()(sycl::id<D> i) const {
    using T = std::decay_t<decltype(a[i])>;
    a[i] = changed(Reads ? a[i] : T(0), number_in(i, a.get_range()), salt);
  }
};
template <typename Accessor>
struct digest {
  Accessor a;
  sycl::accessor<word, 1, sycl::access_mode::write> out;
  SYCL_EXTERNAL void operator()() const {
    word sum = 0;
    for (const auto& x : a) {
      sum = digested(sum, x);
    }
    out[0] = sum;
  }
};
struct add_from {
  sycl::accessor<word, 1, sycl::access_mode::read> from;
  sycl::accessor<word> to;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { to[i] += from[i]; }
};

template <typename Accessor>
word digest_of(const Accessor& a) {
  word sum = 0;
  for (const auto& x : a) {
    sum = digested(sum, x);
  }
  return sum;
}

// A window of the buffer, or of a part of it, as elements of some type.
template <typename T, int D>
struct view {
  sycl::buffer<T, D> memory;
  std::size_t first;  // of `memory` in the whole buffer, in elements
  sycl::range<D> size;
  sycl::id<D> offset;

  // Where the k-th element of the window lies in the whole buffer.
  std::size_t place(std::size_t k) const {
    if constexpr (D == 1) {
      return first + offset[0] + k;
    } else {
      return first + (offset[0] + k / size[1]) * memory.get_range()[1] + offset[1] + k % size[1];
    }
  }
};

class sequence {
 public:
  explicit sequence(unsigned seed) : random_(seed) {
    for (const sycl::device& device : sycl::device::get_devices()) {
      queues_.emplace_back(device);
      queues_.emplace_back(device, sycl::property::queue::in_order());
    }
    for (word& x : model_) {
      x = static_cast<word>(random_());
    }
  }

  // Ends with the contents written back to where they came from.
  void run() {
    std::vector<word> data = model_;
    std::vector<word> digests(steps, 1);
    expected_ = digests;
    {
      sycl::buffer<word> whole(data), sink(digests);
      sink_ = &sink;
      for (step_ = 0; step_ < steps; ++step_) {
        choose_view(whole);
      }
    }
    for (sycl::queue& q : queues_) {
      q.wait_and_throw();
    }
    for (const auto& check : checks_) {
      check();
    }
    EXPECT_EQ(digests, expected_) << "what kernels and host tasks read";
    EXPECT_EQ(data, model_) << "what was written back";
  }

 private:
  std::size_t below(std::size_t n) { return random_() % n; }
  sycl::queue& any_queue() { return queues_[below(queues_.size())]; }

  void choose_view(sycl::buffer<word>& whole) {
    // Neighbours, one inside another, and a single element.
    struct cut {
      std::size_t first, size;
    };
    constexpr cut cuts[] = {{0, 16}, {16, 32}, {20, 8}, {47, 1}};
    const cut& c = cuts[below(4)];
    switch (below(6)) {
      case 0:
        return use(window(sycl::buffer<word>(whole, c.first, c.size), c.first));
      case 1:
        return use(
            window(sycl::buffer<word>(whole, c.first, c.size).reinterpret<half>(), 2 * c.first));
      case 2:
        return use(window(whole.reinterpret<half>(), 0));
      case 3:
        return use(window(whole.reinterpret<word>(sycl::range<2>(6, words / 6)), 0));
      case 4:
        return add_lower_to_upper(whole);
      default:
        return use(window(whole, 0));
    }
  }

  // All of the memory or some of it.
  template <typename T, int D>
  view<T, D> window(const sycl::buffer<T, D>& memory, std::size_t first) {
    view<T, D> v{memory, first, memory.get_range(), {}};
    if (below(3) != 0) {
      for (int d = 0; d < D; ++d) {
        v.offset[d] = below(v.size[d]);
        v.size[d] = 1 + below(v.size[d] - v.offset[d]);
      }
    }
    return v;
  }

  template <typename T, int D>
  void use(view<T, D> v) {
    switch (below(13)) {
      case 0:
        return read_by_kernel(v);
      case 1:
        return change_by_kernel<sycl::access_mode::write>(v, sycl::write_only);
      case 2:
        return change_by_kernel<sycl::access_mode::write>(v, sycl::write_only, sycl::no_init);
      case 3:
      case 4:
        return change_by_kernel<sycl::access_mode::read_write>(v, sycl::read_write);
      case 5:
        return read_by_task(v);
      case 6:
        return change_by_task(v);
      case 7:
        return read_by_host(v);
      case 8:
        return change_by_host(v);
      case 9:
        return fill(v);
      case 10:
        return copy_out(v);
      case 11:
        return copy_in(v);
      default:
        any_queue().submit([&](sycl::handler& h) {
          h.update_host(sycl::accessor(v.memory, h, v.size, v.offset, sycl::read_only));
        });
    }
  }

  template <typename T, int D>
  void read_by_kernel(view<T, D>& v) {
    expected_[step_] = model_digest(v);
    any_queue().submit([&](sycl::handler& h) {
      using source = sycl::accessor<T, D, sycl::access_mode::read>;
      h.single_task(digest<source>{{v.memory, h, v.size, v.offset},
                                   {*sink_, h, sycl::range<1>(1), sycl::id<1>(step_)}});
    });
  }

  template <sycl::access_mode Mode, typename T, int D, typename... Rest>
  void change_by_kernel(view<T, D>& v, const Rest&... rest) {
    constexpr bool reads = Mode == sycl::access_mode::read_write;
    const word salt = change_model(v, reads);
    any_queue().submit([&](sycl::handler& h) {
      using target = sycl::accessor<T, D, Mode>;
      h.parallel_for(v.size,
                     change<target, D, reads>{{v.memory, h, v.size, v.offset, rest...}, salt});
    });
  }

  template <typename T, int D>
  void read_by_task(view<T, D>& v) {
    expected_[step_] = model_digest(v);
    any_queue().submit([&](sycl::handler& h) {
      const sycl::accessor a(v.memory, h, v.size, v.offset, sycl::read_only_host_task);
      const sycl::accessor out(*sink_, h, sycl::range<1>(1), sycl::id<1>(step_),
                               sycl::write_only_host_task);
      h.host_task([a, out] { out[0] = digest_of(a); });
    });
  }

  template <typename T, int D>
  void change_by_task(view<T, D>& v) {
    const word salt = change_model(v, true);
    any_queue().submit([&](sycl::handler& h) {
      const sycl::accessor a(v.memory, h, v.size, v.offset, sycl::read_write_host_task);
      h.host_task([a, salt] { change_all(a, salt, true); });
    });
  }

  template <typename T, int D>
  void read_by_host(view<T, D>& v) {
    const sycl::host_accessor a(v.memory, v.size, v.offset, sycl::read_only);
    EXPECT_EQ(digest_of(a), model_digest(v)) << "step " << step_;
  }

  template <typename T, int D>
  void change_by_host(view<T, D>& v) {
    if (below(2) == 0) {
      const sycl::host_accessor a(v.memory, v.size, v.offset);
      change_all(a, change_model(v, true), true);
    } else {
      const sycl::host_accessor a(v.memory, v.size, v.offset, sycl::write_only, sycl::no_init);
      change_all(a, change_model(v, false), false);
    }
  }

  template <typename T, int D>
  void fill(view<T, D>& v) {
    const auto value = static_cast<T>(random_());
    any_queue().submit([&](sycl::handler& h) {
      h.fill(sycl::accessor(v.memory, h, v.size, v.offset, sycl::write_only), value);
    });
    for (std::size_t k = 0; k < v.size.size(); ++k) {
      set(v.place(k), value);
    }
  }

  template <typename T, int D>
  void copy_out(view<T, D>& v) {
    const std::shared_ptr<T[]> to(new T[v.size.size()]());
    any_queue().submit([&](sycl::handler& h) {
      h.copy(sycl::accessor(v.memory, h, v.size, v.offset, sycl::read_only), to);
    });
    checks_.push_back([to, size = v.size.size(), expected = model_digest(v), step = step_] {
      word seen = 0;
      for (std::size_t k = 0; k < size; ++k) {
        seen = digested(seen, to[static_cast<std::ptrdiff_t>(k)]);
      }
      EXPECT_EQ(seen, expected) << "step " << step;
    });
  }

  template <typename T, int D>
  void copy_in(view<T, D>& v) {
    const std::shared_ptr<T[]> from(new T[v.size.size()]());
    for (std::size_t k = 0; k < v.size.size(); ++k) {
      from[static_cast<std::ptrdiff_t>(k)] = static_cast<T>(random_());
      set(v.place(k), from[static_cast<std::ptrdiff_t>(k)]);
    }
    any_queue().submit([&](sycl::handler& h) {
      h.copy(from, sycl::accessor(v.memory, h, v.size, v.offset, sycl::write_only));
    });
  }

  // Two accessors of one kernel on one buffer.
  void add_lower_to_upper(sycl::buffer<word>& whole) {
    const std::size_t count = 1 + below(words / 2);
    const std::size_t from = below(words / 2 - count + 1);
    const std::size_t to = words / 2 + below(words / 2 - count + 1);
    any_queue().submit([&](sycl::handler& h) {
      const sycl::range<1> size(count);
      h.parallel_for(
          size, add_from{{whole, h, size, sycl::id<1>(from)}, {whole, h, size, sycl::id<1>(to)}});
    });
    for (std::size_t k = 0; k < count; ++k) {
      model_[to + k] += model_[from + k];
    }
  }

  template <typename Accessor>
  static void change_all(const Accessor& a, word salt, bool reads) {
    std::size_t k = 0;
    for (auto& x : a) {
      x = changed(reads ? x : std::decay_t<decltype(x)>(0), k++, salt);
    }
  }

  // The model is changed and read through bytes, as elements of any type.
  template <typename T>
  T get(std::size_t place) const {
    T x;
    std::memcpy(&x, reinterpret_cast<const char*>(model_.data()) + place * sizeof(T), sizeof(T));
    return x;
  }
  template <typename T>
  void set(std::size_t place, T x) {
    std::memcpy(reinterpret_cast<char*>(model_.data()) + place * sizeof(T), &x, sizeof(T));
  }
  template <typename T, int D>
  word change_model(const view<T, D>& v, bool reads) {
    const auto salt = static_cast<word>(random_());
    for (std::size_t k = 0; k < v.size.size(); ++k) {
      set(v.place(k), changed(reads ? get<T>(v.place(k)) : T(0), k, salt));
    }
    return salt;
  }
  template <typename T, int D>
  word model_digest(const view<T, D>& v) const {
    word sum = 0;
    for (std::size_t k = 0; k < v.size.size(); ++k) {
      sum = digested(sum, get<T>(v.place(k)));
    }
    return sum;
  }

  std::mt19937 random_;
  std::vector<sycl::queue> queues_;
  std::vector<word> model_ = std::vector<word>(words);
  std::vector<word> expected_;  // what the step's kernel or task reads; 1 where it reads nothing
  std::vector<std::function<void()>> checks_;
  sycl::buffer<word>* sink_ = nullptr;
  std::size_t step_ = 0;
};

}  // namespace

TEST(own_memory_random, sequences_equal_those_on_a_plain_array) {
  for (unsigned seed = 1; seed <= 60; ++seed) {
    SCOPED_TRACE(seed);
    sequence(seed).run();
    if (HasFailure()) {
      break;
    }
  }
}
LUMEN_REPORTS_CUDA(own_memory_random)
