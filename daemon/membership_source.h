/* Where membership comes from. */
#ifndef HBD_MEMBERSHIP_SOURCE_H
#define HBD_MEMBERSHIP_SOURCE_H

#include "change.h"
#include "cluster.h"
#include "configuration.h"

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

  /** Begins to pass changes on; `cluster` is what they are applied to. */
  virtual void start(ChangeSink& sink, const Cluster& cluster) = 0;
};

}  // namespace hbd

#endif
