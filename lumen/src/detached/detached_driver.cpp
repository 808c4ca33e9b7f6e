// SPDX-License-Identifier: Apache-2.0
// The backend of virtual devices that behave as a GPU of its own does: commands run behind the
// caller's back, one stream a queue, and buffers have copies. The host's threads do the work.
#include <condition_variable>
#include <deque>
#include <exception>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>

#include "../backend.hpp"
#include "../clock.hpp"
#include "../host/host_devices.hpp"
#include "../host/host_work.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

class detached_mark final : public stream_mark, public std::enable_shared_from_this<detached_mark> {
 public:
  bool reached() noexcept override {
    const std::lock_guard<std::mutex> lock(mutex_);
    return reached_;
  }
  void wait() override {
    std::unique_lock<std::mutex> lock(mutex_);
    told_.wait(lock, [this] { return reached_; });
    if (error_) {
      std::rethrow_exception(error_);
    }
  }
  std::uint64_t time() override {
    const std::lock_guard<std::mutex> lock(mutex_);
    return time_;
  }
  void reach(std::exception_ptr error) {
    const std::lock_guard<std::mutex> lock(mutex_);
    error_ = std::move(error);
    time_ = now_nanoseconds();
    reached_ = true;
    told_.notify_all();
  }

 private:
  std::mutex mutex_;
  std::condition_variable told_;
  bool reached_ = false;
  std::exception_ptr error_;
  std::uint64_t time_ = 0;
};

// A thread that does one command after the other. An error belongs to the next mark.
class detached_stream final : public command_stream {
 public:
  explicit detached_stream(const device_record& device) : device_(device) {}
  ~detached_stream() override {
    if (thread_.joinable()) {
      {
        const std::lock_guard<std::mutex> lock(mutex_);
        over_ = true;
        come_.notify_one();
      }
      thread_.join();
    }
  }

  void launch(const launch_shape& shape, kernel_command& kernel) override {
    put([this, shape, &kernel] { run_kernel(device_, shape, kernel); });
  }
  void copy(void* to, const void* from, std::size_t bytes) override {
    put([to, from, bytes] { copy_bytes(to, from, bytes); });
  }
  void fill(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count) override {
    put([to, pattern, pattern_bytes, count] { fill_pattern(to, pattern, pattern_bytes, count); });
  }
  void prefetch(void*, std::size_t) override {}
  void advise(void*, std::size_t, int) override {}
  void wait_for(stream_mark& mark) override {
    // Whoever has the error of the other stream, it is not this one.
    auto other = static_cast<detached_mark&>(mark).shared_from_this();
    put([other] {
      try {
        other->wait();
      } catch (...) {
      }
    });
  }
  void drain() noexcept override {
    std::unique_lock<std::mutex> lock(mutex_);
    idle_.wait(lock, [this] { return waiting_.empty() && !working_; });
    error_ = nullptr;
  }
  std::shared_ptr<stream_mark> mark() override {
    auto made = std::make_shared<detached_mark>();
    put([this, made] { made->reach(std::exchange(error_, nullptr)); });
    return made;
  }

 private:
  void put(std::function<void()> work) {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!thread_.joinable()) {
      thread_ = std::thread([this] { run(); });
    }
    waiting_.push_back(std::move(work));
    come_.notify_one();
  }
  void run() {
    std::unique_lock<std::mutex> lock(mutex_);
    for (;;) {
      come_.wait(lock, [this] { return !waiting_.empty() || over_; });
      if (waiting_.empty()) {
        return;
      }
      const std::function<void()> work = std::move(waiting_.front());
      waiting_.pop_front();
      working_ = true;
      lock.unlock();
      try {
        work();
      } catch (...) {
        error_ = error_ ? error_ : std::current_exception();
      }
      lock.lock();
      working_ = false;
      idle_.notify_all();
    }
  }

  const device_record& device_;
  std::mutex mutex_;
  std::condition_variable come_;
  std::condition_variable idle_;
  std::deque<std::function<void()>> waiting_;
  std::thread thread_;
  bool working_ = false;
  bool over_ = false;
  std::exception_ptr error_;  // touched by the thread alone while it works
};

class detached_driver final : public host_memory_driver {
 public:
  std::vector<std::unique_ptr<device_record>> enumerate() override { return detached_devices(); }
  std::unique_ptr<command_stream> make_stream(const memory_place& place, bool) override {
    return std::make_unique<detached_stream>(place.device);
  }
};

}  // namespace

std::unique_ptr<backend_driver> make_detached_driver() {
  return std::make_unique<detached_driver>();
}

}  // namespace detail
LUMEN_NAMESPACE_END
