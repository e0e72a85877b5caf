// Core machinery of the simulator: recorded calls, faults, injected failures, the completion
// queue and its tick, subscriptions, tracked copies, and the controls over all of these.
#include <algorithm>
#include <chrono>
#include <random>

#include "sim_internal.h"

namespace eos_sim::sim {

namespace {

constexpr uint64_t kIfaceMagic = 0x45534f5346414345ull;   // "ESOSFACE"

struct Job {
    uint64_t id = 0;
    Platform* platform = nullptr;
    std::string function;
    void* client_data = nullptr;
    int delay = 0;
    std::function<void()> run;
};

struct Rule {
    std::string function;
    Failure failure;
};

struct CopyRec {
    std::string kind;
    Platform* platform = nullptr;
    void* holder = nullptr;
    std::function<void()> destroy;
};

struct Core {
    // records
    bool recording = true;
    std::vector<Call> calls;
    uint64_t next_seq = 1;
    std::unordered_map<std::string, int> call_counts;
    std::vector<std::string> faults;
    std::vector<Rule> rules;
    // completions
    std::deque<Job> ready;                     // delivered by the coming ticks, in this order
    std::deque<Job> held;                      // waiting for release()
    bool hold = false;
    uint64_t next_job = 1;
    uint64_t ticks = 0;
    bool ticking = false;
    // platforms
    std::vector<std::unique_ptr<Platform>> platforms;
    std::unordered_map<const void*, InterfaceObj*> ifaces;
    uint64_t next_platform = 1;
    Lifecycle life;
    // subscriptions
    std::vector<Sub> subs;
    uint64_t next_sub = 1;
    // copies
    std::unordered_map<const void*, CopyRec> copies;
    std::unordered_set<const void*> released;
};

Core& core() {
    static Core* c = new Core;   // never destroyed: handles stay checkable until the process ends
    return *c;
}

Call* call_at(size_t index) {
    auto& c = core();
    if (index == kNoCall || index >= c.calls.size()) return nullptr;
    return &c.calls[index];
}

bool is_platform(const void* p) {
    for (auto& plat : core().platforms)
        if (plat.get() == p) return true;
    return false;
}

}  // namespace

// ---- platforms ------------------------------------------------------------------------------

const char* iface_name(Iface kind) {
    switch (kind) {
        case Iface::Auth: return "Auth";
        case Iface::Connect: return "Connect";
        case Iface::UserInfo: return "UserInfo";
        case Iface::Lobby: return "Lobby";
        case Iface::Friends: return "Friends";
        case Iface::Presence: return "Presence";
        case Iface::UI: return "UI";
        case Iface::Achievements: return "Achievements";
        case Iface::Ecom: return "Ecom";
        default: return "?";
    }
}

Lifecycle& lifecycle() { return core().life; }

Platform* new_platform() {
    auto& c = core();
    auto p = std::make_unique<Platform>();
    p->serial = c.next_platform++;
    for (int i = 0; i < static_cast<int>(Iface::Count); ++i) {
        p->ifaces[i].magic = kIfaceMagic;
        p->ifaces[i].kind = static_cast<Iface>(i);
        p->ifaces[i].platform = p.get();
        c.ifaces[&p->ifaces[i]] = &p->ifaces[i];
    }
    c.platforms.push_back(std::move(p));
    return c.platforms.back().get();
}

std::vector<Platform*> live_platform_list() {
    std::vector<Platform*> out;
    for (auto& p : core().platforms)
        if (!p->released) out.push_back(p.get());
    return out;
}

EOS_HPlatform handle_of(Platform* p) { return reinterpret_cast<EOS_HPlatform>(p); }

void* iface_handle(Platform* p, Iface kind) { return &p->ifaces[static_cast<int>(kind)]; }

Platform* platform_of(EOS_HPlatform handle, const char* function) {
    if (handle == nullptr) {
        fault(std::string(function) + ": null platform handle");
        return nullptr;
    }
    if (!is_platform(handle)) {
        fault(std::string(function) + ": unknown platform handle");
        return nullptr;
    }
    auto* p = reinterpret_cast<Platform*>(handle);
    if (p->released) {
        fault(std::string(function) + ": platform used after EOS_Platform_Release");
        return nullptr;
    }
    if (core().life.shut_down) {
        fault(std::string(function) + ": called after EOS_Shutdown");
        return nullptr;
    }
    return p;
}

void drop_platform_work(Platform* p) {
    auto& c = core();
    auto gone = [p](const Job& j) { return j.platform == p; };
    c.ready.erase(std::remove_if(c.ready.begin(), c.ready.end(), gone), c.ready.end());
    c.held.erase(std::remove_if(c.held.begin(), c.held.end(), gone), c.held.end());
    c.subs.erase(std::remove_if(c.subs.begin(), c.subs.end(), [p](const Sub& s) { return s.platform == p; }),
                 c.subs.end());
}

bool ticking() { return core().ticking; }

void run_tick(Platform* p) {
    auto& c = core();
    c.ticking = true;
    ++c.ticks;
    script_on_tick(p);
    // Only what was ready when the tick began runs now; jobs queued meanwhile wait for a later tick.
    std::deque<Job> batch;
    batch.swap(c.ready);
    std::deque<Job> kept;
    while (!batch.empty()) {
        Job job = std::move(batch.front());
        batch.pop_front();
        if (job.platform != p) {
            kept.push_back(std::move(job));
        } else if (job.platform->released) {
            // released during this tick: its work is dropped
        } else if (job.delay > 0) {
            --job.delay;
            kept.push_back(std::move(job));
        } else {
            job.run();
        }
    }
    // Kept jobs stay ahead of everything queued during this tick.
    while (!c.ready.empty()) {
        kept.push_back(std::move(c.ready.front()));
        c.ready.pop_front();
    }
    c.ready.swap(kept);
    c.ticking = false;
}

uint64_t queue_job(Platform* platform, const std::string& function, void* client_data,
                   std::function<void()> run, bool notification) {
    auto& c = core();
    Job job;
    job.id = c.next_job++;
    job.platform = platform;
    job.function = function;
    job.client_data = client_data;
    job.run = std::move(run);
    const uint64_t id = job.id;
    if (c.hold && !notification)
        c.held.push_back(std::move(job));
    else
        c.ready.push_back(std::move(job));
    return id;
}

// A script runner replaces this with its own definition.
__attribute__((weak)) void script_on_tick(Platform*) {}

// ---- records --------------------------------------------------------------------------------

// The records outlive the requests they name. Their ClientData is kept disguised, so that a leak
// checker scanning the records does not take them for references to the caller's blocks.
static void* disguised(void* client_data) {
    return reinterpret_cast<void*>(reinterpret_cast<uintptr_t>(client_data) ^ uintptr_t{0xA5A5A5A5A5A5A5A5u});
}

size_t record_call(const char* function, json options, void* client_data) {
    auto& c = core();
    if (!c.recording) return kNoCall;
    Call call;
    call.seq = c.next_seq++;
    call.function = function;
    call.options = std::move(options);
    call.client_data = disguised(client_data);
    call.output = json::object();
    c.calls.push_back(std::move(call));
    return c.calls.size() - 1;
}

void set_options(size_t index, json options) {
    if (auto* call = call_at(index)) call->options = std::move(options);
}

void record_result(size_t index, EOS_EResult result) {
    if (auto* call = call_at(index)) call->result = result;
}

void record_delivery(size_t index, EOS_EResult result, bool final_result) {
    if (auto* call = call_at(index)) {
        call->deliveries.push_back(result);
        if (final_result) call->result = result;
    }
}

void record_output(size_t index, const json& output) {
    auto* call = call_at(index);
    if (!call || !output.is_object()) return;
    for (auto it = output.begin(); it != output.end(); ++it) call->output[it.key()] = it.value();
}

void fault(const std::string& text) {
    core().faults.push_back(text);
    log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Error, "Simulator fault: " + text);
}

std::optional<Injected> take_injected(const std::string& function, int call_number) {
    for (auto& rule : core().rules) {
        Failure& f = rule.failure;
        if (rule.function != function || f.times == 0) continue;
        if (f.nth_call != 0 && f.nth_call != call_number) continue;
        if (f.times > 0) --f.times;
        return Injected{f.code, f.retry_first};
    }
    return std::nullopt;
}

// ---- Op -------------------------------------------------------------------------------------

// ---- self-timing ----------------------------------------------------------------------------

namespace {

using SteadyClock = std::chrono::steady_clock;

// Per thread: the log callback may run on the SDK's own threads.
struct SelfClock {
    bool on = false;
    int depth = 0;                             // nested EOS_* calls since the last client callback
    SteadyClock::time_point since;
    SelfTime measured;
};

thread_local SelfClock t_self;

void self_start() {
    t_self.since = SteadyClock::now();
    ++t_self.measured.entries;
}

void self_stop() { t_self.measured.inside += SteadyClock::now() - t_self.since; }

}  // namespace

SelfTimer::SelfTimer() {
    if (t_self.depth++ == 0 && t_self.on) self_start();
}

SelfTimer::~SelfTimer() {
    if (--t_self.depth == 0 && t_self.on) self_stop();
}

ClientCall::ClientCall() : depth_(t_self.depth) {
    if (depth_ > 0 && t_self.on) self_stop();
    t_self.depth = 0;
}

ClientCall::~ClientCall() {
    t_self.depth = depth_;
    if (depth_ > 0 && t_self.on) self_start();
}

Op::Op(const char* function, const void* iface_handle, Iface kind, void* client_data)
    : function_(function), client_data_(client_data), needs_platform_(true) {
    auto& c = core();
    index_ = record_call(function, nullptr, client_data);
    call_number_ = ++c.call_counts[function];
    const std::string fn(function);
    if (iface_handle == nullptr) {
        fault(fn + ": null " + iface_name(kind) + " interface handle");
        return;
    }
    auto it = c.ifaces.find(iface_handle);
    if (it == c.ifaces.end()) {
        fault(fn + ": unknown " + iface_name(kind) + " interface handle");
        return;
    }
    InterfaceObj* obj = it->second;
    if (obj->kind != kind) {
        fault(fn + ": " + iface_name(obj->kind) + " interface handle passed where " + iface_name(kind) +
              " is expected");
        return;
    }
    if (obj->platform->released) {
        fault(fn + ": interface of a released platform used");
        return;
    }
    if (c.life.shut_down) {
        fault(fn + ": called after EOS_Shutdown");
        return;
    }
    platform_ = obj->platform;
}

Op::Op(const char* function, void* client_data) : function_(function), client_data_(client_data) {
    index_ = record_call(function, nullptr, client_data);
    call_number_ = ++core().call_counts[function];
}

void Op::options(json o) { set_options(index_, std::move(o)); }

void Op::output(const json& o) { record_output(index_, o); }

std::optional<Injected> Op::injected() { return take_injected(function_, call_number_); }

EOS_EResult Op::ret(EOS_EResult r) {
    record_result(index_, r);
    return r;
}

EOS_EResult Op::invalid(EOS_ELogCategory cat, const std::string& what, EOS_EResult code) {
    log(cat, EOS_ELogLevel::EOS_LOG_Error,
        std::string(function_) + ": " +
            (code == EOS_EResult::EOS_IncompatibleVersion ? "Incompatible ApiVersion " : "Invalid parameter ") +
            what);
    return code;
}

bool version_ok(int32_t version, int32_t latest, std::initializer_list<int32_t> older) {
    if (version == latest) return true;
    return std::find(older.begin(), older.end(), version) != older.end();
}

// ---- Keep -----------------------------------------------------------------------------------

const char* Keep::str(const char* field, const std::string& s) {
    strings.push_back(s);
    out[field] = s;
    return strings.back().c_str();
}

const char* Keep::str(const char* field, const char* s) {
    if (s == nullptr) {
        out[field] = nullptr;
        return nullptr;
    }
    return str(field, std::string(s));
}

EOS_EpicAccountId Keep::id(const char* field, EOS_EpicAccountId h) {
    out[field] = id_json(h);
    return h;
}

EOS_ProductUserId Keep::id(const char* field, EOS_ProductUserId h) {
    out[field] = id_json(h);
    return h;
}

// ---- subscriptions --------------------------------------------------------------------------

EOS_NotificationId add_subscription(Op& op, const std::string& kind, void* client_data, void* fn) {
    if (!op.ok()) return EOS_INVALID_NOTIFICATIONID;
    if (fn == nullptr) {
        op.invalid(EOS_ELogCategory::EOS_LC_Core, "NotificationFn: null");
        op.ret(EOS_EResult::EOS_InvalidParameters);
        return EOS_INVALID_NOTIFICATIONID;
    }
    if (auto inj = op.injected()) {
        op.ret(inj->code);
        op.output({{"NotificationId", 0}});
        return EOS_INVALID_NOTIFICATIONID;
    }
    auto& c = core();
    Sub sub;
    sub.id = c.next_sub++;
    sub.kind = kind;
    sub.platform = op.platform();
    sub.client_data = client_data;
    sub.fn = fn;
    c.subs.push_back(sub);
    op.ret(EOS_EResult::EOS_Success);
    op.output({{"NotificationId", sub.id}});
    return sub.id;
}

void remove_subscription(Op& op, const std::string& kind, EOS_NotificationId id) {
    op.options({{"InId", id}});
    if (!op.ok()) return;
    auto& c = core();
    for (auto it = c.subs.begin(); it != c.subs.end(); ++it) {
        if (it->id == id && it->kind == kind && it->platform == op.platform()) {
            c.subs.erase(it);
            op.ret(EOS_EResult::EOS_Success);
            return;
        }
    }
    // Removing an id that is not live is harmless in the SDK; it only shows in the record.
    op.ret(EOS_EResult::EOS_NotFound);
}

void notify(const std::string& kind, std::function<void(const Sub&)> deliver) {
    for (Platform* p : live_platform_list()) {
        queue_job(
            p, "notify:" + kind, nullptr,
            [p, kind, deliver]() {
                std::vector<uint64_t> ids;
                for (auto& s : core().subs)
                    if (s.kind == kind && s.platform == p) ids.push_back(s.id);
                for (uint64_t id : ids) {
                    // A handler may have removed later subscriptions meanwhile.
                    const auto& subs = core().subs;
                    auto it = std::find_if(subs.begin(), subs.end(), [id](const Sub& s) { return s.id == id; });
                    if (it == subs.end()) continue;
                    Sub copy = *it;
                    deliver(copy);
                }
            },
            true);
    }
}

// ---- tracked copies -------------------------------------------------------------------------

void track_copy(const std::string& kind, Platform* platform, void* ptr, void* holder,
                std::function<void()> destroy) {
    auto& c = core();
    c.released.erase(ptr);
    c.copies[ptr] = CopyRec{kind, platform, holder, std::move(destroy)};
}

void release_copy(const char* function, const std::string& kind, void* ptr) {
    if (ptr == nullptr) return;
    auto& c = core();
    auto it = c.copies.find(ptr);
    if (it == c.copies.end()) {
        fault(std::string(function) + (c.released.count(ptr) ? ": released twice" : ": unknown pointer"));
        return;
    }
    if (it->second.kind != kind) {
        fault(std::string(function) + ": given a " + it->second.kind + " instead of a " + kind);
        return;
    }
    auto destroy = std::move(it->second.destroy);
    c.copies.erase(it);
    c.released.insert(ptr);
    if (destroy) destroy();
}

void* lookup_handle(const char* function, const std::string& kind, const void* ptr) {
    if (ptr == nullptr) return nullptr;
    auto& c = core();
    auto it = c.copies.find(ptr);
    if (it == c.copies.end()) {
        fault(std::string(function) + (c.released.count(ptr) ? ": " + kind + " used after its release"
                                                              : ": unknown " + kind));
        return nullptr;
    }
    if (it->second.kind != kind) {
        fault(std::string(function) + ": given a " + it->second.kind + " instead of a " + kind);
        return nullptr;
    }
    if (it->second.platform && it->second.platform->released) {
        fault(std::string(function) + ": " + kind + " of a released platform used");
        return nullptr;
    }
    return it->second.holder;
}

void free_all_copies() {
    auto& c = core();
    auto copies = std::move(c.copies);
    c.copies.clear();
    for (auto& [ptr, rec] : copies)
        if (rec.destroy) rec.destroy();
    c.released.clear();
}

// ---- reset ----------------------------------------------------------------------------------

void reset_core() {
    auto& c = core();
    c.recording = true;
    c.calls.clear();
    c.next_seq = 1;
    c.call_counts.clear();
    c.faults.clear();
    c.rules.clear();
    c.ready.clear();
    c.held.clear();
    c.hold = false;
    c.ticks = 0;
    c.subs.clear();
    free_all_copies();
    // Platforms go last: nothing above refers to them any more. Their addresses become unknown
    // handles, so later use of an old handle is still reported.
    c.ifaces.clear();
    c.platforms.clear();
    c.life = Lifecycle{};
}

}  // namespace eos_sim::sim

// =============================================================================================
// Controls (eos_sim.h)
// =============================================================================================

namespace eos_sim {

using namespace sim;

Failure Failure::once(EOS_EResult code) { return repeated(code, 1); }

Failure Failure::repeated(EOS_EResult code, int times) {
    Failure f;
    f.code = code;
    f.times = times;
    return f;
}

Failure Failure::always(EOS_EResult code) { return repeated(code, -1); }

Failure Failure::retry(int times) {
    Failure f;
    f.code = EOS_EResult::EOS_Success;
    f.times = times;
    f.retry_first = true;
    return f;
}

Failure& Failure::on_call(int k) {
    nth_call = k;
    return *this;
}

void set_recording(bool on) { core().recording = on; }

void set_self_timing(bool on) {
    t_self.on = on;
    t_self.measured = SelfTime{};
    if (on && t_self.depth > 0) self_start();
}

SelfTime self_time() { return t_self.measured; }

std::chrono::nanoseconds self_timing_clock_cost() {
    static const std::chrono::nanoseconds cost = [] {
        // The cheapest of several runs: the reading itself, not the machine's interruptions.
        constexpr int kReads = 20000;
        auto best = std::chrono::nanoseconds::max();
        for (int run = 0; run < 5; ++run) {
            auto t0 = SteadyClock::now();
            SteadyClock::time_point last;
            for (int i = 0; i < kReads; ++i) last = SteadyClock::now();
            auto spent = std::chrono::duration_cast<std::chrono::nanoseconds>(last - t0) / kReads;
            best = std::min(best, spent);
        }
        return best;
    }();
    return cost;
}

void hold(bool on) {
    core().hold = on;
    if (!on) release_all();
}

std::vector<Pending> pending() {
    std::vector<Pending> out;
    auto add = [&out](const Job& j, bool held) {
        out.push_back(Pending{j.id, j.function, j.client_data, j.delay, held});
    };
    for (auto& j : core().ready)
        if (j.function.rfind("notify:", 0) != 0) add(j, false);
    for (auto& j : core().held) add(j, true);
    return out;
}

bool release(uint64_t id) {
    auto& c = core();
    for (auto it = c.held.begin(); it != c.held.end(); ++it) {
        if (it->id == id) {
            c.ready.push_back(std::move(*it));
            c.held.erase(it);
            return true;
        }
    }
    return false;
}

void release_all() {
    auto& c = core();
    while (!c.held.empty()) {
        c.ready.push_back(std::move(c.held.front()));
        c.held.pop_front();
    }
}

void release_in_order(const std::vector<uint64_t>& ids) {
    for (uint64_t id : ids) release(id);
}

void release_shuffled(uint32_t seed) {
    std::vector<uint64_t> ids;
    for (auto& j : core().held) ids.push_back(j.id);
    std::mt19937 rng(seed);
    std::shuffle(ids.begin(), ids.end(), rng);
    release_in_order(ids);
}

bool delay(uint64_t id, int ticks) {
    auto& c = core();
    for (auto* q : {&c.ready, &c.held})
        for (auto& j : *q)
            if (j.id == id) {
                j.delay = ticks;
                return true;
            }
    return false;
}

uint64_t ticks() { return core().ticks; }

void inject(const std::string& function, const Failure& failure) { core().rules.push_back({function, failure}); }

void clear_injections() { core().rules.clear(); }

std::vector<Call> calls(const std::string& function) {
    std::vector<Call> out;
    for (auto& c : core().calls)
        if (function.empty() || c.function == function) {
            out.push_back(c);
            out.back().client_data = disguised(c.client_data);
        }
    return out;
}

void clear_calls() { core().calls.clear(); }

std::vector<std::string> faults() { return core().faults; }

void clear_faults() { core().faults.clear(); }

std::map<std::string, int> outstanding_copies() {
    std::map<std::string, int> out;
    for (auto& [ptr, rec] : core().copies) ++out[rec.kind];
    return out;
}

int outstanding_copies(const std::string& kind) {
    int n = 0;
    for (auto& [ptr, rec] : core().copies)
        if (rec.kind == kind) ++n;
    return n;
}

int outstanding_total() { return static_cast<int>(core().copies.size()); }

std::vector<Subscription> subscriptions(const std::string& kind) {
    std::vector<Subscription> out;
    for (auto& s : core().subs)
        if (kind.empty() || s.kind == kind) out.push_back(Subscription{s.id, s.kind, s.client_data});
    return out;
}

bool initialized() { return core().life.initialized && !core().life.shut_down; }

int live_platforms() { return static_cast<int>(live_platform_list().size()); }

void reset() {
    reset_core();
    reset_platforms();
    reset_world();
}

}  // namespace eos_sim
