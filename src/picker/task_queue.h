// TaskQueue: one background thread that runs posted tasks one at a time, in the order posted.
// The picker keeps its service connection on one (so the main loop never waits on the socket)
// and checks glyph coverage on another.
//
//   TaskQueue queue;
//   queue.Post([] { SlowWork(); });
//
// Thread-safety: Post() may be called from any thread. The destructor runs the tasks already
// posted (so writes queued for the service still go out), then joins the thread; it must not
// run on the queue's own thread. Tasks own what they capture.
#pragma once

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>

namespace lumeris::picker {

class TaskQueue {
 public:
  TaskQueue();
  ~TaskQueue();
  TaskQueue(const TaskQueue&) = delete;
  TaskQueue& operator=(const TaskQueue&) = delete;

  void Post(std::function<void()> task);

 private:
  void RunTasks();

  std::mutex mutex_;  // guards the two members below
  std::deque<std::function<void()>> tasks_;
  bool stopping_ = false;
  std::condition_variable wake_;
  std::thread thread_;
};

}  // namespace lumeris::picker
