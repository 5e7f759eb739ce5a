/* This host's interfaces, as requests change them. */
#ifndef HBD_HOST_INTERFACES_H
#define HBD_HOST_INTERFACES_H

#include "host_table.h"
#include "interface_control.h"

namespace hbd {

/** Has the kernel change links and addresses. What comes of it is learnt from the kernel like any other change. */
class HostInterfaces : public InterfaceControl {
 public:
  /** @param table the host as it is; it stays the caller's. */
  explicit HostInterfaces(const HostTable& table) : table_(table) {}

  Hb_Request_Status switch_interface(const Adapter& adapter, bool on) override;
  Hb_Request_Status configure(const Adapter& adapter, const Hb_IP_address6& address) override;
  Hb_Request_Status unconfigure(const Adapter& adapter) override;
  Hb_Request_Status swap(const Adapter& adapter, const Adapter& partner) override;
  [[nodiscard]] bool is_switched_off(const Adapter& adapter) const override;

 private:
  [[nodiscard]] const HostAddress* find(const Adapter& adapter) const;
  void bring_back_others(const HostAddress& removed) const;

  const HostTable& table_;
};

}  // namespace hbd

#endif
