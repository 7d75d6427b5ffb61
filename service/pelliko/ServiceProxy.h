#pragma once

#include "com.velmora.pelliko.Service1.h"

namespace pelliko::client
{

/**
 * The process-wide proxy of the background service, made on first use; borrowed.
 * @return null when there is no session bus
 */
PellikoService1 *serviceProxy();

/** Says what a failed call means to the caller: the service is not running, or it is still loading.
 */
int codeOf(const GError *error);

} // namespace pelliko::client
