// Another process that sets integer keys: key-setter KEY VALUE...
#include <vconf.h>

#include <cstdlib>

int main(int argc, char **argv)
{
    for (int i = 2; i < argc; ++i) {
        if (vconf_set_int(argv[1], std::atoi(argv[i])) != 0)
            return 1;
    }
    return 0;
}
