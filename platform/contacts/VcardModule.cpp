#include "VcardModule.h"

#include <Module.h>
#include <stdexcept>

namespace pelliko::contacts
{

const VcardFunctions &vcardModule()
{
    static const VcardFunctions &functions =
        *platform::moduleFunction<const VcardFunctions *()>(vcard_module, vcard_door)();
    return functions;
}

ReadCard readCard(const std::string &text)
{
    try {
        return vcardModule().read(text);
    } catch (const std::runtime_error &error) {
        return {std::nullopt, {error.what()}};
    }
}

} // namespace pelliko::contacts
