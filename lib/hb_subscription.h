// Registering a subscription where the mode says.
#pragma once

#include "hb_client/subscription.h"

// The mode-dependent half of hb_subscribe: remembers the name, and sends the record or wakes the new-group monitor.
Hb_Rc VEX_handle_subscription(char* name, Hb_Subscription_Group* group);
