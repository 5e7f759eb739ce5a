// The monitor of the cluster's sites.
//
// A notification is traced, record by record, and is no event. From the records that name this node it keeps what they
// say of the node and of its site; the deletion of the site makes what is kept of the site void.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONSiteConfigEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONSiteConfigEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

  // What was learnt from the platform; each value counts only while its flag is set.
  zu_vex_uuid_t cached_local_node_uuid;
  bool cached_local_node_uuid_obtained;
  zu_vex_site_info_t cached_local_site_info;
  bool cached_local_site_info_obtained;
  zu_vex_site_policy_t cached_site_merge_policy;
  bool cached_site_merge_policy_obtained;

 private:
  Hb_Rc read_and_learn(Hb_Events* events);
  void learn(const zu_evm_event_site_cfg_t& record);
  void learn_site(const zu_evm_event_site_cfg_t& record);
};
