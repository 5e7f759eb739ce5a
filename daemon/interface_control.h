/* Interfaces and addresses of the local node, as far as requests change them. */
#ifndef HBD_INTERFACE_CONTROL_H
#define HBD_INTERFACE_CONTROL_H

#include "configuration.h"
#include "hb_protocol/replies.h"

namespace hbd {

/** Changes interfaces and addresses; says HB_NOT_SUPPORTED when it may not. */
class InterfaceControl {
 public:
  InterfaceControl() = default;
  InterfaceControl(const InterfaceControl&) = delete;
  InterfaceControl& operator=(const InterfaceControl&) = delete;
  virtual ~InterfaceControl() = default;

  /** Switches the adapter's interface on or off. */
  virtual Hb_Request_Status switch_interface(const Adapter& adapter, bool on) = 0;
  /** Gives the adapter an address in place of the one that it may have, and has it monitored. */
  virtual Hb_Request_Status configure(const Adapter& adapter, const Hb_IP_address6& address) = 0;
  /** Takes the adapter's address away. */
  virtual Hb_Request_Status unconfigure(const Adapter& adapter) = 0;
  /** Exchanges the addresses of two adapters. */
  virtual Hb_Request_Status swap(const Adapter& adapter, const Adapter& partner) = 0;
  /** Whether the adapter's interface is switched off, as far as the cluster does not know it by itself. */
  [[nodiscard]] virtual bool is_switched_off(const Adapter& adapter) const = 0;
};

}  // namespace hbd

#endif
