// Two pieces of work at once, for the few large jobs that split in two.
#pragma once

#include <functional>

namespace cx {

// Runs `here` on the calling thread and `aside` on a second thread at the
// same time, and returns when both are done. When the system gives no
// second thread, `aside` runs after `here` on the calling thread, so the
// two must allow that order.
void RunBeside(const std::function<void()>& aside, const std::function<void()>& here);

}  // namespace cx
