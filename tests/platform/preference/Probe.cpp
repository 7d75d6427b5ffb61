// Another run of an application: preference-probe set KEY NUMBER | get KEY. Prints code and value.
#include <app_preference.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

int main(int argc, char **argv)
{
    int value = argc > 3 ? std::atoi(argv[3]) : -1;
    const bool sets = std::strcmp(argv[1], "set") == 0;
    const int code =
        sets ? preference_set_int(argv[2], value) : preference_get_int(argv[2], &value);
    std::printf("%d %d\n", code, value);
    return 0;
}
