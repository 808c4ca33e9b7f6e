// SPDX-License-Identifier: Apache-2.0
// Error codes and the exception.
#include "sycl/detail/exception.hpp"

#include "context_state.hpp"
#include "sycl/detail/buffer_core.hpp"

LUMEN_NAMESPACE_BEGIN

namespace {
class category final : public std::error_category {
 public:
  const char* name() const noexcept override { return "sycl"; }
  std::string message(int code) const override {
    switch (static_cast<errc>(code)) {
      case errc::success:
        return "success";
      case errc::runtime:
        return "runtime error";
      case errc::kernel:
        return "kernel error";
      case errc::accessor:
        return "accessor error";
      case errc::nd_range:
        return "nd_range error";
      case errc::event:
        return "event error";
      case errc::kernel_argument:
        return "kernel argument error";
      case errc::build:
        return "build error";
      case errc::invalid:
        return "invalid argument or state";
      case errc::memory_allocation:
        return "memory allocation failed";
      case errc::platform:
        return "platform error";
      case errc::profiling:
        return "profiling error";
      case errc::feature_not_supported:
        return "feature not supported";
      case errc::kernel_not_supported:
        return "kernel not supported";
      case errc::backend_mismatch:
        return "backend mismatch";
    }
    return "unknown error";
  }
};

std::shared_ptr<const std::string> shared_text(const std::string& text) {
  return std::make_shared<const std::string>(text);
}
}  // namespace

const std::error_category& sycl_category() noexcept {
  static const category only;
  return only;
}

std::error_code make_error_code(errc code) noexcept {
  return {static_cast<int>(code), sycl_category()};
}

exception::exception(std::error_code code, const std::string& what_arg)
    : code_(code), text_(shared_text(what_arg)) {}
exception::exception(std::error_code code, const char* what_arg)
    : exception(code, std::string(what_arg)) {}
exception::exception(std::error_code code) : exception(code, code.message()) {}
exception::exception(int value, const std::error_category& owner, const std::string& what_arg)
    : exception(std::error_code(value, owner), what_arg) {}
exception::exception(int value, const std::error_category& owner, const char* what_arg)
    : exception(std::error_code(value, owner), what_arg) {}
exception::exception(int value, const std::error_category& owner)
    : exception(std::error_code(value, owner)) {}
exception::exception(const context& ctx, std::error_code code, const std::string& what_arg)
    : code_(code), text_(shared_text(what_arg)), context_(detail::context_state::shared(ctx)) {}
exception::exception(const context& ctx, std::error_code code, const char* what_arg)
    : exception(ctx, code, std::string(what_arg)) {}
exception::exception(const context& ctx, std::error_code code)
    : exception(ctx, code, code.message()) {}
exception::exception(const context& ctx, int value, const std::error_category& owner,
                     const std::string& what_arg)
    : exception(ctx, std::error_code(value, owner), what_arg) {}
exception::exception(const context& ctx, int value, const std::error_category& owner,
                     const char* what_arg)
    : exception(ctx, std::error_code(value, owner), what_arg) {}
exception::exception(const context& ctx, int value, const std::error_category& owner)
    : exception(ctx, std::error_code(value, owner)) {}
exception::exception(const exception& other) noexcept = default;
exception& exception::operator=(const exception& other) noexcept = default;
exception::~exception() = default;

const char* exception::what() const noexcept {
  return text_->c_str();
}
bool exception::has_context() const noexcept {
  return context_ != nullptr;
}
context exception::get_context() const {
  if (!context_) {
    detail::throw_invalid("the exception has no context");
  }
  return detail::context_state::make(context_);
}

namespace detail {
void throw_invalid(const char* text) {
  throw exception(make_error_code(errc::invalid), text);
}
}  // namespace detail

LUMEN_NAMESPACE_END
