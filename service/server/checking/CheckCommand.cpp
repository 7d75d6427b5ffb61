#include "checking/CheckCommand.h"

#include "checking/Check.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <exception>

namespace pelliko::server
{
namespace
{

constexpr int couldNotLook = 2;

unsigned long long printable(std::uint64_t number)
{
    return number;
}

void summarise(const Check::Report &report, bool mend)
{
    std::printf("%llu rows and %llu files with bytes: %llu lost, %llu strays, %llu with leftovers, "
                "%llu unused rows",
                printable(report.rows), printable(report.blobs), printable(report.lost),
                printable(report.strays), printable(report.leftovers), printable(report.unused));
    if (mend)
        std::printf("; %llu mended", printable(report.mended));
    std::printf("\n");
}

int check(const StoreUrls &stores, bool mend)
{
    const auto metadata = openMetadata(stores.metadata, Absent::fails);
    const auto rows = openTables(stores.metadata, Absent::fails);
    const auto blobs = openBlobs(stores.blobs);
    refuseUnserved(blobs->mark(), "blobs");
    Check look(*rows, *metadata, *blobs,
               [](const std::string &line) { std::printf("%s\n", line.c_str()); });
    if (mend)
        look.mendAt(std::time(nullptr));
    const Check::Report report = look.run();
    summarise(report, mend);
    return report.found() == report.mended ? EXIT_SUCCESS : EXIT_FAILURE;
}

} // namespace

int checkCommand(const StoreUrls &stores, bool mend)
{
    try {
        return check(stores, mend);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelliko-server: %s\n", error.what());
        return couldNotLook;
    }
}

} // namespace pelliko::server
