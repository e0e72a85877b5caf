/*
 * Shared machinery of the EOS SDK simulator. Every interface file (auth.cpp, lobby.cpp, ...)
 * builds on this:
 *
 *   Op          one EOS_* call: records it, validates the interface handle, finds injected failures
 *   start_async queues a completion (never run inside the starting call, only in EOS_Platform_Tick)
 *   notify      queues a notification for every live subscription of a kind
 *   track_copy  registers a Copy* result / handle so that its Release can be checked and counted
 *   ids         interned EOS_EpicAccountId / EOS_ProductUserId handles
 *   world       accounts, lobbies, invitations and the sessions (who is signed in)
 *
 * The simulator is single-threaded like the SDK it stands in for: only the log callback state is
 * locked, because log lines may be emitted from another thread.
 */
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "eos_sim.h"

namespace eos_sim::sim {

using json = nlohmann::json;

// ---- platforms and interface handles --------------------------------------------------------

enum class Iface { Auth, Connect, UserInfo, Lobby, Friends, Presence, UI, Achievements, Ecom, Count };
const char* iface_name(Iface kind);

struct Platform;

// What an interface handle (EOS_HAuth, EOS_HLobby, ...) points at.
struct InterfaceObj {
    uint64_t magic = 0;
    Iface kind = Iface::Auth;
    Platform* platform = nullptr;
};

struct Platform {
    uint64_t serial = 0;
    bool released = false;
    json options;                              // the recorded EOS_Platform_Options
    std::string product_id;                    // for presence's kThisProduct
    std::string client_id;
    InterfaceObj ifaces[static_cast<int>(Iface::Count)];
};

// The live platform behind a handle, or null (a fault is recorded for garbage/released handles).
Platform* platform_of(EOS_HPlatform handle, const char* function);
Platform* new_platform();                      // registered; its interface handles are valid at once
std::vector<Platform*> live_platform_list();   // created and not released, in creation order
EOS_HPlatform handle_of(Platform* p);
void* iface_handle(Platform* p, Iface kind);   // what EOS_Platform_Get<Kind>Interface returns
void drop_platform_work(Platform* p);          // forget its queued jobs and subscriptions (on release)
bool ticking();                                // inside EOS_Platform_Tick
void run_tick(Platform* p);                    // delivers the jobs that are due for this platform

// SDK lifecycle (EOS_Initialize / EOS_Shutdown).
struct Lifecycle {
    bool initialized = false;                  // EOS_Initialize succeeded
    bool shut_down = false;                    // EOS_Shutdown succeeded afterwards
};
Lifecycle& lifecycle();

// ---- recorded calls and faults --------------------------------------------------------------

constexpr size_t kNoCall = static_cast<size_t>(-1);

size_t record_call(const char* function, json options, void* client_data);  // kNoCall when recording is off
void set_options(size_t call, json options);
void record_result(size_t call, EOS_EResult result);                       // sync result
void record_delivery(size_t call, EOS_EResult result, bool final_result);  // one completion delivered
void record_output(size_t call, const json& output);                       // merged into Call::output
void fault(const std::string& text);                                       // misuse: tests assert none

// ---- injected failures ----------------------------------------------------------------------

struct Injected {
    EOS_EResult code;
    bool retry_first;
};
// The failure injected for this call of `function` (the call_number-th), consumed; none if no rule applies.
std::optional<Injected> take_injected(const std::string& function, int call_number);

// ---- one EOS_* call -------------------------------------------------------------------------

// Records the call on construction. For interface functions it resolves the handle: ok() is false
// (and a fault is recorded) for a null, unknown or released handle, and the function must then
// return harmlessly without touching anything else.
// Marks the simulator's own time for self-timing: an Op holds one for the whole EOS_* call, and
// a ClientCall pauses it while a client callback runs.
class SelfTimer {
public:
    SelfTimer();
    ~SelfTimer();
    SelfTimer(const SelfTimer&) = delete;
    SelfTimer& operator=(const SelfTimer&) = delete;
};

class ClientCall {
public:
    ClientCall();
    ~ClientCall();
    ClientCall(const ClientCall&) = delete;
    ClientCall& operator=(const ClientCall&) = delete;

private:
    int depth_;
};

class Op {
public:
    Op(const char* function, const void* iface_handle, Iface kind, void* client_data = nullptr);
    explicit Op(const char* function, void* client_data = nullptr);   // no interface handle

    bool ok() const { return platform_ != nullptr || !needs_platform_; }
    Platform* platform() const { return platform_; }
    const char* function() const { return function_; }
    size_t index() const { return index_; }
    void* client_data() const { return client_data_; }

    void options(json o);                      // the recorded options record
    void output(const json& o);                // merged into the recorded output
    std::optional<Injected> injected();        // consumes a matching injected failure
    EOS_EResult ret(EOS_EResult r);            // records a sync result and returns it

    // Logs an Error line "Invalid parameter <what>" (category `cat`) and returns `code`.
    EOS_EResult invalid(EOS_ELogCategory cat, const std::string& what,
                        EOS_EResult code = EOS_EResult::EOS_InvalidParameters);

private:
    SelfTimer timer_;                          // first member: covers the whole call
    const char* function_;
    size_t index_;
    void* client_data_;
    Platform* platform_ = nullptr;
    bool needs_platform_ = false;
    int call_number_ = 0;
};

// ApiVersion rule: `latest` (the 1.16.1 value) or one of the older versions the SDK still accepts.
bool version_ok(int32_t version, int32_t latest, std::initializer_list<int32_t> older = {});

// ---- completions ----------------------------------------------------------------------------

// Keeps what a callback-info record points at alive during the callback, and collects the
// fields for the recorded output.
struct Keep {
    json out = json::object();
    std::deque<std::string> strings;
    const char* str(const char* field, const std::string& s);          // kept copy, recorded
    const char* str(const char* field, const char* s);                 // null stays null
    EOS_EpicAccountId id(const char* field, EOS_EpicAccountId h);      // recorded as text
    EOS_ProductUserId id(const char* field, EOS_ProductUserId h);
};

// Queues a job for `platform`; it runs inside a later EOS_Platform_Tick of that platform.
// Returns the completion id. `notification` jobs are never held.
uint64_t queue_job(Platform* platform, const std::string& function, void* client_data,
                   std::function<void()> run, bool notification = false);

// Queues the completion of an async call. `pre` is the result of the call-time checks: anything
// but EOS_Success fails the request without running `work`. Otherwise an injected failure may
// replace the outcome. At delivery, `work` does the request's effect on the world and fills the
// record (returning the ResultCode); on a failure `on_failure` (optional) fills the record's other
// fields. ResultCode and ClientData are set here. A null callback is a fault.
template <class Info, class Callback>
void start_async(Op& op, Callback callback, EOS_EResult pre,
                 std::function<EOS_EResult(Info&, Keep&)> work,
                 std::function<void(Info&, Keep&)> on_failure = {});

// ---- notifications --------------------------------------------------------------------------

struct Sub {
    uint64_t id = 0;
    std::string kind;
    Platform* platform = nullptr;
    void* client_data = nullptr;
    void* fn = nullptr;                        // the NotificationFn, cast back by the deliverer
};

// Registers a subscription; returns its id, or 0 when the call fails (bad options, injected failure).
EOS_NotificationId add_subscription(Op& op, const std::string& kind, void* client_data, void* fn);
void remove_subscription(Op& op, const std::string& kind, EOS_NotificationId id);
// Queues a notification on every live platform; inside Tick, `deliver` is called for every
// subscription of `kind` still live at that moment.
void notify(const std::string& kind, std::function<void(const Sub&)> deliver);

// ---- tracked copies and handles -------------------------------------------------------------

// Registers `ptr` (what the caller receives) as an outstanding copy of `kind`; `destroy` frees it.
void track_copy(const std::string& kind, Platform* platform, void* ptr, void* holder,
                std::function<void()> destroy);
// For a Release function: frees a tracked copy of `kind`. Null is accepted silently. Unknown,
// already released or wrong-kind pointers are recorded as faults and left alone.
void release_copy(const char* function, const std::string& kind, void* ptr);
// The holder of a live tracked handle of `kind` (lobby details, modification), or null after
// recording a fault (null, unknown, released, or its platform released).
void* lookup_handle(const char* function, const std::string& kind, const void* ptr);
void free_all_copies();

// ---- ids ------------------------------------------------------------------------------------

EOS_EpicAccountId intern_epic(const std::string& text);          // same text, same pointer, forever
EOS_ProductUserId intern_product(const std::string& text);
enum class IdState { Null, Ok, Garbage };
IdState epic_text(EOS_EpicAccountId id, std::string* text);      // Garbage: not a handle we made
IdState product_text(EOS_ProductUserId id, std::string* text);
json id_json(EOS_EpicAccountId id);           // text, null, or "<invalid handle>"
json id_json(EOS_ProductUserId id);
json str_json(const char* s);                 // string or null

// ---- logging --------------------------------------------------------------------------------

void log(EOS_ELogCategory category, EOS_ELogLevel level, const std::string& message);

// ---- world and sessions ---------------------------------------------------------------------

// Query caches and overrides of the Friends, Presence and Achievements services (friends.cpp,
// presence.cpp, achievements.cpp). Part of the sessions, so set_world() and reset() forget them.
struct ServiceState {
    std::map<std::string, std::vector<FriendEntry>> friends;        // local account -> cached friend list
    std::map<std::string, std::map<std::string, std::optional<Presence>>> presence;  // local -> target -> cached
    std::map<std::string, std::vector<Achievement>> achievements;   // target account -> cached achievements
    std::optional<int32_t> forced_friends_count;                    // force_friends_count()
    std::optional<uint32_t> forced_achievement_count;               // force_achievement_count()
};

struct Sessions {
    std::map<std::string, std::string> token_owner;                // access token -> account
    std::map<std::string, std::string> auth_token;                 // account -> its current token
    std::set<std::string> auth;                                    // accounts signed in to Auth
    std::set<std::string> connect;                                 // accounts signed in to Connect
    std::map<std::string, std::set<std::string>> user_info;        // local account -> cached targets
    std::map<std::string, std::set<std::string>> mappings;         // local account -> targets with a cached mapping
    std::map<uint64_t, std::string> ui_events;                     // UiEventId -> lobby id
    std::map<const void*, std::string> continuance;                // ContinuanceToken -> account
    std::vector<std::unique_ptr<int>> continuance_objs;            // what the tokens point at
    std::string login_account;                                     // override for non-Developer logins
    uint64_t next_token = 1;
    uint64_t next_ui_event = 1;
    ServiceState services;                                         // see ServiceState
    std::shared_ptr<struct ScriptProgress> script;                 // the script's progress (script.cpp)
};

World& world();                                // the live world (derived ids filled in)
Sessions& sessions();
void reindex_world();                          // after accounts change
Account* account_by_name(const std::string& name);
Account* account_by_epic(const std::string& epic_text);
Account* account_by_product(const std::string& puid_text);
Account* local_account();                      // world().local_account, or null
Lobby* lobby_by_id(const std::string& id);
Invitation* invitation_by_id(const std::string& id);
std::string new_lobby_id();
std::string new_invite_id();
int lobbies_of(const std::string& account);    // lobbies the account is a member of
bool is_member(const Lobby& lobby, const std::string& account);
void add_member(Lobby& lobby, const std::string& account);
// Removes a member; the lobby passes to the next member when the owner leaves and is deleted
// (with its invitations) when it empties.
void remove_member(const std::string& lobby_id, const std::string& account);
void destroy_lobby(const std::string& lobby_id);
void reset_world();                            // default world, no sessions
std::string issue_token(Account& account);     // a new access token for the account (Auth login)

// Account for a user id handed in by the caller. Null id -> EOS_InvalidParameters; garbage
// handle -> fault + EOS_InvalidParameters; unknown or not signed in -> EOS_InvalidUser.
EOS_EResult auth_user(Op& op, EOS_EpicAccountId id, Account** out, EOS_ELogCategory cat, const char* field);
EOS_EResult connect_user(Op& op, EOS_ProductUserId id, Account** out, EOS_ELogCategory cat, const char* field);

// ---- reset hooks ----------------------------------------------------------------------------

// Called by EOS_Initialize before anything else. A world-file loader defines a strong version
// (reading EOS_SIM_WORLD); false fails EOS_Initialize. The default does nothing.
bool load_world_at_initialize();
// Called at the start of every EOS_Platform_Tick, before its completions run. A script runner
// defines a strong version; the default does nothing.
void script_on_tick(Platform* platform);
void reset_core();                             // queues, records, copies, subscriptions, injections
void reset_platforms();                        // SDK lifecycle, platforms, logging

// =============================================================================================

template <class Info, class Callback>
void start_async(Op& op, Callback callback, EOS_EResult pre,
                 std::function<EOS_EResult(Info&, Keep&)> work,
                 std::function<void(Info&, Keep&)> on_failure) {
    if (!op.ok()) return;   // dead handle: fault recorded, nothing will ever be delivered
    if (callback == nullptr) {
        fault(std::string(op.function()) + ": null completion delegate");
        return;
    }
    EOS_EResult code = pre;
    bool retry_first = false;
    if (code == EOS_EResult::EOS_Success) {
        if (auto inj = op.injected()) {
            code = inj->code;
            retry_first = inj->retry_first;
        }
    }
    const size_t call = op.index();
    void* const client_data = op.client_data();
    Platform* const platform = op.platform();
    const std::string function = op.function();

    auto final_run = [=]() {
        Info info{};
        Keep keep;
        info.ClientData = client_data;
        EOS_EResult result = code;
        if (code == EOS_EResult::EOS_Success) {
            result = work(info, keep);
        } else if (on_failure) {
            on_failure(info, keep);
        }
        info.ResultCode = result;
        record_delivery(call, result, true);
        record_output(call, keep.out);
        ClientCall client;
        callback(&info);
    };
    if (!retry_first) {
        queue_job(platform, function, client_data, final_run);
        return;
    }
    auto first_run = [=]() {
        Info info{};
        Keep keep;
        info.ClientData = client_data;
        if (on_failure) on_failure(info, keep);
        info.ResultCode = EOS_EResult::EOS_OperationWillRetry;
        record_delivery(call, EOS_EResult::EOS_OperationWillRetry, false);
        // The real outcome follows on a later tick.
        queue_job(platform, function, client_data, final_run);
        ClientCall client;
        callback(&info);
    };
    queue_job(platform, function, client_data, first_run);
}

}  // namespace eos_sim::sim
