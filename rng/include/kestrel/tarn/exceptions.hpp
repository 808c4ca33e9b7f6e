// SPDX-License-Identifier: Apache-2.0
// What the library throws. A message is composed once, when the exception is made:
//   "kestrel::tarn" ["::" library] ["::" function] [": " text]
// so that a negative count reads "kestrel::tarn::rng::generate: invalid argument: n".
#pragma once

#include <exception>
#include <stdexcept>
#include <string>

#include <kestrel/tarn/export.hpp>
#include <sycl/sycl.hpp>

/// The libraries of the house.
namespace kestrel::tarn {

/// Base of all exceptions of the library. Copies share the message and do not throw.
class TARN_EXPORT exception : public std::exception {
 public:
  /// Each of the three strings may be empty; an empty one leaves out its separator.
  exception(const std::string& library, const std::string& function, const std::string& text);
  ~exception() override;
  ///@{
  /// Shares the message.
  exception(const exception&) noexcept = default;
  exception& operator=(const exception&) noexcept = default;
  ///@}

  /// The message.
  const char* what() const noexcept override;

 private:
  std::runtime_error message_;  // its text is reference counted, as copies must not throw
};

/// An argument outside its range; the text names it.
class TARN_EXPORT invalid_argument : public exception {
 public:
  /// Composed as the base tells, with the kind before `text`.
  invalid_argument(const std::string& library, const std::string& function,
                   const std::string& text);
  ~invalid_argument() override;
};

/// A computation could not be started or finished.
class TARN_EXPORT computation_error : public exception {
 public:
  /// Composed as the base tells, with the kind before `text`.
  computation_error(const std::string& library, const std::string& function,
                    const std::string& text);
  ~computation_error() override;
};

/// A combination that is not offered.
class TARN_EXPORT unimplemented : public exception {
 public:
  /// Composed as the base tells, with the kind before `text`.
  unimplemented(const std::string& library, const std::string& function, const std::string& text);
  ~unimplemented() override;
};

/// The device cannot run this; the message ends with the device's name.
class TARN_EXPORT unsupported_device : public exception {
 public:
  /// Composed as the base tells; the text is the kind and the name of `device`.
  unsupported_device(const std::string& library, const std::string& function,
                     const sycl::device& device);
  ~unsupported_device() override;
};

/// Memory of a device is exhausted; the message ends with the device's name.
class TARN_EXPORT device_bad_alloc : public exception {
 public:
  /// Composed as the base tells; the text is the kind and the name of `device`.
  device_bad_alloc(const std::string& library, const std::string& function,
                   const sycl::device& device);
  ~device_bad_alloc() override;
};

/// A failed batch of the device service layer; random-number functions never raise it.
class TARN_EXPORT batch_error : public exception {
 public:
  /// Composed as the base tells; the text is the kind.
  batch_error(const std::string& library, const std::string& function);
  ~batch_error() override;
};

}  // namespace kestrel::tarn
