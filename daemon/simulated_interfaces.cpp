#include "simulated_interfaces.h"

namespace hbd {

Hb_Request_Status SimulatedInterfaces::switch_interface(const Adapter& adapter, bool on) {
  sink_.apply(InterfaceSwitch{adapter.number, on});
  return HB_REQUEST_SUCCESSFUL;
}

Hb_Request_Status SimulatedInterfaces::configure(const Adapter& adapter, const Hb_IP_address6& address) {
  const Hb_Adapter_Number number = adapter.number;
  sink_.apply(AddressChange{{{number, address}}});
  sink_.apply(MonitoringSwitch{number, true});
  return HB_REQUEST_SUCCESSFUL;
}

Hb_Request_Status SimulatedInterfaces::unconfigure(const Adapter& adapter) {
  sink_.apply(AddressChange{{{adapter.number, std::nullopt}}});
  return HB_REQUEST_SUCCESSFUL;
}

Hb_Request_Status SimulatedInterfaces::swap(const Adapter& adapter, const Adapter& partner) {
  sink_.apply(AddressChange{{{adapter.number, partner.address}, {partner.number, adapter.address}}});
  return HB_REQUEST_SUCCESSFUL;
}

}  // namespace hbd
