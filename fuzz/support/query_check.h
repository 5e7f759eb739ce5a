// Every query of the configuration, compared with what the configuration message said.
#pragma once

#include "support/configuration_model.h"
#include "support/hostile.h"

namespace fuzz {

void check_queries(Configuration_Model& model, const Hostile& hostile);

}  // namespace fuzz
