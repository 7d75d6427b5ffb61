#include "ViewerApp.h"

int main(int argc, char **argv)
{
    pelliko::viewer::ViewerApp app;
    return app.start(argc, argv);
}
