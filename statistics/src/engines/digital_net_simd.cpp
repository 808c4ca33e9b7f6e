// SPDX-License-Identifier: Apache-2.0
// Runs of tiles with SIMD. A tile need not be a multiple of a vector: its last vector ends with it
// and overlaps the one before, which writes the same words twice and nothing else.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/digital_net_simd.cpp"
#include <algorithm>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/digital_net_record.hpp"
#include "engines/digital_net_tiles.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::net::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using words = hn::ScalableTag<std::uint32_t>;
static_assert(HWY_MAX_BYTES / 4 <= min_tile_words, "a tile has one vector at least");

// Vectors of a tile that stay in registers while it steps, a panel. Reading the tile before from
// the results instead takes more than twice the time: a load has to wait for a store that may be
// split between two lines.
constexpr std::size_t panel = 8;
// Steps that a panel makes before the next one's turn. All that a tile's panels write in a turn
// stays in the nearest cache.
constexpr std::size_t turn = 32;

// Steps of one panel: `Vectors` vectors of each tile from word `first` on, the last one ending with
// the tile. The first tile is at `from`, the next ones in `out`.
template <std::size_t Vectors>
HWY_NOINLINE void step_panel(const tile_run& run, std::size_t first, const std::uint32_t* from,
                             std::uint64_t number, std::size_t steps, std::uint32_t* out) {
  const words d;
  const std::size_t last = std::min(first + (Vectors - 1) * hn::Lanes(d), run.width - hn::Lanes(d));
  const auto place = [&](std::size_t v) {
    return v + 1 == Vectors ? last : first + v * hn::Lanes(d);
  };
  hn::Vec<words> x[Vectors];
  for (std::size_t v = 0; v < Vectors; ++v)
    x[v] = hn::LoadU(d, from + place(v));
  for (std::size_t i = 0; i < steps; ++i) {
    const tile_row& row = run.rows[step_of(number + i)];
    std::uint32_t* to = out + i * run.stride;
    for (std::size_t v = 0; v < Vectors; ++v) {
      x[v] = hn::Xor(x[v], hn::LoadU(d, row + place(v)));
      hn::StoreU(x[v], d, to + place(v));
    }
  }
}

using panel_function = void (*)(const tile_run&, std::size_t, const std::uint32_t*, std::uint64_t,
                                std::size_t, std::uint32_t*);
constexpr panel_function panel_functions[panel] = {
    step_panel<1>, step_panel<2>, step_panel<3>, step_panel<4>,
    step_panel<5>, step_panel<6>, step_panel<7>, step_panel<8>,
};

// Steps of whole tiles, panel by panel.
void step_turn(const tile_run& run, const std::uint32_t* from, std::uint64_t number,
               std::size_t steps, std::uint32_t* out) {
  const std::size_t lanes = hn::Lanes(words());
  for (std::size_t first = 0; first < run.width; first += panel * lanes) {
    const std::size_t vectors = std::min(panel, (run.width - first + lanes - 1) / lanes);
    panel_functions[vectors - 1](run, first, from, number, steps, out);
  }
}

void step_tiles(const tile_run& run, const tile_row& first, tile_row& last) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const std::uint32_t* from = first;
  std::size_t done = 0;
  while (done + 1 < run.steps) {
    const std::size_t steps = std::min(turn, run.steps - 1 - done);
    std::uint32_t* to = run.out + done * run.stride;
    step_turn(run, from, run.number + done, steps, to);
    done += steps;
    from = to + (steps - 1) * run.stride;
  }
  step_turn(run, from, run.number + done, 1, last);
}

}  // namespace tarn::statistics::net::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::net {

HWY_EXPORT(step_tiles);

void step_tiles(const tile_run& run, const tile_row& first, tile_row& last) {
  TARN_SIMD_CALL(step_tiles)(run, first, last);
}

}  // namespace tarn::statistics::net
#endif
