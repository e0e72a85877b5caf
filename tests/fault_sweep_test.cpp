// A whole game session, played once cleanly and then once more for every EOS
// call it makes, with that one call failing. Each run starts from a fresh
// library in a process of its own and must end without a crash, a sanitizer
// report, an SDK copy or a collector root left behind, with the failure in
// egs.log and the game told exactly what it is told for that failure.
#include "reliability.h"

#include <algorithm>
#include <functional>
#include <map>
#include <regex>
#include <set>

using namespace tw;
using json = nlohmann::json;

namespace {

int code_of(EOS_EResult r) { return static_cast<int>(r); }

// One call the session makes: the k-th call of `function`, in a phase of the session.
struct Site {
    std::string function;
    int k = 0;
    std::string phase;
    bool async = false;
    bool fails_cleanly = false;  // a synchronous call that already fails in the clean run
};

// How one run fails its site.
struct Variant {
    enum Kind { Documented, Unexpected, NotFinalFirst } kind;
    EOS_EResult code;
};

std::string variant_name(const Variant &v)
{
    switch (v.kind) {
    case Variant::Documented: return "code " + std::to_string(code_of(v.code));
    case Variant::Unexpected: return "EOS_UnexpectedError";
    case Variant::NotFinalFirst: return "not final first";
    }
    return "?";
}

// Calls whose failure the SDK cannot report (releases, getters, the tick) are
// not failed; every other call the library makes is.
bool can_fail(const std::string &function)
{
    static const std::set<std::string> never = {
        "EOS_Platform_Tick", "EOS_Platform_Release", "EOS_Logging_SetCallback", "EOS_Logging_SetLogLevel",
        "EOS_EResult_IsOperationComplete", "EOS_EResult_ToString", "EOS_EpicAccountId_IsValid",
        "EOS_ProductUserId_IsValid", "EOS_Friends_GetFriendsCount", "EOS_Achievements_GetPlayerAchievementCount",
        "EOS_Lobby_RemoveNotifyLobbyInviteReceived", "EOS_Lobby_RemoveNotifyLobbyInviteAccepted",
        "EOS_Lobby_RemoveNotifyJoinLobbyAccepted"};
    if (never.count(function))
        return false;
    auto ends_with = [&](const std::string &tail) {
        return function.size() >= tail.size() && function.compare(function.size() - tail.size(), tail.size(), tail) == 0;
    };
    return !ends_with("_Release") && !(function.rfind("EOS_Platform_Get", 0) == 0 && ends_with("Interface"));
}

// Calls whose failure is a null handle or id, whatever the code.
bool fails_without_code(const std::string &function)
{
    static const std::set<std::string> calls = {
        "EOS_Platform_Create", "EOS_EpicAccountId_FromString", "EOS_ProductUserId_FromString",
        "EOS_Friends_GetFriendAtIndex", "EOS_Connect_GetExternalAccountMapping",
        "EOS_Lobby_AddNotifyLobbyInviteReceived", "EOS_Lobby_AddNotifyLobbyInviteAccepted",
        "EOS_Lobby_AddNotifyJoinLobbyAccepted"};
    return calls.count(function) > 0;
}

// A failure code the SDK documents for each call.
EOS_EResult documented_code(const std::string &function)
{
    static const std::map<std::string, EOS_EResult> codes = {
        {"EOS_Initialize", EOS_EResult::EOS_AlreadyConfigured},
        {"EOS_Auth_Login", EOS_EResult::EOS_InvalidCredentials},
        {"EOS_Auth_CopyUserAuthToken", EOS_EResult::EOS_NotFound},
        {"EOS_UserInfo_CopyUserInfo", EOS_EResult::EOS_NotFound},
        {"EOS_EpicAccountId_ToString", EOS_EResult::EOS_LimitExceeded},
        {"EOS_ProductUserId_ToString", EOS_EResult::EOS_LimitExceeded},
        {"EOS_Connect_GetProductUserIdMapping", EOS_EResult::EOS_NotFound},
        {"EOS_Lobby_CreateLobby", EOS_EResult::EOS_LimitExceeded},
        {"EOS_Lobby_UpdateLobby", EOS_EResult::EOS_Lobby_NotOwner},
        {"EOS_Lobby_SendInvite", EOS_EResult::EOS_NotFound},
        {"EOS_Lobby_RejectInvite", EOS_EResult::EOS_NotFound},
        {"EOS_Lobby_LeaveLobby", EOS_EResult::EOS_AlreadyPending},
        {"EOS_Lobby_DestroyLobby", EOS_EResult::EOS_NotFound},
        {"EOS_Lobby_CopyLobbyDetailsHandleByInviteId", EOS_EResult::EOS_NotFound},
        {"EOS_Lobby_CopyLobbyDetailsHandle", EOS_EResult::EOS_NotFound},
        {"EOS_LobbyDetails_CopyInfo", EOS_EResult::EOS_IncompatibleVersion},
        {"EOS_LobbyDetails_CopyAttributeByKey", EOS_EResult::EOS_NotFound},
        {"EOS_LobbyModification_AddAttribute", EOS_EResult::EOS_IncompatibleVersion},
        {"EOS_Presence_CopyPresence", EOS_EResult::EOS_NotFound},
        {"EOS_Achievements_CopyPlayerAchievementByIndex", EOS_EResult::EOS_NotFound},
        {"EOS_UI_ShowFriends", EOS_EResult::EOS_NotConfigured},
    };
    auto it = codes.find(function);
    return it == codes.end() ? EOS_EResult::EOS_InvalidParameters : it->second;
}

std::vector<Variant> variants_for(const Site &site)
{
    if (fails_without_code(site.function))
        return {{Variant::Unexpected, EOS_EResult::EOS_UnexpectedError}};
    std::vector<Variant> out = {{Variant::Documented, documented_code(site.function)},
                                {Variant::Unexpected, EOS_EResult::EOS_UnexpectedError}};
    if (site.async)
        out.push_back({Variant::NotFinalFirst, EOS_EResult::EOS_Success});
    return out;
}

// What the clean run reached and what it told the game.
struct Clean {
    std::vector<Site> sites;
    Told told;
    std::vector<std::string> lines;
};

// ---- what each failure must lead to -----------------------------------------------------------

// A log line: its beginning and its end (the middle may name an id the SDK returned).
struct Line {
    std::string prefix;
    std::string suffix;
    bool matches(const std::string &line) const
    {
        return line.size() >= prefix.size() + suffix.size() && line.compare(0, prefix.size(), prefix) == 0 &&
               line.compare(line.size() - suffix.size(), suffix.size(), suffix) == 0;
    }
    std::string text() const { return prefix + (suffix.empty() ? "" : "..." + suffix); }
};

struct Expected {
    Told told;                    // what the game is told, exactly
    bool sign_in_failed = false;  // only init and onLogin are then exact; the rest is answered at most once
    std::vector<Line> lines;      // among the library's lines
    bool silent = false;          // the library's lines are exactly the clean run's
    size_t roots = 2;             // the two subscriptions' cells
};

// The items of the array a closure received in its first call ("[a b {..} ]").
std::vector<std::string> items_of(const std::string &call)
{
    std::vector<std::string> items;
    size_t at = call.find('[');
    if (at == std::string::npos)
        return items;
    ++at;
    while (at < call.size() && call[at] != ']') {
        size_t end = call[at] == '{' ? call.find("} ", at) + 2 : call.find(' ', at) + 1;
        items.push_back(call.substr(at, end - at - 1));
        at = end;
    }
    return items;
}

std::string with_items(const std::string &call, const std::vector<std::string> &items)
{
    std::string out = call.substr(0, call.find('[') + 1);
    for (const std::string &item : items)
        out += item + " ";
    return out + call.substr(call.rfind(']'));
}

// Changes item `index` of the array the closure received.
void edit_item(Told &told, const std::string &closure, size_t index, const std::function<void(std::string &)> &edit)
{
    if (told[closure].empty())
        return;
    std::string &call = told[closure][0];
    std::vector<std::string> items = items_of(call);
    if (index < items.size())
        edit(items[index]);
    call = with_items(call, items);
}

std::function<void(std::string &)> drop_field(const std::string &field)
{
    return [field](std::string &record) {
        record = std::regex_replace(record, std::regex(field + "=('[^']*'|true|false|null) "), "");
    };
}

std::function<void(std::string &)> set_field(const std::string &field, const std::string &value)
{
    return [field, value](std::string &record) {
        record = std::regex_replace(record, std::regex(field + "=('[^']*'|true|false|null) "), field + "=" + value + " ");
    };
}

void become_null(std::string &record) { record = "null"; }

const std::vector<std::string> kFriends = {"alice", "bob", "carol"};
const std::vector<std::string> kSenders = {"Alice", "Bob", "Carol"};

// The game never reaches the lobby of the first invitation, so it never leaves it.
void lose_join(Expected &e)
{
    e.told.erase("onJoined");
    e.told.erase("onLeft");
}

// The game is not told of the n-th invitation; it never accepts (nor rejects)
// an invitation it did not hear of.
void lose_invitation(Expected &e, int n)
{
    std::vector<std::string> &invites = e.told["onInvite"];
    std::string gone = "('<invite" + std::to_string(n) + ">', '" + kSenders[static_cast<size_t>(n - 1)] + "')";
    invites.erase(std::remove(invites.begin(), invites.end(), gone), invites.end());
    if (n == 1)
        lose_join(e);
}

Expected expected_for(const Site &site, const Variant &v, const Clean &clean);

// ---------------------------------------------------------------------------

class FaultSweep : public TarnwickTest {
protected:
    void SetUp() override
    {
        count_failures();
        TarnwickTest::SetUp();
    }

    // Runs `body` on the library as loaded and never used, in a process of its own.
    ChildRun in_child(const std::function<std::string()> &body)
    {
        return run_forked([&](const std::string &dir) {
            dir_ = dir;
            return body();
        });
    }

    // ---- the session -------------------------------------------------------------------------

    void phase(const std::string &name)
    {
        std::vector<eos_sim::Call> all = eos_sim::calls();
        phase_starts_.push_back({all.empty() ? 1 : all.back().seq + 1, name});
    }

    std::string phase_of(uint64_t seq) const
    {
        std::string name = "?";
        for (const auto &[from, n] : phase_starts_)
            if (from <= seq)
                name = n;
        return name;
    }

    // Ticks until the SDK has nothing left queued, then once more.
    void settle()
    {
        tick(2);
        for (int i = 0; i < 30 && !eos_sim::pending().empty(); ++i)
            tick(1);
        tick(1);
    }

    bool heard(const std::string &text) const { return game_.heard.count(text) > 0; }

    // A recorded closure, made right before the game passes it: from then on
    // only the library keeps it alive.
    vclosure *closure(const std::string &name, const std::string &signature)
    {
        host::ClosureRef c = game_.closure(name, signature);
        closures_[name] = c;
        return c->vm;
    }

    std::optional<std::string> first_bytes(const std::string &name) const
    {
        auto it = closures_.find(name);
        if (it == closures_.end() || it->second->count() == 0)
            return std::nullopt;
        return arg_bytes(it->second->calls[0], 0);
    }

    void name_id(const std::string &id, const std::string &name)
    {
        if (!id.empty())
            names_[id] = name;
    }

    // `from` hosts a lobby publishing `key` and invites the local player: the
    // n-th invitation of the session.
    std::string remote_invitation(const std::string &from, const std::string &key, int n)
    {
        std::string lobby = eos_sim::remote_create_lobby(from, {eos_sim::Attribute::string("connection_key", key)});
        std::string invite = eos_sim::remote_invite(from, lobby);
        name_id(lobby, "lobby" + std::to_string(n + 1));
        name_id(invite, "invite" + std::to_string(n));
        return invite;
    }

    // The session a game plays: sign-in (the player's Connect user is created),
    // both subscriptions, a lobby of its own with an invitation to a friend, an
    // invitation received and accepted by joining, one accepted in the overlay,
    // one rejected, leaving and destroying, friends, achievements, ownership and
    // the checkout. A step that needs something the game was never told (a lobby
    // id, an invite id) is left out, as a game would.
    void play()
    {
        eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].has_connect_user = false; });
        for (const eos_sim::Account &a : eos_sim::get_world().accounts) {
            name_id(a.epic_id, "epic:" + a.name);
            name_id(a.product_user_id, "puid:" + a.name);
        }

        phase("sign-in");
        bool started = false;
        {
            void *object = host::init_config(config());
            host::Held keep(object);
            started = p.init(object, closure("onLogin", "PiBBB_v"));
        }
        game_.told["init"].push_back(started ? "true" : "false");
        settle();

        phase("subscribe");
        p.notify_invite_received(closure("onInvite", "PBB_v"));
        p.notify_invite_accepted(closure("onAccepted", "PBB_v"));
        settle();

        phase("create");
        p.create_lobby(host::bytes("host-key:7777"), closure("onCreated", "PB_v"));
        settle();
        std::optional<std::string> lobby1 = first_bytes("onCreated");
        if (lobby1)
            name_id(*lobby1, "lobby1");

        phase("send");
        if (lobby1) {
            p.send_invite(host::bytes(eos_sim::get_world().accounts[1].product_user_id), host::bytes(*lobby1));
            settle();
        }

        phase("received-1");
        std::string invite1 = remote_invitation("alice", "alice-key", 1);
        settle();

        phase("accept");
        if (heard(invite1)) {
            p.accept_invite(host::bytes(invite1), closure("onJoined", "PBB_v"));
            settle();
        }

        phase("received-2");
        std::string invite2 = remote_invitation("bob", "bob-key", 2);
        settle();

        phase("overlay");
        eos_sim::raise_invite_accepted(invite2);
        settle();

        phase("received-3");
        std::string invite3 = remote_invitation("carol", "carol-key", 3);
        settle();

        phase("reject");
        if (heard(invite3)) {
            p.reject_invite(host::bytes(invite3));
            settle();
        }

        phase("leave");
        std::optional<std::string> joined = first_bytes("onJoined");
        if (joined) {
            p.leave_lobby(host::bytes(*joined), closure("onLeft", "Pi_v"));
            settle();
        }

        phase("destroy");
        if (lobby1) {
            p.destroy_lobby(host::bytes(*lobby1), closure("onDestroyed", "Pi_v"));
            settle();
        }

        phase("friends");
        p.query_friends(closure("onFriends", "PA_v"));
        settle();

        phase("show-friends");
        p.show_friends();
        settle();

        phase("achievements");
        p.set_achievement(host::bytes("first_win"));
        settle();
        p.query_achievements(closure("onAchievements", "PA_v"));
        settle();

        phase("ownership");
        p.query_ownership(host::bytes_array(std::vector<std::string>{"item_sword", "item_shield"}),
                          closure("onOwned", "PA_v"));
        settle();

        phase("checkout");
        p.store_checkout(host::bytes("offer_gold"));
        settle();
        phase("end");
    }

    // Ids in text replaced by their names in the session, the token by <token>.
    std::string canonical(std::string text) const
    {
        std::vector<std::pair<std::string, std::string>> by_length(names_.begin(), names_.end());
        std::sort(by_length.begin(), by_length.end(),
                  [](const auto &a, const auto &b) { return a.first.size() > b.first.size(); });
        for (const auto &[id, name] : by_length)
            text = replace_all(text, id, "<" + name + ">");
        if (token_ && !token_->empty())
            text = replace_all(text, *token_, "<token>");
        return text;
    }

    Told canonical_told() const
    {
        Told out;
        for (const auto &[closure, calls] : game_.told)
            for (const std::string &c : calls)
                out[closure].push_back(canonical(c));
        return out;
    }

    std::vector<std::string> canonical_lines() const
    {
        std::vector<std::string> out;
        for (const std::string &line : egs_lines())
            out.push_back(canonical(line));
        return out;
    }

    // Keeps the access token the Connect login was given, for canonical().
    void remember_token()
    {
        auto logins = eos_sim::calls("EOS_Connect_Login");
        if (!logins.empty() && logins[0].options.contains("Credentials") &&
            logins[0].options["Credentials"].contains("Token") && logins[0].options["Credentials"]["Token"].is_string())
            token_ = logins[0].options["Credentials"]["Token"].get<std::string>();
    }

    // ---- the clean run -----------------------------------------------------------------------

    Clean clean_run()
    {
        ChildRun child = in_child([this] {
            play();
            remember_token();
            json out;
            out["told"] = canonical_told();
            out["lines"] = canonical_lines();
            std::map<std::string, int> seen;
            out["sites"] = json::array();
            for (const eos_sim::Call &c : eos_sim::calls()) {
                int k = ++seen[c.function];
                out["sites"].push_back({{"function", c.function}, {"k", k}, {"phase", phase_of(c.seq)},
                                        {"async", !c.deliveries.empty()},
                                        {"fails", c.deliveries.empty() && c.result && *c.result != EOS_EResult::EOS_Success}});
            }
            expect_clean(2);
            return out.dump();
        });
        EXPECT_TRUE(child.clean()) << "the clean run: " << child.describe();
        Clean clean;
        json in = json::parse(child.output, nullptr, false);
        if (in.is_discarded())
            return clean;
        clean.told = in["told"].get<Told>();
        clean.lines = in["lines"].get<std::vector<std::string>>();
        for (const json &s : in["sites"])
            clean.sites.push_back(Site{s["function"], s["k"], s["phase"], s["async"], s["fails"]});
        return clean;
    }

    // ---- one failing run ---------------------------------------------------------------------

    void fail_site(const Site &site, const Variant &v, const Clean &clean);

    // Fails every failable call site of the given phases, once per variant.
    void sweep(const std::set<std::string> &phases)
    {
        Clean clean = clean_run();
        ASSERT_FALSE(clean.sites.empty());
        size_t sites = 0;
        size_t runs = 0;
        size_t failed = 0;
        for (const Site &site : clean.sites) {
            // A call that fails in the clean run already is not failed again.
            if (!phases.count(site.phase) || !can_fail(site.function) || site.fails_cleanly)
                continue;
            ++sites;
            for (const Variant &v : variants_for(site)) {
                ++runs;
                ChildRun child = in_child([&] {
                    SCOPED_TRACE(site.function + " #" + std::to_string(site.k) + " (" + site.phase + "), " +
                                 variant_name(v));
                    fail_site(site, v, clean);
                    return std::string();
                });
                if (!child.clean()) {
                    ++failed;
                    ADD_FAILURE() << site.function << " #" << site.k << " (" << site.phase << "), "
                                  << variant_name(v) << ": " << child.describe();
                }
            }
        }
        std::printf("[ sweep    ] %zu call sites failed in %zu runs, %zu runs went wrong\n", sites, runs, failed);
        EXPECT_GT(sites, 0u);
    }

    Recorder game_;
    std::map<std::string, host::ClosureRef> closures_;
    std::optional<std::string> token_;
    std::map<std::string, std::string> names_;
    std::vector<std::pair<uint64_t, std::string>> phase_starts_;
};

Expected expected_for(const Site &site, const Variant &v, const Clean &clean)
{
    Expected e;
    e.told = clean.told;
    if (v.kind == Variant::NotFinalFirst) {
        // A result that is not final is passed over: the run is the clean one.
        e.silent = true;
        return e;
    }
    const std::string f = site.function;
    const std::string c = std::to_string(code_of(v.code));
    const std::string &ph = site.phase;
    auto line = [&](const std::string &prefix, const std::string &suffix = "") { e.lines.push_back({prefix, suffix}); };
    auto coded = [&](const std::string &prefix) { line(prefix + c); };
    // Which invitation a received-N phase handles.
    int n = ph.rfind("received-", 0) == 0 ? std::stoi(ph.substr(9)) : 0;

    if (ph == "sign-in") {
        if (f == "EOS_Initialize" || f == "EOS_Platform_Create") {
            // No platform: every later request is dropped and nothing is told.
            e.told = {{"init", {"false"}}};
            e.roots = 0;
            line(f == "EOS_Initialize" ? "[EGS] EOS failed to initialize : " + c : "[EGS] EOS failed to create platform");
            line("[EGS] No EOS platform, create_lobby ignored");
        } else if (f == "EOS_UserInfo_CopyUserInfo") {
            e.told["onLogin"] = {"(0, '<epic:me>', '', '<token>')"};
            coded("[EGS] Failed to retreive name : ");
        } else if (f == "EOS_EpicAccountId_ToString") {
            e.told["onLogin"] = {"(0, null, 'Local Player', '<token>')"};
            e.silent = true;
        } else {
            e.sign_in_failed = true;
            if (f == "EOS_Auth_Login") {
                e.told["onLogin"] = {"(" + c + ", null, '', null)"};
                coded("[EGS] Failed to auth to EGS : ");
            } else if (f == "EOS_Auth_CopyUserAuthToken") {
                e.told["onLogin"] = {"(" + c + ", '<epic:me>', 'Local Player', null)"};
                coded("[EGS] Failed to retreive an EGS auth token : ");
            } else if (f == "EOS_Connect_Login") {
                e.told["onLogin"] = {"(" + c + ", '<epic:me>', 'Local Player', '<token>')"};
                coded("[EGS] Failed to auth to EGS : ");
            } else if (f == "EOS_Connect_CreateUser") {
                e.told["onLogin"] = {"(" + c + ", '<epic:me>', 'Local Player', '<token>')"};
                coded("[EGS] Failed to create user : ");
            }
        }
    } else if (ph == "subscribe") {
        e.roots = 1;
        if (f == "EOS_Lobby_AddNotifyLobbyInviteReceived") {
            e.told.erase("onInvite");
            lose_join(e);
            line("[EGS] Failed to subscribe to invitations : " + std::to_string(code_of(EOS_EResult::EOS_UnexpectedError)));
        } else if (f == "EOS_Lobby_AddNotifyLobbyInviteAccepted") {
            e.told.erase("onAccepted");
            line("[EGS] Failed to subscribe to accepted invitations : " +
                 std::to_string(code_of(EOS_EResult::EOS_UnexpectedError)));
        } else if (f == "EOS_Lobby_AddNotifyJoinLobbyAccepted") {
            e.roots = 2;
            line("[EGS] Failed to subscribe to join requests : " + std::to_string(code_of(EOS_EResult::EOS_UnexpectedError)));
        }
    } else if (ph == "create") {
        if (f == "EOS_Lobby_CreateLobby") {
            // No lobby id: the game neither invites to it nor destroys it.
            e.told["onCreated"] = {"(null)"};
            e.told.erase("onDestroyed");
            coded("[EGS] Failed to create lobby : ");
        } else if (f == "EOS_Lobby_UpdateLobbyModification") {
            coded("[EGS] Failed to update lobby modification: ");
        } else if (f == "EOS_LobbyModification_AddAttribute") {
            coded("[EGS] Failed to add attribute to the lobby: ");
        } else if (f == "EOS_Lobby_UpdateLobby") {
            e.silent = true;
        }
    } else if (ph == "send") {
        // A target id the SDK cannot read fails the send like any other failure.
        line("[EGS] Failed to send invite : ", f == "EOS_Lobby_SendInvite" ? c : "");
    } else if (n > 0) {
        lose_invitation(e, n);
        if (f == "EOS_Lobby_CopyLobbyDetailsHandleByInviteId")
            coded("[EGS] Failed to receive lobby details : ");
        else if (f == "EOS_LobbyDetails_CopyInfo")
            coded("[EGS] Failed to copy lobby details : ");
        else if (f == "EOS_Connect_QueryProductUserIdMappings")
            coded("[EGS] Failed to receive id mappings : ");
        else if (f == "EOS_Connect_GetProductUserIdMapping")
            coded("[EGS] Failed to get product id mapping : ");
        else if (f == "EOS_EpicAccountId_FromString")
            line("[EGS] Failed to query the hoster's user info : ");
        else if (f == "EOS_UserInfo_QueryUserInfo")
            coded("[EGS] Failed to query the hoster's user info : ");
        else if (f == "EOS_UserInfo_CopyUserInfo")
            coded("[EGS] Failed to retreive name : ");
    } else if (ph == "accept") {
        lose_join(e);
        if (f == "EOS_Lobby_CopyLobbyDetailsHandleByInviteId")
            coded("[EGS] Failed to receive lobby details : ");
        else if (f == "EOS_Lobby_JoinLobby")
            coded("[EGS] Failed to join lobby : ");
        else if (f == "EOS_Lobby_CopyLobbyDetailsHandle")
            coded("[EGS] Can't receive lobby details : ");
        else if (f == "EOS_LobbyDetails_CopyAttributeByKey")
            coded("[EGS] Failed to receive lobby attribute : ");
    } else if (ph == "overlay") {
        if (f == "EOS_Lobby_RejectInvite") {
            line("[EGS] Failed to reject invite ", " : " + c);
        } else {
            e.told.erase("onAccepted");
            if (f == "EOS_Lobby_CopyLobbyDetailsHandleByInviteId")
                coded("[EGS] Failed to receive lobby details (invite accepted): ");
            else if (f == "EOS_LobbyDetails_CopyInfo")
                coded("[EGS] Failed to copy lobby details (invite accepted): ");
            else if (f == "EOS_LobbyDetails_CopyAttributeByKey")
                coded("[EGS] Failed to receive lobby attribute : ");
        }
    } else if (ph == "reject") {
        line("[EGS] Failed to reject invite ", " : " + c);
    } else if (ph == "leave") {
        e.told["onLeft"] = {"(" + c + ")"};
        line("[EGS] Can't leave lobby ", " : " + c);
    } else if (ph == "destroy") {
        e.told["onDestroyed"] = {"(" + c + ")"};
        coded("[EGS] Can't destroy lobby : ");
    } else if (ph == "friends") {
        size_t k = static_cast<size_t>(site.k);
        if (f == "EOS_Friends_QueryFriends") {
            e.told["onFriends"] = {"(null)"};
            coded("[EGS] Failed to query friends : ");
        } else if (f == "EOS_Friends_GetFriendAtIndex" || f == "EOS_EpicAccountId_ToString") {
            // The sign-in made the first ToString call.
            size_t i = f == "EOS_Friends_GetFriendAtIndex" ? k - 1 : k - 2;
            edit_item(e.told, "onFriends", i, become_null);
            line("[EGS] Invalid friend id (index " + std::to_string(i) + ")");
        } else if (f == "EOS_UserInfo_QueryUserInfo") {
            // Three earlier queries asked for the senders of invitations.
            edit_item(e.told, "onFriends", k - 4, drop_field("name"));
            coded("[EGS] Failed to retreive user infos : ");
        } else if (f == "EOS_UserInfo_CopyUserInfo") {
            // One copy at sign-in, three for the senders of invitations.
            edit_item(e.told, "onFriends", k - 5, drop_field("name"));
            coded("[EGS] Failed to retreive name : ");
        } else if (f == "EOS_Presence_QueryPresence") {
            edit_item(e.told, "onFriends", k - 1, drop_field("online"));
            coded("[EGS] Can't receive presence info : ");
        } else if (f == "EOS_Presence_CopyPresence") {
            edit_item(e.told, "onFriends", k - 1, set_field("online", "false"));
            coded("[EGS] Can't copy presence info : ");
        } else if (f == "EOS_Connect_QueryExternalAccountMappings") {
            for (size_t i = 0; i < kFriends.size(); ++i)
                edit_item(e.told, "onFriends", i, drop_field("productId"));
            coded("[EGS] Failed to retreive external products id : ");
        } else if (f == "EOS_Connect_GetExternalAccountMapping" || f == "EOS_ProductUserId_ToString") {
            // A friend without a product user id has no productId, and no line.
            edit_item(e.told, "onFriends", k - 1, drop_field("productId"));
            e.silent = true;
        }
    } else if (ph == "achievements") {
        e.silent = true;
        if (f == "EOS_Achievements_UnlockAchievements")
            edit_item(e.told, "onAchievements", 0, set_field("unlock", "false"));
        else if (f == "EOS_Achievements_QueryPlayerAchievements")
            e.told["onAchievements"] = {"([])"};
        else if (f == "EOS_Achievements_CopyPlayerAchievementByIndex")
            edit_item(e.told, "onAchievements", static_cast<size_t>(site.k - 1), become_null);
    } else if (ph == "ownership") {
        e.told["onOwned"] = {"(null)"};
        e.silent = true;
    } else {
        // The overlay and the checkout report nothing.
        e.silent = true;
    }
    return e;
}

void FaultSweep::fail_site(const Site &site, const Variant &v, const Clean &clean)
{
    eos_sim::Failure failure =
        v.kind == Variant::NotFinalFirst ? eos_sim::Failure::retry() : eos_sim::Failure::once(v.code);
    eos_sim::inject(site.function, failure.on_call(site.k));
    play();
    remember_token();

    // The failure hit the call it was meant for.
    std::vector<eos_sim::Call> calls = eos_sim::calls(site.function);
    ASSERT_GE(calls.size(), static_cast<size_t>(site.k));
    const eos_sim::Call &hit = calls[static_cast<size_t>(site.k - 1)];
    EXPECT_EQ(phase_of(hit.seq), site.phase);
    if (v.kind == Variant::NotFinalFirst) {
        ASSERT_FALSE(hit.deliveries.empty());
        EXPECT_EQ(hit.deliveries.front(), EOS_EResult::EOS_OperationWillRetry);
    } else if (!fails_without_code(site.function)) {
        bool reported = hit.result == v.code ||
                        std::find(hit.deliveries.begin(), hit.deliveries.end(), v.code) != hit.deliveries.end();
        EXPECT_TRUE(reported) << "the failure did not reach the call";
    }

    Expected e = expected_for(site, v, clean);
    Told told = canonical_told();
    if (!e.sign_in_failed) {
        EXPECT_EQ(told, e.told) << "told:\n" << show(told) << "expected:\n" << show(e.told);
    } else {
        EXPECT_EQ(told["init"], e.told["init"]);
        EXPECT_EQ(told["onLogin"], e.told["onLogin"]);
        // Whatever follows a failed sign-in, no request is answered twice, and
        // those that need no id from an earlier answer are answered once.
        for (const auto &[closure, calls] : told)
            EXPECT_LE(calls.size(), clean.told.count(closure) ? clean.told.at(closure).size() : 0u) << closure;
        for (const char *closure : {"onCreated", "onFriends", "onAchievements", "onOwned"})
            EXPECT_EQ(told[closure].size(), 1u) << closure;
    }

    std::vector<std::string> lines = canonical_lines();
    for (const Line &expected : e.lines)
        EXPECT_TRUE(std::any_of(lines.begin(), lines.end(), [&](const std::string &l) { return expected.matches(l); }))
            << "no line " << expected.text();
    if (e.silent)
        EXPECT_EQ(lines, clean.lines);

    expect_clean(e.roots);
    p.exit();
    EXPECT_TRUE(eos_sim::faults().empty()) << eos_sim::faults().front();
}

// ---------------------------------------------------------------------------

// The phases each sweep fails, together every phase of the session.
const std::set<std::string> kSignIn = {"sign-in"};
const std::set<std::string> kOwnLobbies = {"subscribe", "create", "send", "leave", "destroy"};
const std::set<std::string> kInvitations = {"received-1", "accept", "received-2", "overlay", "received-3", "reject"};
const std::set<std::string> kServices = {"friends", "show-friends", "achievements", "ownership", "checkout"};

TEST_F(FaultSweep, TheCleanSessionTellsTheGameEverythingAndEveryPhaseIsSwept)
{
    Clean clean = clean_run();
    const Told expected = {
        {"init", {"true"}},
        {"onLogin", {"(0, '<epic:me>', 'Local Player', '<token>')"}},
        {"onCreated", {"('<lobby1>')"}},
        {"onInvite", {"('<invite1>', 'Alice')", "('<invite2>', 'Bob')", "('<invite3>', 'Carol')"}},
        {"onJoined", {"('<lobby2>', 'alice-key')"}},
        {"onAccepted", {"('<lobby3>', 'bob-key')"}},
        {"onLeft", {"(0)"}},
        {"onDestroyed", {"(0)"}},
        {"onFriends",
         {"([{epicId='<epic:alice>' name='Alice' productId='<puid:alice>' online=true } "
          "{epicId='<epic:bob>' name='Bob' productId='<puid:bob>' online=false } "
          "{epicId='<epic:carol>' name='Carol' productId='<puid:carol>' online=false } ])"}},
        {"onAchievements", {"([{id='first_win' unlock=true } {id='explorer' unlock=true } {id='dawn' unlock=true } ])"}},
        {"onOwned", {"(['item_sword' ])"}},
    };
    EXPECT_EQ(clean.told, expected) << show(clean.told);

    std::set<std::string> swept;
    for (const auto *group : {&kSignIn, &kOwnLobbies, &kInvitations, &kServices})
        swept.insert(group->begin(), group->end());
    std::set<std::string> reached;
    size_t failable = 0;
    for (const Site &site : clean.sites)
        if (can_fail(site.function) && !site.fails_cleanly) {
            reached.insert(site.phase);
            ++failable;
        }
    EXPECT_EQ(reached, swept);
    std::printf("[ sweep    ] the session makes %zu EOS calls, %zu of them can fail\n", clean.sites.size(), failable);
}

TEST_F(FaultSweep, SignIn) { sweep(kSignIn); }

TEST_F(FaultSweep, LobbiesOfItsOwn) { sweep(kOwnLobbies); }

TEST_F(FaultSweep, InvitationsReceivedAcceptedAndRejected) { sweep(kInvitations); }

TEST_F(FaultSweep, FriendsAchievementsAndCommerce) { sweep(kServices); }

}  // namespace
