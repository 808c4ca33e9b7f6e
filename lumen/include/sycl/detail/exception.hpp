// SPDX-License-Identifier: Apache-2.0
// Errors (SYCL 2020, section 4.13): error codes, the exception, lists of asynchronous
// exceptions and the handler that receives them.
#pragma once

#include <cstddef>
#include <exception>
#include <functional>
#include <memory>
#include <string>
#include <system_error>
#include <vector>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

class context;
namespace detail {
struct context_state;
class queue_core;
}  // namespace detail

enum class errc {
  success = 0,
  runtime = 1,
  kernel = 2,
  accessor = 3,
  nd_range = 4,
  event = 5,
  kernel_argument = 6,
  build = 7,
  invalid = 8,
  memory_allocation = 9,
  platform = 10,
  profiling = 11,
  feature_not_supported = 12,
  kernel_not_supported = 13,
  backend_mismatch = 14,
};

LUMEN_EXPORT const std::error_category& sycl_category() noexcept;
LUMEN_EXPORT std::error_code make_error_code(errc code) noexcept;

// What every failing call throws. Copies share the text.
class LUMEN_EXPORT exception : public virtual std::exception {
 public:
  exception(std::error_code code, const std::string& what_arg);
  exception(std::error_code code, const char* what_arg);
  explicit exception(std::error_code code);
  exception(int value, const std::error_category& category, const std::string& what_arg);
  exception(int value, const std::error_category& category, const char* what_arg);
  exception(int value, const std::error_category& category);
  exception(const context& ctx, std::error_code code, const std::string& what_arg);
  exception(const context& ctx, std::error_code code, const char* what_arg);
  exception(const context& ctx, std::error_code code);
  exception(const context& ctx, int value, const std::error_category& category,
            const std::string& what_arg);
  exception(const context& ctx, int value, const std::error_category& category,
            const char* what_arg);
  exception(const context& ctx, int value, const std::error_category& category);
  exception(const exception& other) noexcept;
  exception& operator=(const exception& other) noexcept;
  ~exception() override;

  const std::error_code& code() const noexcept { return code_; }
  const std::error_category& category() const noexcept { return code_.category(); }
  const char* what() const noexcept override;
  bool has_context() const noexcept;
  // Throws errc::invalid when no context was given.
  context get_context() const;

 private:
  std::error_code code_;
  std::shared_ptr<const std::string> text_;
  std::shared_ptr<detail::context_state> context_;
};

// The asynchronous errors handed to a handler in one call, oldest first.
class LUMEN_EXPORT exception_list {
 public:
  using value_type = std::exception_ptr;
  using reference = value_type&;
  using const_reference = const value_type&;
  using size_type = std::size_t;
  using iterator = std::vector<std::exception_ptr>::const_iterator;
  using const_iterator = iterator;

  size_type size() const { return list_.size(); }
  iterator begin() const { return list_.begin(); }
  iterator end() const { return list_.end(); }

 private:
  friend class detail::queue_core;
  std::vector<std::exception_ptr> list_;
};

using async_handler = std::function<void(exception_list)>;

LUMEN_NAMESPACE_END

namespace std {
template <>
struct is_error_code_enum<sycl::errc> : true_type {};
}  // namespace std
