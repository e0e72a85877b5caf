// What the library adds to a game's frame: hleos_update against a bare
// EOS_Platform_Tick with nothing queued, and the cost of one log line.
#include <benchmark/benchmark.h>

#include "bench_support.h"

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <host.h>

#include <cstring>

namespace {

void (*g_update)() = nullptr;
EOS_HPlatform g_bare = nullptr;

// Loads the hdll, signs in through it, and creates a second platform that is
// ticked directly, so both measure the same simulator with nothing queued.
void set_up()
{
    if (g_update)
        return;
    g_update = sign_in_for_bench().update;

    EOS_Platform_Options options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 13;
    options.ProductId = "bench-product";
    options.SandboxId = "sandbox";
    options.DeploymentId = "deployment";
    options.ClientCredentials.ClientId = "client";
    options.ClientCredentials.ClientSecret = "secret";
    options.Flags = EOS_PF_DISABLE_OVERLAY;
    g_bare = EOS_Platform_Create(&options);
    if (!g_bare)
        std::abort();
}

void BM_BarePlatformTick(benchmark::State &state)
{
    set_up();
    for (auto _ : state)
        EOS_Platform_Tick(g_bare);
}
BENCHMARK(BM_BarePlatformTick);

void BM_UpdateWithNothingQueued(benchmark::State &state)
{
    set_up();
    for (auto _ : state)
        g_update();
}
BENCHMARK(BM_UpdateWithNothingQueued);

// One SDK log line: formatted, printed to the console and appended to egs.log.
void BM_OneLogLine(benchmark::State &state)
{
    set_up();
    for (auto _ : state) {
        eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, "a line of the usual length");
        if (state.iterations() % 4096 == 0)
            hlrt::clear_console();
    }
}
BENCHMARK(BM_OneLogLine);

}  // namespace

BENCHMARK_MAIN();
