// SPDX-License-Identifier: Apache-2.0
// The kernels of Mersenne twisters. The recurrence has no cheap jump, so teams of work-items walk
// it: a work-group copies the image of a state into local memory, makes words there in rounds of
// one word for each work-item, with a barrier between rounds, and stores the image that the next
// call begins with. How the groups share a call and the states is the engine's affair:
// engine_traits has
//   shape    the twister_shape
//   groups   a plain record that travels to the kernel, with
//     source(group)                the image that the group starts from
//     target(group, count)         where it stores the image it ends with; null where it is dropped
//     constants(group)
//     share(group, count, plan)    its part of the call
//     moves(group, count, plan)    whether the stored image stands behind the words it has made
// The image is copied by the work-items themselves: asynchronous copies are not there, or not
// right, in every implementation of SYCL.
#pragma once

#include <cstdint>
#include <type_traits>

#include <sycl/sycl.hpp>

#include "engines/twister.hpp"
#include "frame/engine_func.hpp"

namespace kestrel::tarn::rng::detail {

/// A group's part of a call.
struct twister_share {
  std::uint64_t replayed;  // rounds of its state that it passes over
  std::uint64_t first;     // rounds of the call before its own
  std::uint64_t rounds;    // its own
};

/// One work-item of a team on the ring in local memory.
template <typename Shape>
class twister_walker {
 public:
  SYCL_EXTERNAL twister_walker(const sycl::nd_item<1>& item, std::uint32_t* image,
                               std::uint32_t matrix)
      : item_(item),
        image_(image),
        matrix_(matrix),
        l_(static_cast<std::uint32_t>(item.get_local_id(0))) {}

  /// The number of the work-item in its team.
  SYCL_EXTERNAL std::uint32_t number() const { return l_; }

  SYCL_EXTERNAL void meet() const { sycl::group_barrier(item_.get_group()); }

  SYCL_EXTERNAL void load(const std::uint32_t* source) {
    copy(source, image_);
    meet();
    j_ = Shape::wrap(image_[Shape::ring] + l_);
  }
  SYCL_EXTERNAL void store(std::uint32_t* target) const {
    meet();
    copy(image_, target);
  }

  /// Makes a word and returns the one that leaves the state for it, not tempered.
  SYCL_EXTERNAL std::uint32_t retire() const {
    const std::uint32_t oldest = image_[j_];
    image_[Shape::wrap(j_ + Shape::order)] = twisted<Shape>(
        oldest, image_[Shape::wrap(j_ + 1)], image_[Shape::wrap(j_ + Shape::middle)], matrix_);
    return oldest;
  }
  /// That word again, which no other work-item writes before the team is two rounds on.
  SYCL_EXTERNAL std::uint32_t retired() const { return image_[j_]; }

  /// To the work-item's place in the next round.
  SYCL_EXTERNAL void advance() { j_ = Shape::wrap(j_ + Shape::team); }

  /// Passes over rounds.
  SYCL_EXTERNAL void replay(std::uint64_t rounds) {
    for (; rounds != 0; --rounds) {
      retire();
      meet();
      advance();
    }
  }

  /// After the rounds, and a tail of `tail` words: the position of the next word to be delivered,
  /// stored by the work-item that made the last one. It is 1 to Shape::ring: a position at the
  /// ring's end means the same as one at its start.
  SYCL_EXTERNAL void move_position(std::uint32_t tail) const {
    // Without a tail the last work-item stands one round behind its last word.
    const std::uint32_t last = tail == 0 ? Shape::team : tail;
    if (l_ + 1 == last) {
      const std::uint32_t made = tail == 0 ? j_ + Shape::order : j_;
      image_[Shape::ring] = Shape::wrap(made) + 1;
    }
  }

 private:
  SYCL_EXTERNAL void copy(const std::uint32_t* from, std::uint32_t* to) const {
    for (std::uint32_t i = l_; i < Shape::image; i += Shape::team) {
      to[i] = from[i];
    }
  }

  sycl::nd_item<1> item_;
  std::uint32_t* image_;
  std::uint32_t matrix_;
  std::uint32_t l_;
  std::uint32_t j_ = 0;  // place of the oldest word that is this work-item's
};

/// In pair mode the values of a round, one a work-item, until some of the team take two or four of
/// them each.
template <typename R, bool pairs>
struct twister_slots {};
template <typename R>
struct twister_slots<R, true> {
  sycl::local_accessor<R, 1> values;
};

template <typename Engine, typename T, typename R, typename Functor, typename Out, bool pairs,
          bool mid_block>
struct engine_func_mt {
  using shape = typename engine_traits<Engine>::shape;
  using walker_type = twister_walker<shape>;

  Out r;
  sycl::local_accessor<std::uint32_t, 1> image;
  twister_slots<R, pairs> slots;
  Functor functor;
  typename engine_traits<Engine>::groups groups;
  twister_plan plan;
  word_rule<R> rule;
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const auto group = static_cast<std::uint32_t>(item.get_group(0));
    const auto count = static_cast<std::uint32_t>(item.get_group_range(0));
    const twister_constants constants = groups.constants(group);
    const twister_share share = groups.share(group, count, plan);
    const std::uint32_t tail = group + 1 == count ? plan.tail : 0;
    std::uint32_t* const target = groups.target(group, count);
    if (share.rounds == 0 && target == nullptr) {
      return;  // the whole group
    }

    walker_type walker(item, &image[0], constants.matrix);
    walker.load(groups.source(group));
    walker.replay(share.replayed);
    if constexpr (pairs) {
      write_pairs(walker, constants, share, tail);
    } else {
      write(walker, constants, share, tail);
    }
    if (groups.moves(group, count, plan)) {
      walker.move_position(tail);
    }
    if (target != nullptr) {
      walker.store(target);
    }
  }

 private:
  SYCL_EXTERNAL R value_of(std::uint32_t word, const twister_constants& constants) const {
    return unsigned_word(temper<shape>(word, constants), rule);
  }

  /// The work-item's value of a round. Both forms give the same word.
  SYCL_EXTERNAL R next_value(const walker_type& walker, const twister_constants& constants) const {
    const std::uint32_t word = walker.retire();
    walker.meet();
    return value_of(mid_block ? walker.retired() : word, constants);
  }

  SYCL_EXTERNAL void write(walker_type& walker, const twister_constants& constants,
                           const twister_share& share, std::uint32_t tail) const {
    std::uint64_t index = share.first * shape::team + walker.number();
    for (std::uint64_t round = 0; round < share.rounds; ++round) {
      store_one(index, next_value(walker, constants));
      walker.advance();
      index += shape::team;
    }
    if (walker.number() < tail) {
      store_one(index, value_of(walker.retire(), constants));
    }
  }

  SYCL_EXTERNAL void write_pairs(walker_type& walker, const twister_constants& constants,
                                 const twister_share& share, std::uint32_t tail) const {
    const std::uint32_t number = walker.number();
    std::uint64_t pair = share.first * takers + number;
    for (std::uint64_t round = 0; round < share.rounds; ++round) {
      slots.values[number] = next_value(walker, constants);
      walker.meet();
      if (number < takers) {
        store_pair(pair, number);
      }
      pair += takers;
      walker.advance();
    }
    if (tail == 0) {
      return;
    }
    // The slots of the last round have to be read before they are written again. Of an odd tail the
    // last pair takes a word that the position does not move past: the next call makes it again.
    const std::uint32_t taking = (tail + together - 1) / together;
    walker.meet();
    if (number < taking * together) {
      slots.values[number] = value_of(walker.retire(), constants);
    }
    walker.meet();
    if (number < taking) {
      store_pair(pair, number);
    }
  }

  SYCL_EXTERNAL void store_one(std::uint64_t index, R value) const {
    r[index] = results_of_some<T>(functor, &value, index)[0];
  }

  /// The results of pair (or four) number `pair` of the call, which stands in the slots from
  /// together * number on; those past the end are dropped.
  SYCL_EXTERNAL void store_pair(std::uint64_t pair, std::uint32_t number) const {
    constexpr std::uint64_t results = gpu::results_together<Functor>;
    R values[together];
    for (std::uint32_t i = 0; i < together; ++i) {
      values[i] = slots.values[together * number + i];
    }
    const std::uint64_t first = pair * results;
    store_values(r, first, n, results_of_some<T>(functor, values, first));
  }

  static constexpr std::uint32_t together = gpu::values_together<Functor>;
  static constexpr std::uint32_t takers = shape::team / together;
  static_assert(shape::team % together == 0);
};

}  // namespace kestrel::tarn::rng::detail
