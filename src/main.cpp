#include "PellikoApp/PellikoApp.h"
#include "PellikoApp/Workers.h"

int main(int argc, char **argv)
{
    // A message that is on its way when the loop ends is still sent; longer than this nobody waits.
    constexpr std::chrono::seconds workerBound{30};
    pelliko::PellikoApp app;
    const int result = app.start(argc, argv);
    pelliko::waitForWorkers(workerBound);
    return result;
}
