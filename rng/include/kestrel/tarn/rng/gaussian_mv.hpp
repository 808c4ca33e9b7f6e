// SPDX-License-Identifier: Apache-2.0
// The multivariate normal distribution: parameters only. Drawing is in generate.hpp.
#pragma once

#include <cstdint>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>

namespace kestrel::tarn::rng {

/// How the lower-triangular Cholesky factor T of the covariance is stored.
enum class TARN_EXPORT matrix_layout : std::uint8_t {
  full = 0,      ///< dimension x dimension, row after row; entries above the diagonal are ignored
  packed = 1,    ///< dimension * (dimension + 1) / 2, column after column from the diagonal down
  diagonal = 2,  ///< dimension entries: only the diagonal
};

/// How gaussian_mv draws its normals: as the methods of gaussian.
namespace gaussian_mv_method {
/// Two words for one coordinate.
struct TARN_EXPORT box_muller {};
/// Two words for two coordinates.
struct TARN_EXPORT box_muller2 {};
/// One word for one coordinate.
struct TARN_EXPORT icdf {};
}  // namespace gaussian_mv_method

/// mean + T z with z a vector of `dimension` independent standard normals: one result is a vector
/// of `dimension` values.
template <typename RealType = float, matrix_layout Layout = matrix_layout::full,
          typename Method = gaussian_mv_method::box_muller2>
class TARN_EXPORT gaussian_mv {
  static_assert(detail::is_real_result<RealType>,
                "gaussian_mv: the result type is float or double");
  static_assert(detail::is_one_of<Method, gaussian_mv_method::box_muller,
                                  gaussian_mv_method::box_muller2, gaussian_mv_method::icdf>,
                "gaussian_mv: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param dimension  coordinates of a vector, 1 or more
  /// \param mean       as many means
  /// \param matrix     T in the layout, of the length told there
  ///
  /// Raises invalid_argument for a list of another length.
  explicit gaussian_mv(std::uint32_t dimension, const std::vector<RealType>& mean,
                       const std::vector<RealType>& matrix);

  ///@{
  /// As given to the constructor.
  std::uint32_t dimension() const { return dimension_; }
  const std::vector<RealType>& mean() const { return mean_; }
  const std::vector<RealType>& matrix() const { return matrix_; }
  ///@}

 private:
  std::uint32_t dimension_;
  std::vector<RealType> mean_;
  std::vector<RealType> matrix_;
};

}  // namespace kestrel::tarn::rng
