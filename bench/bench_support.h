// What every benchmark does first: a fresh working directory (egs.log lands
// there), the hdll loaded with every primitive bound, and the world's local
// player signed in through it. Calls are no longer recorded afterwards.
#pragma once

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <host.h>
#include <tarnwick_primitives.h>

#include <cstdlib>
#include <unistd.h>

inline tarnwick::Primitives sign_in_for_bench()
{
    char dir[] = "/tmp/tarnwick-bench-XXXXXX";
    if (!mkdtemp(dir) || chdir(dir) != 0)
        std::abort();
    hlrt::set_console_echo(false);
    host::load(TARNWICK_HDLL_PATH);
    tarnwick::Primitives p = tarnwick::bind_primitives();
    host::InitConfigValues v;
    v.productName = "bench";
    v.productVersion = "1";
    v.eosProductId = "bench-product";
    v.sandboxId = "sandbox";
    v.deploymentId = "deployment";
    v.clientId = "client";
    v.clientSecret = "secret";
    v.loginType = static_cast<int>(EOS_ELoginCredentialType::EOS_LCT_AccountPortal);
    void *config = host::init_config(v);
    host::Held keep(config);
    host::ClosureRef on_login = host::make_closure("PiBBB_v");
    if (!p.init(config, on_login->vm))
        std::abort();
    for (int i = 0; i < 40 && on_login->count() == 0; ++i)
        p.update();
    if (on_login->count() == 0 || on_login->last().args[0].i != 0)
        std::abort();
    eos_sim::set_recording(false);
    return p;
}
