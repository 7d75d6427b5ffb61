// What is done with the vCard library. It brings a third of all the libraries that a program with
// contacts would start with, and most programs never see a vCard.
#pragma once

#include <string>

#include "ContactCard.h"
#include "VcardCard.h"

namespace pelliko::contacts
{

struct VcardFunctions {
    ReadCard (*read)(const std::string &text);
    std::string (*write)(const ContactCard &card);
};

/// The functions behind the module's door; loads the module on the first call. Any thread. Throws
/// std::runtime_error with one sentence when it is not installed.
const VcardFunctions &vcardModule();

inline constexpr const char *vcard_module = "pelliko-vcards.so";
inline constexpr const char *vcard_door = "pelliko_vcard_functions";

/// The two halves inside of the module.
ReadCard readCardByLibrary(const std::string &text);
std::string writeCardByLibrary(const ContactCard &card);

} // namespace pelliko::contacts
