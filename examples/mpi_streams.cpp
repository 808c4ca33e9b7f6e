// SPDX-License-Identifier: Apache-2.0
// Independent random numbers for the ranks of an MPI program, in three ways: blocks of one sequence
// (skip_ahead), one sequence dealt out like cards (leapfrog), and a generator of its own for each
// rank (a family). Rank 0 gathers what all have drawn and holds it against the serial program.
//
// Build: mpicxx -std=c++17 mpi_streams.cpp $(pkg-config --cflags --libs tarn_rng) -o mpi_streams
// Run: mpirun -n 3 ./mpi_streams
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <mpi.h>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace {

namespace rng = kestrel::tarn::rng;

constexpr int share = 100000;  // numbers of each rank
constexpr std::uint32_t seed = 2026;

using words = std::vector<std::uint32_t>;

// The engine's next `count` words.
template <class Engine>
words draw(Engine& engine, int count) {
  words values(static_cast<std::size_t>(count));
  rng::generate(rng::bits<>{}, engine, count, values.data()).wait_and_throw();
  return values;
}

// Rank 0 receives the words of all ranks, one rank behind the other; the others nothing.
words gather(const words& mine, int rank, int ranks) {
  words all(rank == 0 ? mine.size() * static_cast<std::size_t>(ranks) : 0);
  MPI_Gather(mine.data(), share, MPI_UINT32_T, all.data(), share, MPI_UINT32_T, 0, MPI_COMM_WORLD);
  return all;
}

// Prints and returns whether rank 0 found its words as they should be.
bool told(const char* way, bool equal) {
  std::printf("%s: %s\n", way, equal ? "equal to the serial program" : "DIFFERENT");
  return equal;
}

// Rank r starts r * share words further on.
bool blocks(const sycl::queue& queue, int rank, int ranks) {
  rng::philox4x32x10 engine(queue, seed);
  rng::skip_ahead(engine, static_cast<std::uint64_t>(rank) * share);
  const words all = gather(draw(engine, share), rank, ranks);
  if (rank != 0) {
    return true;
  }
  rng::philox4x32x10 serial(queue, seed);
  return told("blocks of philox4x32x10", all == draw(serial, ranks * share));
}

// Rank r receives the words r, r + ranks, r + 2 ranks, ...
bool cards(const sycl::queue& queue, int rank, int ranks) {
  rng::mcg31m1 engine(queue, seed);
  rng::leapfrog(engine, static_cast<std::uint64_t>(rank), static_cast<std::uint64_t>(ranks));
  const words all = gather(draw(engine, share), rank, ranks);
  if (rank != 0) {
    return true;
  }
  rng::mcg31m1 serial(queue, seed);
  const words dealt = draw(serial, ranks * share);
  words in_order(dealt.size());
  for (std::size_t i = 0; i < dealt.size(); ++i) {
    const auto owner = i % static_cast<std::size_t>(ranks);
    in_order[i] = all[owner * share + i / static_cast<std::size_t>(ranks)];
  }
  return told("mcg31m1 dealt out", in_order == dealt);
}

// Rank r has member r of the family. There is no common sequence; any rank can make any member.
bool family(const sycl::queue& queue, int rank, int ranks) {
  rng::mt2203 engine(queue, seed, static_cast<std::uint32_t>(rank));
  const words all = gather(draw(engine, share), rank, ranks);
  words serial;
  for (int r = 0; rank == 0 && r < ranks; ++r) {
    rng::mt2203 member(queue, seed, static_cast<std::uint32_t>(r));
    const words its = draw(member, share);
    serial.insert(serial.end(), its.begin(), its.end());
  }
  return rank != 0 || told("members of mt2203", all == serial);
}

}  // namespace

int main(int argc, char** argv) {
  MPI_Init(&argc, &argv);
  int rank = 0, ranks = 0;
  MPI_Comm_rank(MPI_COMM_WORLD, &rank);
  MPI_Comm_size(MPI_COMM_WORLD, &ranks);
  bool right = true;
  try {
    const sycl::queue queue{sycl::cpu_selector_v};
    if (rank == 0) {
      std::printf("%d ranks\n", ranks);
    }
    right = blocks(queue, rank, ranks) && right;
    right = cards(queue, rank, ranks) && right;
    right = family(queue, rank, ranks) && right;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "mpi_streams, rank %d: %s\n", rank, error.what());
    MPI_Abort(MPI_COMM_WORLD, EXIT_FAILURE);  // the others wait in MPI_Gather
  }
  MPI_Finalize();
  return right ? EXIT_SUCCESS : EXIT_FAILURE;
}
