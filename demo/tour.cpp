#include "tour.h"

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <host.h>
#include <tarnwick_primitives.h>

#include <functional>
#include <sstream>
#include <stdexcept>

namespace tour {

namespace {

// Loads the hdll and binds every primitive, once per process.
const tarnwick::Primitives& bind_all(const std::string& hdll) {
    static tarnwick::Primitives p;
    static bool bound = false;
    if (bound) return p;
    host::load(hdll);
    p = tarnwick::bind_primitives();
    bound = true;
    return p;
}

struct StepFailed : std::runtime_error {
    StepFailed(std::string step, const std::string& why) : std::runtime_error(why), step(std::move(step)) {}
    std::string step;
};

std::string quoted(const std::optional<std::string>& s) { return s ? "\"" + *s + "\"" : "null"; }

// Ids are long: the first eight characters tell them apart in the output.
std::string short_id(const std::optional<std::string>& s) {
    if (!s) return "null";
    return s->size() > 12 ? s->substr(0, 8) + "\xe2\x80\xa6" : *s;
}

std::string result_text(int code) {
    static const std::pair<int, const char*> names[] = {
#define EOS_RESULT_VALUE(Name, Value) {Value, #Name},
#define EOS_RESULT_VALUE_LAST(Name, Value) {Value, #Name},
#include "eos_result.h"
#undef EOS_RESULT_VALUE
#undef EOS_RESULT_VALUE_LAST
    };
    for (const auto& [value, name] : names)
        if (value == code) return std::to_string(code) + " (" + name + ")";
    return std::to_string(code);
}

class Tour {
public:
    Tour(const Options& o, std::ostream& out) : o_(o), out_(out) {}

    Report run() {
        try {
            play();
        } catch (const StepFailed& f) {
            r_.failed_step = f.step;
            say_now(std::string("step \"") + f.step + "\" failed: " + f.what());
        }
        r_.ticks = eos_sim::ticks();
        return r_;
    }

private:
    const Options& o_;
    std::ostream& out_;
    Report r_;
    tarnwick::Primitives p_;
    std::vector<host::ClosureRef> keep_;       // every closure handed to the library
    size_t echoed_ = 0;

    // ---- output ----

    void echo_log() {
        if (!o_.echo_log) return;
        const auto lines = hlrt::console_utf8();
        for (; echoed_ < lines.size(); ++echoed_) emit("        log: " + lines[echoed_]);
    }
    void emit(const std::string& line) {
        r_.lines.push_back(line);
        out_ << line << std::endl;   // flushed: the simulator's own messages go to stderr meanwhile
    }
    // A line about something that arrived (or was done) on the tick in progress.
    void say_now(const std::string& text) {
        echo_log();
        emit("[tick " + std::to_string(eos_sim::ticks()) + "] " + text);
    }
    void detail(const std::string& text) { emit("          " + text); }

    // ---- driving ----

    void tick() {
        vdynamic* exception = host::call_guarded([&] { p_.update(); });
        if (exception != nullptr) throw StepFailed("update", "hleos_update rethrew a Haxe exception");
    }
    void wait_for(const std::string& step, const std::function<bool()>& done) {
        for (int i = 0; i < o_.step_ticks && !done(); ++i) tick();
        if (!done())
            throw StepFailed(step, "it did not happen within " + std::to_string(o_.step_ticks) + " ticks");
    }
    vclosure* closure(const std::string& signature, std::function<void(const host::Call&)> on_call) {
        host::ClosureBehaviour b;
        b.on_call = std::move(on_call);
        keep_.push_back(host::make_closure(signature, b));
        return keep_.back()->vm;
    }

    // ---- the tour ----

    void play() {
        p_ = bind_all(o_.hdll);
        if (!o_.world_file.empty()) eos_sim::set_world_file(o_.world_file);
        start();
        sign_in();
        friends();
        achievements();
        ownership();
        create_lobby();
        invite_friend();
        accept_invitation();
        overlay_acceptance();
        leave_and_destroy();
        p_.exit();
        say_now("exit: platform released after " + std::to_string(eos_sim::ticks()) + " ticks");
    }

    void start() {
        host::InitConfigValues v;
        v.productName = "tarnwick demo";
        v.productVersion = "1.0";
        v.eosProductId = "tarnwick-demo";
        v.spare = "";
        v.sandboxId = "demo-sandbox";
        v.deploymentId = "demo-deployment";
        v.clientId = "demo-client";
        v.clientSecret = "demo-secret";
        if (o_.login_as.empty()) {
            v.loginType = 6;   // EOS_LCT_AccountPortal: the simulator signs in the world's local player
        } else {
            v.loginType = 4;   // EOS_LCT_Developer: the credential names the account
            v.loginId = "localhost:6547";
            v.loginToken = o_.login_as;
        }
        v.enableOverlay = true;
        void* config = host::init_config(v);
        host::Held hold(config);
        vclosure* onLogin = closure("PiBBB_v", [this](const host::Call& c) {
            r_.login_tick = eos_sim::ticks();
            r_.login_result = c.args[0].i;
            r_.account = c.args[1].bytes;
            r_.display_name = c.args[2].bytes;
            r_.token = c.args[3].bytes;
            say_now("signed in: result " + result_text(r_.login_result) + ", account " + short_id(r_.account) +
                    ", name " + quoted(r_.display_name) + ", access token " + (r_.token ? "received" : "null"));
        });
        bool started = false;
        host::call_guarded([&] { started = p_.init(config, onLogin); });
        echo_log();
        if (!started) throw StepFailed("start", "hleos_init returned false (the reason is in egs.log and above)");
        say_now("started: hleos_init returned true, sign-in under way");

        // The game listens for invitations and overlay acceptances for the whole session.
        p_.notify_invite_received(closure("PBB_v", [this](const host::Call& c) {
            r_.invitations.emplace_back(c.args[0].bytes.value_or(""), c.args[1].bytes.value_or(""));
            r_.invitation_ticks.push_back(eos_sim::ticks());
            say_now("invitation received: id " + short_id(c.args[0].bytes) + ", from " + quoted(c.args[1].bytes));
        }));
        p_.notify_invite_accepted(closure("PBB_v", [this](const host::Call& c) {
            r_.overlay = {eos_sim::ticks(), c.args[0].bytes, c.args[1].bytes};
            say_now("invitation accepted in the overlay: lobby " + short_id(c.args[0].bytes) + ", connection key " +
                    quoted(c.args[1].bytes));
        }));
    }

    void sign_in() {
        wait_for("sign in", [&] { return r_.login_result != -1; });
        if (r_.login_result != 0) throw StepFailed("sign in", "the sign-in ended with result " + result_text(r_.login_result));
    }

    void friends() {
        bool got = false;
        p_.query_friends(closure("PA_v", [&, this](const host::Call& c) {
            got = true;
            varray* list = c.args[0].array();
            if (list == nullptr) {
                say_now("friend list: null (the query failed)");
                return;
            }
            say_now("friend list: " + std::to_string(host::array_size(list)) + " friend(s)");
            for (void* slot : host::array_slots(list)) {
                FriendSeen f;
                auto* o = static_cast<vdynobj*>(slot);
                if (o != nullptr) {
                    f.epic_id = host::field_bytes(o, "epicId");
                    f.name = host::field_bytes(o, "name");
                    f.product_id = host::field_bytes(o, "productId");
                    f.online = host::field_bool(o, "online");
                }
                r_.friends.push_back(f);
                if (o == nullptr) {
                    detail("(an invalid friend entry: null)");
                    continue;
                }
                detail((f.name ? quoted(f.name) : std::string("(no name)")) + "  epicId " + short_id(f.epic_id) + "  " +
                       (f.online ? (*f.online ? "playing this game" : "not in this game") : "presence unknown") +
                       "  productId " + short_id(f.product_id));
            }
        }));
        wait_for("friend list", [&] { return got; });
    }

    std::vector<AchievementSeen> read_achievements(varray* list) {
        std::vector<AchievementSeen> out;
        for (void* slot : host::array_slots(list)) {
            auto* o = static_cast<vdynobj*>(slot);
            if (o == nullptr) continue;
            out.push_back({host::field_bytes(o, "id").value_or(""), host::field_bool(o, "unlock").value_or(false)});
        }
        return out;
    }
    void show_achievements(const std::vector<AchievementSeen>& list) {
        for (const auto& a : list) detail("\"" + a.id + "\"  " + (a.unlocked ? "unlocked" : "locked"));
    }

    void achievements() {
        bool got = false;
        p_.query_achievements(closure("PA_v", [&, this](const host::Call& c) {
            got = true;
            r_.achievements = read_achievements(c.args[0].array());
            say_now("achievements: " + std::to_string(r_.achievements.size()));
            show_achievements(r_.achievements);
        }));
        wait_for("achievements", [&] { return got; });

        r_.unlocked = "first_win";
        for (const auto& a : r_.achievements)
            if (!a.unlocked) {
                r_.unlocked = a.id;
                break;
            }
        p_.set_achievement(host::bytes(r_.unlocked));
        say_now("unlocking \"" + r_.unlocked + "\" (nothing comes back), then listing again");
        got = false;
        p_.query_achievements(closure("PA_v", [&, this](const host::Call& c) {
            got = true;
            r_.achievements_after_unlock = read_achievements(c.args[0].array());
            say_now("achievements: " + std::to_string(r_.achievements_after_unlock.size()));
            show_achievements(r_.achievements_after_unlock);
        }));
        wait_for("achievements after the unlock", [&] { return got; });
    }

    void ownership() {
        bool got = false;
        varray* items = host::bytes_array(o_.items);
        host::Held hold(items);
        std::string asked;
        for (const auto& i : o_.items) asked += (asked.empty() ? "" : ", ") + i;
        p_.query_ownership(items, closure("PA_v", [&, this](const host::Call& c) {
            got = true;
            varray* list = c.args[0].array();
            if (list == nullptr) {
                say_now("owned items: null (the query failed)");
                return;
            }
            std::vector<std::string> owned;
            for (const auto& id : host::array_bytes(list)) owned.push_back(id.value_or(""));
            r_.owned = owned;
            std::string text;
            for (const auto& id : owned) text += (text.empty() ? "\"" : ", \"") + id + "\"";
            say_now("owned items among " + asked + ": " + (text.empty() ? "none" : text));
        }));
        wait_for("ownership", [&] { return got; });
    }

    void create_lobby() {
        bool got = false;
        p_.create_lobby(host::bytes(o_.connection_key), closure("PB_v", [&, this](const host::Call& c) {
            got = true;
            r_.lobby_id = c.args[0].bytes;
            say_now("lobby created: id " + short_id(r_.lobby_id) + ", publishing connection key \"" + o_.connection_key + "\"");
        }));
        wait_for("create a lobby", [&] { return got; });
        if (!r_.lobby_id) throw StepFailed("create a lobby", "the lobby id is null");
    }

    // Invites the first friend playing this game (else the first with a product user id); the
    // game hears nothing of the join, so the tour watches the simulated lobby to show it.
    void invite_friend() {
        const FriendSeen* chosen = nullptr;
        for (const auto& f : r_.friends)
            if (f.product_id && f.online.value_or(false) && !chosen) chosen = &f;
        for (const auto& f : r_.friends)
            if (f.product_id && !chosen) chosen = &f;
        if (chosen == nullptr) throw StepFailed("invite a friend", "no friend has a product user id");
        const FriendSeen target = *chosen;
        p_.send_invite(host::bytes(*target.product_id), host::bytes(*r_.lobby_id));
        say_now("invited " + quoted(target.name) + " (productId " + short_id(target.product_id) + ") to lobby " +
                short_id(r_.lobby_id) + " (nothing comes back)");
        for (const auto& a : eos_sim::get_world().accounts)
            if (a.product_user_id == *target.product_id) r_.invited = a.name;
        wait_for("friend joins the lobby", [&] {
            auto lobby = eos_sim::find_lobby(*r_.lobby_id);
            if (!lobby) return false;
            for (const auto& m : lobby->members)
                if (m == r_.invited) return true;
            return false;
        });
        r_.friend_joined_tick = eos_sim::ticks();
        std::string members;
        const auto lobby = eos_sim::find_lobby(*r_.lobby_id);
        for (const auto& m : lobby->members) members += (members.empty() ? "" : ", ") + m;
        say_now(quoted(target.name) + " joined the lobby (seen in the simulated world; members: " + members + ")");
    }

    void accept_invitation() {
        wait_for("receive an invitation", [&] { return !r_.invitations.empty(); });
        const auto [invite, sender] = r_.invitations.front();
        say_now("accepting the invitation " + short_id(invite) + " from \"" + sender + "\"");
        p_.accept_invite(host::bytes(invite), closure("PBB_v", [this](const host::Call& c) {
            r_.joined = {eos_sim::ticks(), c.args[0].bytes, c.args[1].bytes};
            say_now("joined: lobby " + short_id(c.args[0].bytes) + ", host's connection key " + quoted(c.args[1].bytes));
        }));
        wait_for("join the inviter's lobby", [&] { return r_.joined.tick != 0; });
    }

    void overlay_acceptance() {
        wait_for("invitation accepted in the overlay", [&] { return r_.overlay.tick != 0; });
    }

    void leave_and_destroy() {
        p_.leave_lobby(host::bytes(r_.joined.lobby_id.value_or("")), closure("Pi_v", [this](const host::Call& c) {
            r_.left = c.args[0].i;
            say_now("left lobby " + short_id(r_.joined.lobby_id) + ": result " + result_text(r_.left));
        }));
        p_.destroy_lobby(host::bytes(*r_.lobby_id), closure("Pi_v", [this](const host::Call& c) {
            r_.destroyed = c.args[0].i;
            say_now("destroyed lobby " + short_id(r_.lobby_id) + ": result " + result_text(r_.destroyed));
        }));
        wait_for("leave the lobby", [&] { return r_.left != -1; });
        wait_for("destroy the lobby", [&] { return r_.destroyed != -1; });
    }
};

}  // namespace

Report run(const Options& options, std::ostream& out) { return Tour(options, out).run(); }

}  // namespace tour
