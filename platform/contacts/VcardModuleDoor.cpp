#include "VcardModule.h"

extern "C" __attribute__((visibility("default"))) const pelliko::contacts::VcardFunctions *
pelliko_vcard_functions()
{
    static constexpr pelliko::contacts::VcardFunctions functions = {
        pelliko::contacts::readCardByLibrary, pelliko::contacts::writeCardByLibrary};
    return &functions;
}
