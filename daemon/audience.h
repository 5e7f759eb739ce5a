/* The clients, as far as a membership source needs to know of them. */
#ifndef HBD_AUDIENCE_H
#define HBD_AUDIENCE_H

#include <cstddef>
#include <functional>

namespace hbd {

/** Who listens. */
class Audience {
 public:
  Audience() = default;
  Audience(const Audience&) = delete;
  Audience& operator=(const Audience&) = delete;
  virtual ~Audience() = default;

  /** Subscriptions of all clients. */
  [[nodiscard]] virtual std::size_t subscriptions() const = 0;
  /** Whether nothing is kept for any client, those aside that have taken nothing for some seconds. */
  [[nodiscard]] virtual bool has_read() const = 0;
  /** Calls back whenever one of the two may have changed. */
  virtual void on_change(std::function<void()> callback) = 0;
};

}  // namespace hbd

#endif
