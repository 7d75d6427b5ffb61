// The module that makes an IMSI from a number. It takes the tables of all countries' phone numbers,
// which only accounts from before SIMs were noted need at a start.
#pragma once

#include <string>

namespace pelliko::korrin
{

struct ImsiFunctions {
    std::string (*compose)(const std::string &number); ///< composedImsi() of kor_sim.h
};

inline constexpr const char *imsiModule = "pelliko-imsi.so";
inline constexpr const char *imsiDoor = "pelliko_imsi_functions";

} // namespace pelliko::korrin
