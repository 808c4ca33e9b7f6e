// SPDX-License-Identifier: Apache-2.0
// Composition of exception messages; the destructors stand here so that each class has one home
// for its type information.
#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn {
namespace {

std::string compose(const std::string& library, const std::string& function,
                    const std::string& text) {
  std::string message = "kestrel::tarn";
  if (!library.empty()) {
    message += "::" + library;
  }
  if (!function.empty()) {
    message += "::" + function;
  }
  if (!text.empty()) {
    message += ": " + text;
  }
  return message;
}

std::string with_detail(std::string kind, const std::string& detail) {
  return detail.empty() ? kind : kind + ": " + detail;
}

std::string name_of(const sycl::device& device) {
  return device.get_info<sycl::info::device::name>();
}

}  // namespace

exception::exception(const std::string& library, const std::string& function,
                     const std::string& text)
    : message_(compose(library, function, text)) {}

const char* exception::what() const noexcept {
  return message_.what();
}

invalid_argument::invalid_argument(const std::string& library, const std::string& function,
                                   const std::string& text)
    : exception(library, function, with_detail("invalid argument", text)) {}

computation_error::computation_error(const std::string& library, const std::string& function,
                                     const std::string& text)
    : exception(library, function, with_detail("computation error", text)) {}

unimplemented::unimplemented(const std::string& library, const std::string& function,
                             const std::string& text)
    : exception(library, function, with_detail("unimplemented functionality", text)) {}

unsupported_device::unsupported_device(const std::string& library, const std::string& function,
                                       const sycl::device& device)
    : exception(library, function, "unsupported device: " + name_of(device)) {}

device_bad_alloc::device_bad_alloc(const std::string& library, const std::string& function,
                                   const sycl::device& device)
    : exception(library, function, "cannot allocate memory on " + name_of(device)) {}

batch_error::batch_error(const std::string& library, const std::string& function)
    : exception(library, function, "batch error") {}

exception::~exception() = default;
invalid_argument::~invalid_argument() = default;
computation_error::~computation_error() = default;
unimplemented::~unimplemented() = default;
unsupported_device::~unsupported_device() = default;
device_bad_alloc::~device_bad_alloc() = default;
batch_error::~batch_error() = default;

}  // namespace kestrel::tarn
