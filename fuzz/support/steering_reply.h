// The requests that await an answer of the daemon, compared with what each answer has to mean.
#pragma once

#include "support/input.h"

namespace fuzz {

enum class Awaited { configure, unconfigure, swap, grace, state, route };

// One request on a started client, with arguments from the front of the input. The rest of it is the answer.
void run_steering_reply(Awaited operation, Input input);

}  // namespace fuzz
