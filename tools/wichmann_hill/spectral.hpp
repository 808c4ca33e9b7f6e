// SPDX-License-Identifier: Apache-2.0
// The spectral test in two dimensions of a multiplicative generator (Knuth, The Art of Computer
// Programming 2, section 3.3.4).
#pragma once

__extension__ using uint128 = unsigned __int128;

// The square of the least distance between two points (x, multiplier * x mod modulus) of the
// lattice of all overlapping pairs, both below 2^97; at most 2/sqrt(3) times the modulus. In two
// dimensions the lattice and its dual are turned into each other by a right angle, so this is the
// square of the accuracy that Knuth calls nu_2.
uint128 least_distance_squared(uint128 multiplier, uint128 modulus);
