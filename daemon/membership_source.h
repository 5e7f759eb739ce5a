/* Where membership comes from. */
#ifndef HBD_MEMBERSHIP_SOURCE_H
#define HBD_MEMBERSHIP_SOURCE_H

#include "change.h"
#include "cluster.h"
#include "configuration.h"
#include "control_settings.h"
#include "interface_control.h"

namespace hbd {

/** A source of configuration and membership. */
class MembershipSource {
 public:
  MembershipSource() = default;
  MembershipSource(const MembershipSource&) = delete;
  MembershipSource& operator=(const MembershipSource&) = delete;
  virtual ~MembershipSource() = default;

  /** The configuration at the start. */
  [[nodiscard]] virtual Configuration configuration() const = 0;

  /** How requests are taken. */
  [[nodiscard]] virtual ControlSettings control_settings() const { return {}; }

  /** Where requests change interfaces and addresses; null when that is the cluster alone. */
  virtual InterfaceControl* interfaces() { return nullptr; }

  /** Begins to pass changes on; `cluster` is what they are applied to. */
  virtual void start(ChangeSink& sink, const Cluster& cluster) = 0;
};

}  // namespace hbd

#endif
