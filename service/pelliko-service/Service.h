#pragma once

#include "Settings.h"

namespace pelliko::service
{

/** Runs the service until it is asked to end (SIGTERM, SIGINT, or the bus goes). @return the exit
 * status */
int runService(const Settings &settings);

} // namespace pelliko::service
