// Drives tarnwick.hdll the way the HashLink VM does, against the EOS simulator.
// Every test runs in its own process (ctest), in a fresh temporary directory
// that receives its "egs.log".
#pragma once

#include <gtest/gtest.h>

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <host.h>
#include <tarnwick_primitives.h>

#include <optional>
#include <string>
#include <vector>

namespace tw {

// The primitives, bound through their descriptors with the declared signatures.
using tarnwick::Declared;
using tarnwick::kDeclared;
using tarnwick::Primitives;

// The world most tests play in: the local player "me" (display name "Local
// Player"), friends alice (playing this product), bob (online in another
// product) and carol (offline), achievements and catalogue items.
eos_sim::World test_world();

class TarnwickTest : public ::testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;

    Primitives p{};

    // A configuration that signs the local player in.
    host::InitConfigValues config() const;
    // hleos_init with these values; the closure may be null.
    bool init(const host::InitConfigValues &values, const host::ClosureRef &onLogin);
    // Starts the platform and ticks until the sign-in closure has been called.
    host::ClosureRef sign_in();

    // hleos_update under a trap, as the VM calls it; returns the rethrown
    // Haxe exception, or null.
    vdynamic *tick();
    void tick(int count);
    // Ticks until `done` holds (at most `limit` ticks); false if it never did.
    bool tick_until(const std::function<bool()> &done, int limit = 50);
    // Ticks with a collection before each tick.
    void tick_collecting(int count);

    static vclosure *vm(const host::ClosureRef &closure) { return closure ? closure->vm : nullptr; }

    // The lines of egs.log (without their line ends), and those containing `part`.
    std::vector<std::string> log_lines() const;
    std::vector<std::string> log_lines_with(const std::string &part) const;
    // The [EGS] lines written by the library itself, SDK log lines left out.
    std::vector<std::string> egs_lines() const;
    bool logged(const std::string &line) const;

    // No outstanding SDK copy, no simulator fault, `roots` collector roots.
    void expect_clean(size_t roots = 0) const;

    std::string dir_;
};

// The i32, bytes and array arguments of a recorded call.
int arg_i32(const host::Call &call, size_t index);
std::optional<std::string> arg_bytes(const host::Call &call, size_t index);
varray *arg_array(const host::Call &call, size_t index);

}  // namespace tw
