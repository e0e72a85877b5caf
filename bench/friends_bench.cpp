// Time per friend of one friend-list request, for lists of 10 to 5000 friends.
//
// Every iteration runs one request through the library (hleos_query_friends,
// its fan-out, the 2n + 1 completions and the delivery) and the same request
// driven straight against the SDK on a second platform by a bare client. The
// bare client makes the same EOS_* calls in the same order (list query, count,
// ids and their text, one user-info and one presence query per friend,
// mappings in batches of 128, the copies and their releases, the mapping
// getters) but builds no VM values and keeps only what the next call needs:
// it is the simulator's own share of the request. Both hold every completion,
// release them all and deliver them in one tick; they take turns going first,
// each after a collection. A third run makes the list's VM values straight
// through the runtime, to tell the runtime's share from the library's own.
//
// Times are the thread's CPU time, so that other processes on the machine do
// not count. Counters, per friend, in nanoseconds:
//   total_ns_per_friend    the whole library request (also the benchmark's time)
//   sim_ns_per_friend      the bare request
//   library_ns_per_friend  total - sim: the library with the VM runtime it calls
//   vm_ns_per_friend       the VM values alone
//   own_ns_per_friend      total - sim - vm: the library's own work
// library_ns_per_friend should stay flat as the list grows.
#include <benchmark/benchmark.h>

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <host.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <string>
#include <unistd.h>
#include <vector>

namespace {

constexpr int kMaxFriends = 5000;
constexpr int kBatch = 128;

void (*g_update)() = nullptr;
void (*g_query_friends)(vclosure *) = nullptr;
host::ClosureRef g_on_friends;
EOS_HPlatform g_bare = nullptr;
EOS_EpicAccountId g_me = nullptr;
EOS_ProductUserId g_me_product = nullptr;

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
    char dir[] = "/tmp/tarnwick-bench-XXXXXX";
    if (!mkdtemp(dir) || chdir(dir) != 0)
        std::abort();
    hlrt::set_console_echo(false);
    eos_sim::set_world(bench_world());
    host::load(TARNWICK_HDLL_PATH);
    auto init = host::bind_as<bool (*)(void *, vclosure *)>("init", "POBBBBBBBBBBiib_PiBBB_v_b");
    g_update = host::bind_as<void (*)()>("update", "P_v");
    g_query_friends = host::bind_as<void (*)(vclosure *)>("query_friends", "PPA_v_v");
    host::InitConfigValues v;
    v.productName = "bench";
    v.productVersion = "1";
    v.eosProductId = "bench-product";
    v.sandboxId = "sandbox";
    v.deploymentId = "deployment";
    v.clientId = "client";
    v.clientSecret = "secret";
    v.loginId = "localhost:6547";
    v.loginToken = "me";
    v.loginType = static_cast<int>(EOS_ELoginCredentialType::EOS_LCT_Developer);
    void *config = host::init_config(v);
    host::Held keep(config);
    host::ClosureRef on_login = host::make_closure("PiBBB_v");
    if (!init(config, on_login->vm))
        std::abort();
    for (int i = 0; i < 40 && on_login->count() == 0; ++i)
        g_update();
    if (on_login->count() == 0 || on_login->last().args[0].i != 0)
        std::abort();

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
    g_me = eos_sim::epic_account_id("me");
    g_me_product = eos_sim::product_user_id("me");
    g_on_friends = host::make_closure("PA_v");
    hlrt::hold(g_on_friends->vm);  // the game keeps its closure across requests
    eos_sim::set_recording(false);
}

void use_friends(int n)
{
    eos_sim::update_world([n](eos_sim::World &w) {
        w.accounts[0].friends.clear();
        for (int i = 0; i < n; ++i)
            w.accounts[0].friends.push_back({friend_name(i)});
    });
}

// ---------------------------------------------------------------------------
// The bare client.

struct BareRequest {
    int user_info_left = 0;
    int presence_left = 0;
    int batches_left = 0;
    std::vector<std::string> texts;
    std::vector<const char *> ids;
    bool done = false;
};

struct BareBatch {
    BareRequest *request;
    int first;
    int count;
};

BareBatch g_batches[kMaxFriends / kBatch + 1];
int g_sink = 0;

void maybe_done(BareRequest *r)
{
    if (r->user_info_left == 0 && r->presence_left == 0 && r->batches_left == 0)
        r->done = true;
}

void EOS_CALL bare_on_user_info(const EOS_UserInfo_QueryUserInfoCallbackInfo *info)
{
    auto *r = static_cast<BareRequest *>(info->ClientData);
    EOS_UserInfo_CopyUserInfoOptions o;
    std::memset(&o, 0, sizeof o);
    o.ApiVersion = 3;
    o.LocalUserId = g_me;
    o.TargetUserId = info->TargetUserId;
    EOS_UserInfo *user = nullptr;
    if (EOS_UserInfo_CopyUserInfo(EOS_Platform_GetUserInfoInterface(g_bare), &o, &user) == EOS_EResult::EOS_Success) {
        g_sink += static_cast<int>(std::strlen(user->DisplayName));
        EOS_UserInfo_Release(user);
    }
    r->user_info_left -= 1;
    maybe_done(r);
}

void EOS_CALL bare_on_presence(const EOS_Presence_QueryPresenceCallbackInfo *info)
{
    auto *r = static_cast<BareRequest *>(info->ClientData);
    EOS_Presence_CopyPresenceOptions o;
    std::memset(&o, 0, sizeof o);
    o.ApiVersion = 3;
    o.LocalUserId = g_me;
    o.TargetUserId = info->TargetUserId;
    EOS_Presence_Info *presence = nullptr;
    if (EOS_Presence_CopyPresence(EOS_Platform_GetPresenceInterface(g_bare), &o, &presence) == EOS_EResult::EOS_Success) {
        g_sink += presence->ProductId && std::strcmp(presence->ProductId, "bench-product") == 0;
        EOS_Presence_Info_Release(presence);
    }
    r->presence_left -= 1;
    maybe_done(r);
}

void EOS_CALL bare_on_mappings(const EOS_Connect_QueryExternalAccountMappingsCallbackInfo *info)
{
    auto *batch = static_cast<BareBatch *>(info->ClientData);
    EOS_HConnect connect = EOS_Platform_GetConnectInterface(g_bare);
    for (int j = batch->first; j < batch->first + batch->count; ++j) {
        EOS_Connect_GetExternalAccountMappingsOptions o;
        std::memset(&o, 0, sizeof o);
        o.ApiVersion = 1;
        o.LocalUserId = g_me_product;
        o.AccountIdType = EOS_EExternalAccountType::EOS_EAT_EPIC;
        o.TargetExternalUserId = batch->request->ids[static_cast<size_t>(j)];
        EOS_ProductUserId product = EOS_Connect_GetExternalAccountMapping(connect, &o);
        char text[33];
        int32_t length = sizeof text;
        if (product && EOS_ProductUserId_ToString(product, text, &length) == EOS_EResult::EOS_Success)
            g_sink += text[0];
    }
    batch->request->batches_left -= 1;
    maybe_done(batch->request);
}

void EOS_CALL bare_on_friends(const EOS_Friends_QueryFriendsCallbackInfo *info)
{
    auto *r = static_cast<BareRequest *>(info->ClientData);
    EOS_HFriends friends = EOS_Platform_GetFriendsInterface(g_bare);
    EOS_HUserInfo user_info = EOS_Platform_GetUserInfoInterface(g_bare);
    EOS_HPresence presence = EOS_Platform_GetPresenceInterface(g_bare);
    EOS_Friends_GetFriendsCountOptions count_options;
    std::memset(&count_options, 0, sizeof count_options);
    count_options.ApiVersion = 1;
    count_options.LocalUserId = g_me;
    int n = EOS_Friends_GetFriendsCount(friends, &count_options);
    r->texts.assign(static_cast<size_t>(n), std::string());
    r->ids.clear();
    for (int i = 0; i < n; ++i) {
        EOS_Friends_GetFriendAtIndexOptions at;
        std::memset(&at, 0, sizeof at);
        at.ApiVersion = 1;
        at.LocalUserId = g_me;
        at.Index = i;
        EOS_EpicAccountId id = EOS_Friends_GetFriendAtIndex(friends, &at);
        if (!EOS_EpicAccountId_IsValid(id))
            continue;
        char text[33];
        int32_t length = sizeof text;
        EOS_EpicAccountId_ToString(id, text, &length);
        r->texts[static_cast<size_t>(i)] = text;
        r->ids.push_back(r->texts[static_cast<size_t>(i)].c_str());
        EOS_UserInfo_QueryUserInfoOptions u;
        std::memset(&u, 0, sizeof u);
        u.ApiVersion = 1;
        u.LocalUserId = g_me;
        u.TargetUserId = id;
        r->user_info_left += 1;
        EOS_UserInfo_QueryUserInfo(user_info, &u, r, bare_on_user_info);
        EOS_Presence_QueryPresenceOptions p;
        std::memset(&p, 0, sizeof p);
        p.ApiVersion = 1;
        p.LocalUserId = g_me;
        p.TargetUserId = id;
        r->presence_left += 1;
        EOS_Presence_QueryPresence(presence, &p, r, bare_on_presence);
    }
    int valid = static_cast<int>(r->ids.size());
    int batches = valid == 0 ? 1 : (valid + kBatch - 1) / kBatch;
    r->batches_left = batches;
    for (int b = 0; b < batches; ++b) {
        BareBatch &batch = g_batches[b];
        batch.request = r;
        batch.first = b * kBatch;
        batch.count = valid - batch.first < kBatch ? valid - batch.first : kBatch;
        EOS_Connect_QueryExternalAccountMappingsOptions m;
        std::memset(&m, 0, sizeof m);
        m.ApiVersion = 1;
        m.LocalUserId = g_me_product;
        m.AccountIdType = EOS_EExternalAccountType::EOS_EAT_EPIC;
        m.ExternalAccountIds = valid ? r->ids.data() + batch.first : nullptr;
        m.ExternalAccountIdCount = static_cast<uint32_t>(batch.count);
        EOS_Connect_QueryExternalAccountMappings(EOS_Platform_GetConnectInterface(g_bare), &m, &batch, bare_on_mappings);
    }
}

// ---------------------------------------------------------------------------

// Thread CPU time: the machine's other work does not count.
struct Clock {
    using time_point = std::chrono::duration<double>;
    static time_point now()
    {
        timespec t;
        clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t);
        return time_point(static_cast<double>(t.tv_sec) + static_cast<double>(t.tv_nsec) * 1e-9);
    }
};

// One request through the library: list query, fan-out, then every completion in one tick.
void library_request()
{
    g_query_friends(g_on_friends->vm);
    eos_sim::release_all();
    g_update();
    eos_sim::release_all();
    g_update();
}

void bare_request(BareRequest &r)
{
    EOS_Friends_QueryFriendsOptions o;
    std::memset(&o, 0, sizeof o);
    o.ApiVersion = 1;
    o.LocalUserId = g_me;
    EOS_Friends_QueryFriends(EOS_Platform_GetFriendsInterface(g_bare), &o, &r, bare_on_friends);
    eos_sim::release_all();
    EOS_Platform_Tick(g_bare);
    eos_sim::release_all();
    EOS_Platform_Tick(g_bare);
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

void BM_FriendList(benchmark::State &state)
{
    set_up();
    const int n = static_cast<int>(state.range(0));
    use_friends(n);
    eos_sim::hold(true);
    double total = 0, sim = 0, vm = 0;
    bool bare_first = false;
    for (auto _ : state) {
        size_t delivered = g_on_friends->count();
        BareRequest bare;
        double library_seconds = 0;
        // The two runs take turns going first, so that neither always meets
        // the heap and caches the other left behind.
        bare_first = !bare_first;
        for (int run = 0; run < 2; ++run) {
            hlrt::collect();
            Clock::time_point t0 = Clock::now();
            if ((run == 0) == bare_first) {
                bare_request(bare);
                sim += (Clock::now() - t0).count();
            } else {
                library_request();
                library_seconds = (Clock::now() - t0).count();
            }
        }
        if (g_on_friends->count() != delivered + 1 || !bare.done) {
            state.SkipWithError("a request was not delivered in one tick");
            break;
        }
        total += library_seconds;
        state.SetIterationTime(library_seconds);
        g_on_friends->calls.clear();
        hlrt::collect();
        Clock::time_point t3 = Clock::now();
        vm_values(n);
        vm += (Clock::now() - t3).count();
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
BENCHMARK(BM_FriendList)->Arg(10)->Arg(100)->Arg(1000)->Arg(5000)->UseManualTime()->Unit(benchmark::kMicrosecond);

}  // namespace

BENCHMARK_MAIN();
