#include "ImsiModule.h"
#include "kor_sim.h"

#include <Module.h>
#include <glib.h>
#include <stdexcept>

namespace pelliko::korrin
{

std::string composedImsi(const std::string &number)
{
    try {
        static const ImsiFunctions &functions =
            *platform::moduleFunction<const ImsiFunctions *()>(imsiModule, imsiDoor)();
        return functions.compose(number);
    } catch (const std::runtime_error &error) {
        g_warning("account: %s", error.what());
        return {};
    }
}

} // namespace pelliko::korrin
