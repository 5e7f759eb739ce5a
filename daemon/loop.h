/* The event loop, and its watchers as objects that close themselves. */
#ifndef HBD_LOOP_H
#define HBD_LOOP_H

#include <uv.h>

#include <chrono>
#include <functional>

namespace hbd {

/** An event loop. It outlives its watchers. */
class Loop {
 public:
  Loop();
  Loop(const Loop&) = delete;
  Loop& operator=(const Loop&) = delete;
  ~Loop();

  /** Runs callbacks until stop(). */
  void run();
  /** Runs the callbacks that are due and waits for none. */
  void run_once();
  /** Ends run() after the callbacks that are due. */
  void stop();
  /** Time since some moment, the same during one turn of the loop. */
  [[nodiscard]] std::chrono::milliseconds now() const;

  uv_loop_t* get() { return &loop_; }

 private:
  uv_loop_t loop_{};
};

/** Owner of one libuv handle, which lives on until the loop has closed it. */
template <typename Handle>
class Watcher {
 public:
  Watcher() : handle_(new Handle{}) { handle_->data = this; }
  Watcher(const Watcher&) = delete;
  Watcher& operator=(const Watcher&) = delete;
  ~Watcher() { close(); }

  /** No callback comes after this. */
  void close() {
    if (handle_ == nullptr) {
      return;
    }
    uv_close(reinterpret_cast<uv_handle_t*>(handle_), [](uv_handle_t* closed) {
      // The handle was made as a Handle; the loop knows its base only.
      delete reinterpret_cast<Handle*>(closed);
    });
    handle_ = nullptr;
  }

 protected:
  Handle* handle_;
};

/** Watches a descriptor. */
class Poll : public Watcher<uv_poll_t> {
 public:
  /** Called with the UV_READABLE and UV_WRITABLE bits; both are set when the descriptor is in error. */
  using Callback = std::function<void(int events)>;

  Poll(Loop& loop, int descriptor, Callback callback);
  /** Watches for these bits from now on. */
  void watch(int events);

 private:
  Callback callback_;
};

/** Calls once after a time. */
class Timer : public Watcher<uv_timer_t> {
 public:
  Timer(Loop& loop, std::function<void()> callback);
  void start(std::chrono::milliseconds delay);
  void stop();

 private:
  std::function<void()> callback_;
};

/** Calls in each turn of the loop while it runs. */
class Idle : public Watcher<uv_idle_t> {
 public:
  Idle(Loop& loop, std::function<void()> callback);
  void start();
  void stop();

 private:
  std::function<void()> callback_;
};

/** Calls after each turn's input; it keeps no loop alive. */
class AfterInput : public Watcher<uv_check_t> {
 public:
  AfterInput(Loop& loop, std::function<void()> callback);

 private:
  std::function<void()> callback_;
};

/** Calls when the process gets a signal. */
class Signal : public Watcher<uv_signal_t> {
 public:
  Signal(Loop& loop, int number, std::function<void()> callback);

 private:
  std::function<void()> callback_;
};

}  // namespace hbd

#endif
