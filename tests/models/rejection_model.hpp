// SPDX-License-Identifier: Apache-2.0
// A serial model of a whole call of a rejecting distribution, as loops: a constant, one uniform for
// each result, or passes of candidates whose survivors are kept in order. It shares no code with
// the library. A model of a distribution has
//   source, value            types of a uniform and of a candidate
//   whole                    four uniforms make two candidates, which cannot be drawn alone
//   road()                   which of the three it is
//   constant()               the constant
//   each(u)                  a result of one uniform
//   candidate(u0, u1)        or, where whole, candidates(four); rejected ones are -1
//   post(candidate)          what is stored of an accepted one
// Uniforms are those of [0, 1).
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string_view>
#include <type_traits>
#include <vector>

#include <sycl/sycl.hpp>

namespace tarn_test {

enum class model_road { constant, each, rejection };

/// How often each step of a method ran.
struct step_counts {
  std::map<std::string_view, std::int64_t> of;

  void operator()(const char* step) { ++of[step]; }
  bool accept(const char* step) {
    ++of[step];
    return true;
  }
  bool reject(const char* step) {
    ++of[step];
    return false;
  }
  bool decide(bool accepted, const char* if_accepted, const char* if_rejected) {
    ++of[accepted ? if_accepted : if_rejected];
    return accepted;
  }
};

/// A logarithm that is finite at 0: about that of the least subnormal number.
template <typename R>
R finite_log(R x) {
  constexpr R at_zero =
      std::is_same_v<R, float> ? R(-103.278931) : static_cast<R>(-744.44007192138122);
  return x == 0 ? at_zero : sycl::log(x);
}

template <typename T>
struct model_call {
  std::vector<T> values;
  std::int64_t consumed = 0;  // uniforms
};

/// Calls below 10000 results have a capacity of their own.
inline std::int64_t model_capacity(std::int64_t n, std::int64_t group_size) {
  return n < 10000 ? 16384 : group_size * group_size;
}

template <typename Model>
std::vector<typename Model::value> model_candidates(Model& model,
                                                    const std::vector<typename Model::source>& u) {
  std::vector<typename Model::value> candidates;
  if constexpr (Model::whole) {
    for (std::size_t i = 0; i < u.size(); i += 4) {
      const auto two = model.candidates(&u[i]);
      candidates.insert(candidates.end(), two.begin(), two.end());
    }
  } else {
    for (std::size_t i = 0; i < u.size(); i += 2) {
      candidates.push_back(model.candidate(u[i], u[i + 1]));
    }
  }
  return candidates;
}

/// `n` results by passes; `take(count)` gives the next uniforms.
template <typename Model, typename Take>
model_call<typename Model::value> model_passes(Model& model, std::int64_t n,
                                               std::int64_t group_size, const Take& take) {
  const std::int64_t capacity = model_capacity(n, group_size);
  model_call<typename Model::value> call;
  while (static_cast<std::int64_t>(call.values.size()) < n) {
    std::int64_t count = std::min(capacity, n - static_cast<std::int64_t>(call.values.size()));
    if (Model::whole) {
      count -= count % 2;
    }
    // The last result where candidates come in twos: the first of two that is accepted.
    const bool tail = count == 0;
    const std::int64_t drawn = tail ? 4 : 2 * count;
    call.consumed += drawn;
    for (const auto candidate : model_candidates(model, take(drawn))) {
      if (candidate >= 0) {
        call.values.push_back(model.post(candidate));
        if (tail) {
          break;
        }
      }
    }
  }
  return call;
}

/// `n` results of a call on a device whose largest work-group is `group_size`.
template <typename Model, typename Take>
model_call<typename Model::value> model_results(Model& model, std::int64_t n,
                                                std::int64_t group_size, const Take& take) {
  if (model.road() == model_road::rejection) {
    return model_passes(model, n, group_size, take);
  }
  model_call<typename Model::value> call;
  if (model.road() == model_road::constant) {
    call.values.assign(static_cast<std::size_t>(n), model.constant());
    return call;
  }
  call.consumed = n;
  for (const auto u : take(n)) {
    call.values.push_back(model.each(u));
  }
  return call;
}

}  // namespace tarn_test
