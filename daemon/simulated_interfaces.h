/* Interfaces that are part of the model alone. */
#ifndef HBD_SIMULATED_INTERFACES_H
#define HBD_SIMULATED_INTERFACES_H

#include "change.h"
#include "interface_control.h"

namespace hbd {

/** Makes each request a change of the model. */
class SimulatedInterfaces : public InterfaceControl {
 public:
  explicit SimulatedInterfaces(ChangeSink& sink) : sink_(sink) {}

  Hb_Request_Status switch_interface(const Adapter& adapter, bool on) override;
  Hb_Request_Status configure(const Adapter& adapter, const Hb_IP_address6& address) override;
  Hb_Request_Status unconfigure(const Adapter& adapter) override;
  Hb_Request_Status swap(const Adapter& adapter, const Adapter& partner) override;
  [[nodiscard]] bool is_switched_off(const Adapter& /*adapter*/) const override { return false; }

 private:
  ChangeSink& sink_;
};

}  // namespace hbd

#endif
