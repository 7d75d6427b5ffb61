#include "PickerApp.h"

int main(int argc, char **argv)
{
    pelliko::picker::PickerApp app;
    return app.start(argc, argv);
}
