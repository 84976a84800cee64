/* The table of actions. */
#pragma once

#include "action.h"

namespace webapi {

/* The row of an action; one that answers that there is no such action for every other name. */
const ActionKind &actionNamed(const std::string &name);

}  // namespace webapi
