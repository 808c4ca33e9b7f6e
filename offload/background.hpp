// SPDX-License-Identifier: Apache-2.0
// Work that goes on after an entry has returned. The process does not end under it: whatever it
// touches last, a driver or the offload runtime, is still there.
#pragma once

namespace kestrel::tarn::rng::detail::openmp {

/// Announces a piece of work, for whose end that of the process waits from now on; whoever ends the
/// process from inside such work waits for the others. A forked child knows only of the work that
/// its one thread carries out. False when the process has done its waiting: then the work is to be
/// done before the entry returns.
bool announce_background_work();

/// For work that was announced and is not done in the background after all.
void withdraw_background_work();

/// While it lives, the thread carries out a piece of work that was announced.
class background_work {
 public:
  background_work();
  ~background_work();
  background_work(const background_work&) = delete;
  background_work& operator=(const background_work&) = delete;
};

}  // namespace kestrel::tarn::rng::detail::openmp
