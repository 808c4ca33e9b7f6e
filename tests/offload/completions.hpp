// SPDX-License-Identifier: Apache-2.0
// Who is told of the end of a call that was not waited for: the completion function of the interop
// objects of tests notes what it is called with, and from which thread.
#pragma once

#include <algorithm>
#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

namespace tarn_test {

class completions {
 public:
  struct told {
    void* interop;
    std::thread::id thread;
  };

  static completions& all() {
    static auto* const only = new completions;
    return *only;
  }

  /// The completion function.
  static void note(void* interop) {
    completions& list = all();
    const std::lock_guard<std::mutex> lock(list.mutex_);
    list.told_.push_back({interop, std::this_thread::get_id()});
    list.more_.notify_all();
  }

  /// What has been told since the last call, once there are `count` of them. A test that waits in
  /// vain runs into its time limit.
  std::vector<told> take(std::size_t count) {
    std::unique_lock<std::mutex> lock(mutex_);
    more_.wait(lock, [&] { return told_.size() >= count; });
    return std::exchange(told_, {});
  }
  /// Returns once there are `count` of one object.
  void wait_for(void* interop, std::ptrdiff_t count) {
    std::unique_lock<std::mutex> lock(mutex_);
    more_.wait(lock, [&] {
      return std::count_if(told_.begin(), told_.end(),
                           [interop](const told& one) { return one.interop == interop; }) >= count;
    });
  }
  std::size_t count() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return told_.size();
  }

 private:
  std::mutex mutex_;
  std::condition_variable more_;
  std::vector<told> told_;
};

}  // namespace tarn_test
