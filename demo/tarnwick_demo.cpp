// tarnwick-demo: loads tarnwick.hdll as the HashLink VM does and plays a game's session against
// the simulated EOS world (the built-in one, EOS_SIM_WORLD, or --world FILE), printing what the
// game receives at each step with the tick it arrived on. No Epic account, credentials or
// second player needed.

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <sstream>
#include <string>

#include "tour.h"

namespace {

const char kUsage[] =
    "usage: tarnwick-demo [--world FILE] [--login CREDENTIAL] [--items ID,ID,...] [--max-ticks N] [--log]\n"
    "                     [--hdll PATH]\n"
    "  --world FILE        play in this world file (default: $EOS_SIM_WORLD, else the built-in world)\n"
    "  --login CREDENTIAL  sign in with a Developer login naming this account's credential\n"
    "                      (default: the world's local player)\n"
    "  --items IDS         the catalogue items whose ownership is asked (comma-separated)\n"
    "  --max-ticks N       ticks a step may take before the demo gives up (default 100)\n"
    "  --log               also print the library's log lines as they are written\n"
    "  --hdll PATH         the tarnwick.hdll to load (default: next to this program, else the build's)\n"
    "egs.log is written to the current directory. Exit status: 0 when every step happened,\n"
    "1 when a step did not (its name is printed), 2 on a usage error.\n";

std::string default_hdll() {
    std::error_code ec;
    const auto self = std::filesystem::read_symlink("/proc/self/exe", ec);
    if (!ec) {
        const auto beside = self.parent_path() / "tarnwick.hdll";
        if (std::filesystem::exists(beside, ec)) return beside.string();
    }
#ifdef TARNWICK_HDLL_PATH
    return TARNWICK_HDLL_PATH;
#else
    return "tarnwick.hdll";
#endif
}

[[noreturn]] void usage(const std::string& problem) {
    std::cerr << "tarnwick-demo: " << problem << "\n" << kUsage;
    std::exit(2);
}

}  // namespace

int main(int argc, char** argv) {
    tour::Options options;
    options.hdll = default_hdll();
    for (int i = 1; i < argc; ++i) {
        const std::string arg = argv[i];
        auto value = [&]() -> std::string {
            if (i + 1 >= argc) usage(arg + " needs a value");
            return argv[++i];
        };
        if (arg == "--world") {
            options.world_file = value();
        } else if (arg == "--login") {
            options.login_as = value();
        } else if (arg == "--items") {
            options.items.clear();
            std::stringstream list(value());
            for (std::string item; std::getline(list, item, ',');)
                if (!item.empty()) options.items.push_back(item);
        } else if (arg == "--max-ticks") {
            const std::string v = value();
            char* end = nullptr;
            const long n = std::strtol(v.c_str(), &end, 10);
            if (end == v.c_str() || *end != '\0' || n < 1 || n > 1000000) usage("--max-ticks needs a number from 1 to 1000000");
            options.step_ticks = static_cast<int>(n);
        } else if (arg == "--log") {
            options.echo_log = true;
        } else if (arg == "--hdll") {
            options.hdll = value();
        } else if (arg == "--help" || arg == "-h") {
            std::cout << kUsage;
            return 0;
        } else {
            usage("unknown argument " + arg);
        }
    }

    const char* env = std::getenv("EOS_SIM_WORLD");
    std::cout << "tarnwick-demo: " << options.hdll << "\n"
              << "world: "
              << (!options.world_file.empty() ? options.world_file
                                              : (env && *env ? std::string(env) + " (EOS_SIM_WORLD)" : std::string("built-in")))
              << "\n";
    const auto started = std::chrono::steady_clock::now();
    const tour::Report report = tour::run(options, std::cout);
    const auto ms = std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - started);
    std::error_code ec;
    const auto log = std::filesystem::current_path(ec) / "egs.log";
    if (!report.failed_step.empty()) {
        std::cerr << "tarnwick-demo: step \"" << report.failed_step << "\" did not happen (see " << log.string() << ")\n";
        return 1;
    }
    std::cout << "tour complete: " << report.ticks << " ticks in " << ms.count() << " ms; the library's log is in "
              << log.string() << "\n";
    return 0;
}
