// What a change callback is shown.
#pragma once

#include "KeyFiles.h"
#include "vconf.h"

struct _keynode_t {
    std::string name;
    pelliko::vconf::Value value;
};
