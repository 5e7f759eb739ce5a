/* What a client asked to be told. */
#ifndef HBD_SUBSCRIPTION_H
#define HBD_SUBSCRIPTION_H

#include <vector>

#include "cluster.h"
#include "event.h"
#include "frame.h"
#include "hb_client/subscription.h"
#include "member_set.h"

namespace hbd {

/** One registration of a client. */
struct Subscription {
  SubscriptionName name{};
  Hb_Subscription_Type type = Hb_All_Nodes_Subscription;
  Hb_Events events = 0;
  MemberSet members; /**< read for the types that name their members */

  /** Whether it follows adapters, one by one, by network, or all of them. */
  [[nodiscard]] bool follows_adapters() const;
  /** Whether it follows nodes, one by one or all of them. */
  [[nodiscard]] bool follows_nodes() const;
  /** Whether the event is to be sent for it. A configuration update is for none: it goes by client. */
  [[nodiscard]] bool wants(const Event& event, const Cluster& cluster) const;
  /** The group that it starts with: the present one, when the mask asks for new groups; otherwise nothing. */
  [[nodiscard]] std::vector<Event> first_events(const Cluster& cluster) const;
};

/** Reads the record that a client sent; its type must be known. */
Subscription subscription_of(const Hb_Subscription_Group& record);

/** The registrations of one client, in the order they came in; one for each name. */
class SubscriptionList {
 public:
  /** Registers; a registration of the same name is replaced where it stands. */
  void put(Subscription subscription);
  /** Forgets the registration of that name; false when there is none. */
  bool remove(const SubscriptionName& name);

  [[nodiscard]] std::size_t size() const { return list_.size(); }
  [[nodiscard]] auto begin() const { return list_.begin(); }
  [[nodiscard]] auto end() const { return list_.end(); }

 private:
  std::vector<Subscription> list_;
};

}  // namespace hbd

#endif
