#include "loop.h"

#include <fmt/format.h>

#include <string_view>
#include <utility>

#include "failure.h"

namespace hbd {
namespace {

void check(int result, std::string_view what) {
  if (result < 0) {
    throw Failure(fmt::format("{} failed: {}; raise the limit of open files (ulimit -n) when it is too low", what,
                              uv_strerror(result)));
  }
}

template <typename Owner>
Owner* owner_of(const void* data) {
  return static_cast<Owner*>(const_cast<void*>(data));
}

}  // namespace

Loop::Loop() { check(uv_loop_init(&loop_), "making the event loop"); }

Loop::~Loop() {
  while (uv_loop_close(&loop_) == UV_EBUSY) {
    uv_run(&loop_, UV_RUN_NOWAIT);
  }
}

void Loop::run() { uv_run(&loop_, UV_RUN_DEFAULT); }

void Loop::run_once() { uv_run(&loop_, UV_RUN_NOWAIT); }

void Loop::stop() { uv_stop(&loop_); }

std::chrono::milliseconds Loop::now() const { return std::chrono::milliseconds(uv_now(&loop_)); }

Poll::Poll(Loop& loop, int descriptor, Callback callback) : callback_(std::move(callback)) {
  const int result = uv_poll_init(loop.get(), handle_, descriptor);
  if (result < 0) {
    delete std::exchange(handle_, nullptr);
    check(result, "watching a descriptor");
  }
}

void Poll::watch(int events) {
  if (handle_ == nullptr) {
    return;
  }
  uv_poll_start(handle_, events, [](uv_poll_t* handle, int status, int ready) {
    owner_of<Poll>(handle->data)->callback_(status < 0 ? UV_READABLE | UV_WRITABLE : ready);
  });
}

Timer::Timer(Loop& loop, std::function<void()> callback) : callback_(std::move(callback)) {
  uv_timer_init(loop.get(), handle_);
}

void Timer::start(std::chrono::milliseconds delay) {
  uv_timer_start(
      handle_, [](uv_timer_t* handle) { owner_of<Timer>(handle->data)->callback_(); },
      static_cast<std::uint64_t>(delay.count()), 0);
}

void Timer::stop() { uv_timer_stop(handle_); }

Idle::Idle(Loop& loop, std::function<void()> callback) : callback_(std::move(callback)) {
  uv_idle_init(loop.get(), handle_);
}

void Idle::start() {
  uv_idle_start(handle_, [](uv_idle_t* handle) { owner_of<Idle>(handle->data)->callback_(); });
}

void Idle::stop() { uv_idle_stop(handle_); }

AfterInput::AfterInput(Loop& loop, std::function<void()> callback) : callback_(std::move(callback)) {
  uv_check_init(loop.get(), handle_);
  uv_check_start(handle_, [](uv_check_t* handle) { owner_of<AfterInput>(handle->data)->callback_(); });
  uv_unref(reinterpret_cast<uv_handle_t*>(handle_));
}

Signal::Signal(Loop& loop, int number, std::function<void()> callback) : callback_(std::move(callback)) {
  const int result = uv_signal_init(loop.get(), handle_);
  if (result < 0) {
    delete std::exchange(handle_, nullptr);
    check(result, "watching signals");
  }
  uv_signal_start(
      handle_, [](uv_signal_t* handle, int) { owner_of<Signal>(handle->data)->callback_(); }, number);
}

}  // namespace hbd
