// oFono as modem service.
#pragma once

#include "ModemService.h"

#include <memory>

namespace pelliko::modem
{

std::unique_ptr<ModemService> makeOfonoService();

} // namespace pelliko::modem
