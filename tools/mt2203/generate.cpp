// SPDX-License-Identifier: Apache-2.0
// See generate.hpp.
#include "generate.hpp"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <future>
#include <map>
#include <mutex>
#include <stdexcept>
#include <vector>

#include "member.hpp"
#include "table_file.hpp"

namespace tarn::mt2203 {

namespace {

using clock = std::chrono::steady_clock;

// By id, in rising order.
using rows_by_id = std::map<std::uint32_t, parameters>;

// Those rows of the part file that belong to the table.
rows_by_id finished_rows(const std::string& part) {
  rows_by_id rows;
  for (const parameters& row : read_unfinished_table(part))
    if (const std::uint32_t id = row.a & 0xFFFF; id < members)
      rows[id] = row;
  return rows;
}

void write_rows(const std::string& path, const rows_by_id& rows) {
  std::vector<parameters> in_order;
  for (const auto& [id, row] : rows)
    in_order.push_back(row);
  write_table(path, in_order);
}

// Hands out the ids that are missing and takes the rows in.
class workshop {
 public:
  explicit workshop(const std::string& part) : part_(part) {
    const rows_by_id finished = finished_rows(part);
    write_rows(part, finished);  // without a line that was cut off
    for (std::uint32_t id = 0; id < members; ++id)
      if (finished.count(id) == 0)
        missing_.push_back(id);
    file_.open(part, std::ios::app);
  }

  void work() {
    std::uint32_t id = 0;
    while (take(id))
      deliver(finder_.find(id));
  }

 private:
  bool take(std::uint32_t& id) {
    const std::lock_guard<std::mutex> hold(lock_);
    if (taken_ == missing_.size())
      return false;
    id = missing_[taken_++];
    return true;
  }

  void deliver(const parameters& row) {
    const std::lock_guard<std::mutex> hold(lock_);
    if (!(file_ << row_text(row) << std::flush))
      throw std::runtime_error("cannot write " + part_);
    ++made_;
    if (const auto now = clock::now(); now >= next_report_ || made_ == missing_.size()) {
      report(std::chrono::duration<double>(now - begin_).count());
      next_report_ = now + std::chrono::seconds(5);
    }
  }

  void report(double seconds) const {
    const std::size_t left = missing_.size() - made_;
    std::fprintf(stderr, "%zu of %u members, %.0f s, about %.0f s left\n", members - left, members,
                 seconds, seconds * static_cast<double>(left) / static_cast<double>(made_));
  }

  const std::string part_;
  const member_finder finder_;
  std::vector<std::uint32_t> missing_;

  std::mutex lock_;  // of what follows
  std::ofstream file_;
  std::size_t taken_ = 0, made_ = 0;
  const clock::time_point begin_ = clock::now();
  clock::time_point next_report_ = begin_;
};

}  // namespace

void generate_table(const std::string& path, unsigned threads) {
  const std::string part = path + ".part";
  {
    workshop shop(part);
    std::vector<std::future<void>> workers;
    for (unsigned i = 0; i < std::max(threads, 1u); ++i)
      workers.push_back(std::async(std::launch::async, [&shop] { shop.work(); }));
    for (std::future<void>& worker : workers)
      worker.get();
  }
  const rows_by_id rows = finished_rows(part);
  if (rows.size() != members)
    throw std::runtime_error(part + " lacks rows: is another run writing it?");
  write_rows(path, rows);
  std::filesystem::remove(part);
}

}  // namespace tarn::mt2203
