// SPDX-License-Identifier: Apache-2.0
// One thread that serves any number of cameras.
#ifndef VIRTUAL_CAMERA_SERVER_EVENT_LOOP_H_
#define VIRTUAL_CAMERA_SERVER_EVENT_LOOP_H_

#include <asio/dispatch.hpp>
#include <asio/executor_work_guard.hpp>
#include <asio/io_context.hpp>
#include <future>
#include <thread>
#include <utility>

namespace vexa::camera {

// Shared by the cameras that it serves. Everything that its cameras do happens on its thread, so that they need
// no locks among their own parts.
class EventLoop {
 public:
  EventLoop() : work_(asio::make_work_guard(context_)), thread_([this] { context_.run(); }) {}
  ~EventLoop() {
    context_.stop();
    thread_.join();
  }
  EventLoop(const EventLoop&) = delete;
  EventLoop& operator=(const EventLoop&) = delete;

  [[nodiscard]] asio::io_context& context() { return context_; }

  // Runs a task on the loop's thread and waits for its result.
  template <typename Task>
  auto run(Task task) {
    std::packaged_task<decltype(task())()> packaged(std::move(task));
    auto result = packaged.get_future();
    asio::dispatch(context_, [&packaged] { packaged(); });
    return result.get();
  }

 private:
  asio::io_context context_{1};
  asio::executor_work_guard<asio::io_context::executor_type> work_;
  std::thread thread_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_EVENT_LOOP_H_
