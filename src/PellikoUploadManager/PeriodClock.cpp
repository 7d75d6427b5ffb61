#include "PellikoUploadManager/PeriodClock.h"

#include <ctime>

namespace pelliko
{

double periodSeconds()
{
    struct tm origin = {};
    return difftime(time(nullptr), mktime(&origin));
}

} // namespace pelliko
