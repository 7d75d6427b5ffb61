#include "SignInApp.h"

int main(int argc, char **argv)
{
    pelliko::signin::SignInApp app;
    return app.start(argc, argv);
}
