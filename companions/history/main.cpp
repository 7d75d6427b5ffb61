#include "HistoryApp.h"

int main(int argc, char **argv)
{
    pelliko::history::HistoryApp app;
    return app.start(argc, argv);
}
