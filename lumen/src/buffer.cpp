// SPDX-License-Identifier: Apache-2.0
// Buffer memory and the order of its users.
#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "access_record.hpp"
#include "buffer_copies.hpp"
#include "handler_access.hpp"
#include "queue_core.hpp"
#include "sycl/detail/buffer_core.hpp"
#include "sycl/detail/exception.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

std::mutex& access_record::order_mutex() {
  static std::mutex& only = *new std::mutex;
  return only;
}

void access_record::add(task& user, bool writes) {
  if (last_writer_) {
    user.depend_on(*last_writer_.get());
  }
  for (const holder& h : holders_) {
    if (writes || h.writes) {
      user.depend_on(*h.task.get());
    }
  }
  if (!writes) {
    readers_.erase(std::remove_if(readers_.begin(), readers_.end(),
                                  [](const task_ref& reader) { return reader->done(); }),
                   readers_.end());
    readers_.push_back(share(user));
    return;
  }
  for (const task_ref& reader : readers_) {
    user.depend_on(*reader.get());
  }
  readers_.clear();
  last_writer_ = share(user);
}

void access_record::add_holder(task& user, bool writes) {
  holders_.push_back({share(user), writes});
}

void access_record::remove_holder(const task& user) {
  holders_.erase(std::remove_if(holders_.begin(), holders_.end(),
                                [&user](const holder& h) { return h.task.get() == &user; }),
                 holders_.end());
}

std::vector<task_ref> access_record::conflicts(bool writes) const {
  std::vector<task_ref> result;
  if (last_writer_) {
    result.push_back(last_writer_);
  }
  if (writes) {
    result.insert(result.end(), readers_.begin(), readers_.end());
  }
  return result;
}

task_ref access_record::unfinished() const {
  const auto runs_elsewhere = [](const task_ref& user) {
    return !user->done() && !user->runs_on_this_thread();
  };
  if (last_writer_ && runs_elsewhere(last_writer_)) {
    return last_writer_;
  }
  const auto reader = std::find_if(readers_.begin(), readers_.end(), runs_elsewhere);
  return reader == readers_.end() ? task_ref() : *reader;
}

buffer_core::buffer_core(std::size_t bytes)
    : bytes_(bytes), record_(std::make_unique<access_record>()) {}
buffer_core::~buffer_core() = default;

buffer_copies* buffer_core::made_copies() const {
  const std::lock_guard<std::mutex> lock(copies_mutex_);
  return copies_.get();
}

void buffer_core::to_host(access_kind use) {
  if (buffer_copies* const made = made_copies()) {
    made->to_host(use);
  }
}

void* buffer_core::address_on(const memory_place& place) {
  {
    const std::lock_guard<std::mutex> lock(copies_mutex_);
    if (!copies_) {
      copies_ = std::make_unique<buffer_copies>(data_, bytes_, defined_.load());
    }
  }
  return copies_->address_on(place);
}

void* buffer_core::host_address(const memory_place& place, void* address) {
  buffer_copies* const made = made_copies();
  return made == nullptr ? address : made->host_address(place, address);
}

bool buffer_core::come_home() noexcept {
  try {
    to_host({false, true});
    return true;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "lumen: the contents of a buffer are lost on its device: %s\n",
                 error.what());
    return false;
  }
}

namespace {
std::vector<task_ref> conflicts_of(buffer_core& core, bool writes) {
  const std::lock_guard<std::mutex> lock(access_record::order_mutex());
  return core.record().conflicts(writes);
}
// A task that holds the last copy of a buffer must not wait for itself.
void wait_for_others(const std::vector<task_ref>& tasks) {
  for (const task_ref& t : tasks) {
    if (!t->runs_on_this_thread()) {
      t->wait();
    }
  }
}

// A place for the contents may be an iterator that throws: destructors tell of it.
void write_back_now(buffer_core& core) noexcept {
  try {
    core.write_back();
  } catch (const std::exception& error) {
    std::fprintf(stderr, "exception in ~buffer: %s\n", error.what());
  } catch (...) {
    std::fputs("exception in ~buffer\n", stderr);
  }
}

// The buffer dies with the closure of a task: its other users may have to wait for that task, so
// nobody waits for them here.
class late_write_back final : public host_command {
 public:
  explicit late_write_back(std::shared_ptr<buffer_core> core) : core_(std::move(core)) {}
  void run(const interop_handle&) override { write_back_now(*core_); }

 private:
  std::shared_ptr<buffer_core> core_;
};
void write_back_after(const std::vector<task_ref>& users,
                      const std::shared_ptr<buffer_core>& core) {
  command_group group;
  group.kind = work_kind::host;
  group.work = std::make_unique<late_write_back>(core);
  auto* last = new task(nullptr, std::move(group));  // keeps itself alive until it is done
  for (const task_ref& user : users) {
    last->depend_on(*user.get());
  }
  last->finish_linking();
}

// One host accessor: stands in the buffer's record as a task that is done when this goes.
class host_hold {
 public:
  host_hold(std::shared_ptr<buffer_core> core, access_kind use)
      : core_(std::move(core)), task_(new task(nullptr, command_group{})) {
    std::vector<task_ref> before;
    try {
      const std::lock_guard<std::mutex> lock(access_record::order_mutex());
      before = core_->record().conflicts(use.writes);
      core_->record().add_holder(*task_, use.writes);
    } catch (...) {
      end();
      throw;
    }
    wait_for_others(before);
    try {
      core_->to_host(use);
    } catch (...) {
      leave();
      throw;
    }
  }
  host_hold(const host_hold&) = delete;
  host_hold& operator=(const host_hold&) = delete;
  ~host_hold() { leave(); }

 private:
  void leave() {
    {
      const std::lock_guard<std::mutex> lock(access_record::order_mutex());
      core_->record().remove_holder(*task_);
    }
    end();
  }
  void end() {
    const task_ref mine = share(*task_);
    task_->finish_linking();
    task_->wait();
  }

  std::shared_ptr<buffer_core> core_;
  task* task_;  // keeps itself alive until it is done
};
}  // namespace

buffer_handle::buffer_handle(std::shared_ptr<buffer_core> shared_core)
    : core(std::move(shared_core)) {}

buffer_handle::~buffer_handle() {
  if (const task* closing = task::closing_on_this_thread()) {
    std::vector<task_ref> users = conflicts_of(*core, true);
    users.erase(
        std::remove_if(users.begin(), users.end(),
                       [=](const task_ref& user) { return user.get() == closing || user->done(); }),
        users.end());
    if (!users.empty()) {
      write_back_after(users, core);
      return;
    }
  }
  // One after the other, without memory: a buffer may go because there is none.
  const auto unfinished = [this] {
    const std::lock_guard<std::mutex> lock(access_record::order_mutex());
    return core->record().unfinished();
  };
  while (const task_ref user = unfinished()) {
    user->wait();
  }
  write_back_now(*core);
}

namespace {
// Several accessors of a group to one buffer are one access: what one of them gives up another may
// read.
void note_access(handler& group, buffer_core& core, access_kind use, const memory_place* place) {
  if (place == nullptr && use.writes) {
    core.define();
  }
  std::vector<access_request>& accesses = handler_access::group(group).accesses;
  for (access_request& access : accesses) {
    if (access.core.get() == &core && access.place == place) {
      access.writes = access.writes || use.writes;
      access.keeps = access.keeps || use.keeps;
      return;
    }
  }
  accesses.push_back({core.shared_from_this(), use.writes, use.keeps, place});
}
}  // namespace

void require_on_host(handler& group, buffer_core& core, access_kind use) {
  note_access(group, core, use, nullptr);
}

void* require_on_device(handler& group, buffer_core& core, void* host, access_kind use) {
  const memory_place& place = *handler_access::group(group).queue->place;
  if (!place.device.detached) {
    require_on_host(group, core, use);
    return host;
  }
  char* const there = static_cast<char*>(core.address_on(place));
  note_access(group, core, use, &place);
  return there + (static_cast<char*>(host) - static_cast<char*>(core.data()));
}

void* back_on_host(handler& group, buffer_core& core, void* address) {
  for (access_request& access : handler_access::group(group).accesses) {
    if (access.core.get() == &core && access.place != nullptr) {
      access.place = nullptr;
      if (access.writes) {
        core.define();
      }
    }
  }
  return core.host_address(*handler_access::group(group).queue->place, address);
}

std::shared_ptr<void> hold_for_host(const std::shared_ptr<buffer_core>& core, access_kind use) {
  if (use.writes) {
    core->define();
  }
  return std::make_shared<host_hold>(core, use);
}

void* allocate_buffer(std::size_t bytes) {
  constexpr std::size_t line = 64;
  void* data = bytes > static_cast<std::size_t>(-1) - line
                   ? nullptr
                   : std::aligned_alloc(line, (bytes + line - 1) / line * line);
  if (data == nullptr) {
    throw exception(make_error_code(errc::memory_allocation), "a buffer does not fit in memory");
  }
  return data;
}
void free_buffer(void* data) noexcept {
  std::free(data);
}

}  // namespace detail
LUMEN_NAMESPACE_END
