// Another process that sets keys: key-setter KEY INTEGER..., or key-setter --text KEY TEXT.
#include <vconf.h>

#include <cstdlib>
#include <cstring>

int main(int argc, char **argv)
{
    if (argc == 4 && std::strcmp(argv[1], "--text") == 0)
        return vconf_set_str(argv[2], argv[3]) == 0 ? 0 : 1;
    for (int i = 2; i < argc; ++i) {
        if (vconf_set_int(argv[1], std::atoi(argv[i])) != 0)
            return 1;
    }
    return 0;
}
