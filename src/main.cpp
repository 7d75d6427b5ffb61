#include "PellikoApp/PellikoApp.h"
#include "PellikoApp/Workers.h"

#include <cstdlib>

int main(int argc, char **argv)
{
    // A message that is on its way when the loop ends is still sent; longer than this nobody waits.
    constexpr std::chrono::seconds workerBound{30};
    pelliko::PellikoApp app;
    const int result = app.start(argc, argv);
    if (!pelliko::waitForWorkers(workerBound))
        std::_Exit(result); // the worker must not meet what the end of the process takes down
    return result;
}
