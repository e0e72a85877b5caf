// Time per friend of one friend-list request, for lists of 10 to 5000 friends.
//
// Every iteration runs one request through the library (hleos_query_friends,
// its fan-out, the 2n + 1 completions held and then released in one tick, and
// the delivery) twice: once plain, for the whole time, and once with the
// simulator timing itself, for its share. The simulator's share is the time
// spent inside EOS_* functions less the time in the library's callbacks they
// call, less one clock reading per measured stretch. A third run makes the
// list's VM values straight through the runtime, to tell the runtime's share
// from the library's own. Every run starts after a collection.
//
// Counters, per friend, in nanoseconds:
//   total_ns_per_friend    the whole request
//   sim_ns_per_friend      the simulator's share of it
//   library_ns_per_friend  total - sim: the library with the VM runtime it
//                          calls (also the benchmark's time, per request)
//   vm_ns_per_friend       the VM values alone
//   own_ns_per_friend      library - vm: the library's own work
// library_ns_per_friend should stay flat as the list grows.
#include <benchmark/benchmark.h>

#include "bench_support.h"

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <host.h>

#include <chrono>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

constexpr int kMaxFriends = 5000;

void (*g_update)() = nullptr;
void (*g_query_friends)(vclosure *) = nullptr;
host::ClosureRef g_on_friends;

std::string friend_name(int i) { return "friend" + std::to_string(i); }

eos_sim::World bench_world()
{
    eos_sim::World w;
    w.local_account = "me";
    eos_sim::Account me;
    me.name = "me";
    me.display_name = "Local Player";
    for (int i = 0; i < kMaxFriends; ++i)
        me.friends.push_back({friend_name(i)});
    w.accounts.push_back(me);
    for (int i = 0; i < kMaxFriends; ++i) {
        eos_sim::Account a;
        a.name = friend_name(i);
        a.display_name = "Friend number " + std::to_string(i);
        a.friends = {{"me"}};
        a.presence = eos_sim::Presence{EOS_Presence_EStatus::EOS_PS_Online,
                                       std::string(i % 2 ? "another-product" : eos_sim::kThisProduct)};
        w.accounts.push_back(a);
    }
    return w;
}

void set_up()
{
    if (g_update)
        return;
    eos_sim::set_world(bench_world());
    tarnwick::Primitives p = sign_in_for_bench();
    g_update = p.update;
    g_query_friends = p.query_friends;
    g_on_friends = host::make_closure("PA_v");
    hlrt::hold(g_on_friends->vm);  // the game keeps its closure across requests
}

void use_friends(int n)
{
    eos_sim::update_world([n](eos_sim::World &w) {
        w.accounts[0].friends.clear();
        for (int i = 0; i < n; ++i)
            w.accounts[0].friends.push_back({friend_name(i)});
    });
}

using Clock = std::chrono::steady_clock;

// One request through the library: list query, fan-out, then every completion in one tick.
void library_request()
{
    g_query_friends(g_on_friends->vm);
    eos_sim::release_all();
    g_update();
    eos_sim::release_all();
    g_update();
}

// The VM values the library makes for one list of n friends, made straight
// through the runtime: the list, and per friend a record with its four fields
// (field names hashed at every use, as the library does).
void vm_values(int n)
{
    static const char epic[] = "0123456789abcdef0123456789abcdef";
    static const char name[] = "Friend number 1234";
    varray *list = hl_alloc_array(&hlt_dynobj, n);
    hl_add_root(&list);
    for (int i = 0; i < n; ++i) {
        vdynobj *record = hl_alloc_dynobj();
        auto *o = reinterpret_cast<vdynamic *>(record);
        hl_dyn_setp(o, hl_hash_utf8("epicId"), &hlt_bytes, hl_copy_bytes(reinterpret_cast<const vbyte *>(epic), 33));
        hl_dyn_setp(o, hl_hash_utf8("name"), &hlt_bytes,
                    hl_copy_bytes(reinterpret_cast<const vbyte *>(name), sizeof name));
        hl_dyn_seti(o, hl_hash_utf8("online"), &hlt_bool, i % 2);
        hl_dyn_setp(o, hl_hash_utf8("productId"), &hlt_bytes, hl_copy_bytes(reinterpret_cast<const vbyte *>(epic), 33));
        hl_aptr(list, vdynobj *)[i] = record;
    }
    hl_remove_root(&list);
}

// A collection, then the C allocator's sorting of the chunks it freed (each
// large request sorts up to 10000 of them), so that no timed run pays for the
// bookkeeping of what the collection left.
void settle()
{
    hlrt::collect();
    for (int i = 0; i < 8; ++i)
        std::free(std::malloc(64 * 1024));
}

double seconds_since(Clock::time_point t0) { return std::chrono::duration<double>(Clock::now() - t0).count(); }

void BM_FriendList(benchmark::State &state)
{
    set_up();
    const int n = static_cast<int>(state.range(0));
    use_friends(n);
    eos_sim::hold(true);
    const double clock_cost = std::chrono::duration<double>(eos_sim::self_timing_clock_cost()).count();
    double total = 0, sim = 0, vm = 0;
    for (auto _ : state) {
        size_t delivered = g_on_friends->count();
        settle();
        Clock::time_point t0 = Clock::now();
        library_request();
        const double whole = seconds_since(t0);

        settle();
        eos_sim::set_self_timing(true);
        library_request();
        const eos_sim::SelfTime self = eos_sim::self_time();
        eos_sim::set_self_timing(false);
        const double inside = std::chrono::duration<double>(self.inside).count() -
                              static_cast<double>(self.entries) * clock_cost;

        if (g_on_friends->count() != delivered + 2) {
            state.SkipWithError("a request was not delivered in one tick");
            break;
        }
        total += whole;
        sim += inside;
        state.SetIterationTime(whole - inside);
        g_on_friends->calls.clear();

        settle();
        Clock::time_point t1 = Clock::now();
        vm_values(n);
        vm += seconds_since(t1);
    }
    eos_sim::hold(false);
    double per = 1e9 / (static_cast<double>(state.iterations()) * n);
    state.counters["total_ns_per_friend"] = total * per;
    state.counters["sim_ns_per_friend"] = sim * per;
    state.counters["vm_ns_per_friend"] = vm * per;
    state.counters["library_ns_per_friend"] = (total - sim) * per;
    state.counters["own_ns_per_friend"] = (total - sim - vm) * per;
    state.counters["friends"] = n;
}
BENCHMARK(BM_FriendList)
    ->Arg(10)
    ->Arg(100)
    ->Arg(1000)
    ->Arg(5000)
    ->UseManualTime()
    ->Unit(benchmark::kMicrosecond)
    ->Repetitions(5)
    ->DisplayAggregatesOnly(true);

}  // namespace

BENCHMARK_MAIN();
