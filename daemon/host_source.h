/* A membership source that follows this host. */
#ifndef HBD_HOST_SOURCE_H
#define HBD_HOST_SOURCE_H

#include "host_cluster.h"
#include "host_interfaces.h"
#include "loop.h"
#include "membership_source.h"
#include "rtnetlink.h"

namespace hbd {

/** This host's interfaces and addresses, live. */
class HostSource : public MembershipSource {
 public:
  explicit HostSource(Loop& loop);

  [[nodiscard]] Configuration configuration() const override { return cluster_.configuration(); }
  InterfaceControl* interfaces() override { return &interfaces_; }
  void start(ChangeSink& sink, const Cluster& cluster) override;

 private:
  void take_changes();

  HostMonitor monitor_; /* listens before the table is read, so that nothing is missed in between */
  HostTable table_;
  HostCluster cluster_;
  HostInterfaces interfaces_;
  ChangeSink* sink_ = nullptr;
  Poll poll_;
};

}  // namespace hbd

#endif
