// World files: the JSON form of a simulated world (accounts, friends, presences, achievements,
// ownership, lobbies and a script of timed events), its reader with precise error messages, its
// writer, and the loading of EOS_SIM_WORLD when EOS_Initialize runs.
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <set>
#include <sstream>
#include <stdexcept>

#include "script.h"
#include "sim_internal.h"

namespace eos_sim {

using sim::is_member;

namespace {

using json = nlohmann::json;

// ---- names used in files --------------------------------------------------------------------

const std::vector<std::pair<std::string, EOS_EResult>>& result_names() {
    static const std::vector<std::pair<std::string, EOS_EResult>> names = {
#define EOS_RESULT_VALUE(Name, Value) {#Name, EOS_EResult::Name},
#define EOS_RESULT_VALUE_LAST(Name, Value) {#Name, EOS_EResult::Name},
#include "eos_result.h"
#undef EOS_RESULT_VALUE
#undef EOS_RESULT_VALUE_LAST
    };
    return names;
}

template <class E>
struct Named {
    const char* name;
    E value;
};

const Named<EOS_Presence_EStatus> kStatuses[] = {
    {"offline", EOS_Presence_EStatus::EOS_PS_Offline},
    {"online", EOS_Presence_EStatus::EOS_PS_Online},
    {"away", EOS_Presence_EStatus::EOS_PS_Away},
    {"extended_away", EOS_Presence_EStatus::EOS_PS_ExtendedAway},
    {"do_not_disturb", EOS_Presence_EStatus::EOS_PS_DoNotDisturb},
};

const Named<EOS_ELobbyPermissionLevel> kPermissions[] = {
    {"public_advertised", EOS_ELobbyPermissionLevel::EOS_LPL_PUBLICADVERTISED},
    {"join_via_presence", EOS_ELobbyPermissionLevel::EOS_LPL_JOINVIAPRESENCE},
    {"invite_only", EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY},
};

const Named<EOS_EAttributeType> kAttributeTypes[] = {
    {"bool", EOS_EAttributeType::EOS_AT_BOOLEAN},
    {"int64", EOS_EAttributeType::EOS_AT_INT64},
    {"double", EOS_EAttributeType::EOS_AT_DOUBLE},
    {"string", EOS_EAttributeType::EOS_AT_STRING},
};

const Named<EOS_ELobbyAttributeVisibility> kVisibilities[] = {
    {"public", EOS_ELobbyAttributeVisibility::EOS_LAT_PUBLIC},
    {"private", EOS_ELobbyAttributeVisibility::EOS_LAT_PRIVATE},
};

const Named<ScriptEvent::Action> kActions[] = {
    {"invite", ScriptEvent::Action::Invite},
    {"overlay_accept_invite", ScriptEvent::Action::OverlayAcceptInvite},
    {"overlay_accept_join", ScriptEvent::Action::OverlayAcceptJoin},
    {"accept_invitation", ScriptEvent::Action::AcceptInvitation},
    {"fail", ScriptEvent::Action::Fail},
};

template <class E, size_t N>
const char* name_of(const Named<E> (&table)[N], E value) {
    for (const auto& n : table)
        if (n.value == value) return n.name;
    return "?";
}

std::string result_name(EOS_EResult code) {
    for (const auto& [name, value] : result_names())
        if (value == code) return name;
    return std::to_string(static_cast<int32_t>(code));
}

bool hex32(const std::string& s) {
    if (s.size() != 32) return false;
    for (char c : s)
        if (!((c >= '0' && c <= '9') || (c >= 'a' && c <= 'f'))) return false;
    return true;
}

// ---- reading --------------------------------------------------------------------------------

// Where a value sits in the document, as a JSON pointer; every error names it.
class Reader {
public:
    explicit Reader(std::string source) : source_(std::move(source)) {}

    [[noreturn]] void fail(const std::string& where, const std::string& what) const {
        throw std::runtime_error(source_ + ": " + (where.empty() ? std::string("/") : where) + ": " + what);
    }

    static std::string at(const std::string& where, const std::string& key) {
        std::string escaped;
        for (char c : key) {
            if (c == '~')
                escaped += "~0";
            else if (c == '/')
                escaped += "~1";
            else
                escaped += c;
        }
        return where + "/" + escaped;
    }
    static std::string at(const std::string& where, size_t index) { return where + "/" + std::to_string(index); }

    // Every key of the object must be one of `allowed` ("comment" is always allowed and ignored).
    void only(const json& object, const std::string& where, std::initializer_list<const char*> allowed) const {
        for (auto it = object.begin(); it != object.end(); ++it) {
            if (it.key() == "comment") continue;
            bool known = false;
            for (const char* a : allowed) known = known || it.key() == a;
            if (known) continue;
            std::string list;
            for (const char* a : allowed) list += std::string(list.empty() ? "" : ", ") + a;
            fail(at(where, it.key()), "unknown key \"" + it.key() + "\" (expected one of: " + list + ")");
        }
    }

    const json& object(const json& v, const std::string& where) const {
        if (!v.is_object()) fail(where, std::string("expected an object, got ") + v.type_name());
        return v;
    }
    const json& array(const json& v, const std::string& where) const {
        if (!v.is_array()) fail(where, std::string("expected an array, got ") + v.type_name());
        return v;
    }
    std::string string(const json& v, const std::string& where, bool non_empty = true) const {
        if (!v.is_string()) fail(where, std::string("expected a string, got ") + v.type_name());
        std::string s = v.get<std::string>();
        if (non_empty && s.empty()) fail(where, "must not be empty");
        return s;
    }
    bool boolean(const json& v, const std::string& where) const {
        if (!v.is_boolean()) fail(where, std::string("expected true or false, got ") + v.type_name());
        return v.get<bool>();
    }
    int64_t integer(const json& v, const std::string& where, int64_t min, int64_t max) const {
        if (!v.is_number_integer()) fail(where, std::string("expected an integer, got ") + v.type_name());
        if (v.is_number_unsigned() && v.get<uint64_t>() > static_cast<uint64_t>(INT64_MAX))
            fail(where, "must be at most " + std::to_string(max));
        const int64_t n = v.get<int64_t>();
        if (n < min) fail(where, "must be at least " + std::to_string(min));
        if (n > max) fail(where, "must be at most " + std::to_string(max));
        return n;
    }
    template <class E, size_t N>
    E named(const json& v, const std::string& where, const Named<E> (&table)[N]) const {
        const std::string s = string(v, where);
        std::string list;
        for (const auto& n : table) {
            if (s == n.name) return n.value;
            list += std::string(list.empty() ? "" : ", ") + n.name;
        }
        fail(where, "unknown value \"" + s + "\" (expected one of: " + list + ")");
    }
    // An account name that must exist.
    std::string account(const json& v, const std::string& where, const std::set<std::string>& accounts) const {
        const std::string name = string(v, where);
        if (!accounts.count(name)) fail(where, "\"" + name + "\" is not an account");
        return name;
    }

private:
    std::string source_;
};

Account read_account(const Reader& r, const json& v, const std::string& where) {
    r.object(v, where);
    r.only(v, where,
           {"name", "display_name", "epic_id", "product_user_id", "has_connect_user", "credential", "friends",
            "presence", "achievements", "ownership", "accepts_invites_after"});
    Account a;
    if (!v.contains("name")) r.fail(where, "missing key \"name\"");
    a.name = r.string(v["name"], Reader::at(where, "name"));
    if (v.contains("display_name") && !v["display_name"].is_null())
        a.display_name = r.string(v["display_name"], Reader::at(where, "display_name"), false);
    if (v.contains("epic_id")) {
        a.epic_id = r.string(v["epic_id"], Reader::at(where, "epic_id"));
        if (!hex32(a.epic_id)) r.fail(Reader::at(where, "epic_id"), "expected 32 lowercase hexadecimal digits");
    }
    bool no_product_user = false;
    if (v.contains("product_user_id")) {
        const std::string here = Reader::at(where, "product_user_id");
        if (v["product_user_id"].is_null()) {
            no_product_user = true;
            a.has_connect_user = false;
        } else {
            a.product_user_id = r.string(v["product_user_id"], here);
            if (!hex32(a.product_user_id)) r.fail(here, "expected 32 lowercase hexadecimal digits or null");
        }
    }
    if (v.contains("has_connect_user")) {
        const std::string here = Reader::at(where, "has_connect_user");
        a.has_connect_user = r.boolean(v["has_connect_user"], here);
        if (no_product_user && a.has_connect_user) r.fail(here, "true, but product_user_id is null");
    }
    if (v.contains("credential")) a.credential = r.string(v["credential"], Reader::at(where, "credential"));
    if (v.contains("presence") && !v["presence"].is_null()) {
        const std::string here = Reader::at(where, "presence");
        const json& p = r.object(v["presence"], here);
        r.only(p, here, {"status", "product"});
        Presence presence;
        if (p.contains("status")) presence.status = r.named(p["status"], Reader::at(here, "status"), kStatuses);
        if (p.contains("product") && !p["product"].is_null())
            presence.product_id = r.string(p["product"], Reader::at(here, "product"));
        a.presence = presence;
    }
    if (v.contains("achievements")) {
        const std::string here = Reader::at(where, "achievements");
        const json& list = r.array(v["achievements"], here);
        std::set<std::string> seen;
        for (size_t i = 0; i < list.size(); ++i) {
            const std::string at = Reader::at(here, i);
            r.object(list[i], at);
            r.only(list[i], at, {"id", "unlock_time"});
            if (!list[i].contains("id")) r.fail(at, "missing key \"id\"");
            Achievement ach;
            ach.id = r.string(list[i]["id"], Reader::at(at, "id"));
            if (!seen.insert(ach.id).second) r.fail(Reader::at(at, "id"), "achievement \"" + ach.id + "\" is listed twice");
            if (list[i].contains("unlock_time") && !list[i]["unlock_time"].is_null())
                ach.unlock_time = r.integer(list[i]["unlock_time"], Reader::at(at, "unlock_time"), INT64_MIN, INT64_MAX);
            a.achievements.push_back(ach);
        }
    }
    if (v.contains("ownership")) {
        const std::string here = Reader::at(where, "ownership");
        const json& items = r.object(v["ownership"], here);
        for (auto it = items.begin(); it != items.end(); ++it) {
            if (it.key() == "comment") continue;
            if (it.key().empty()) r.fail(Reader::at(here, it.key()), "a catalogue item id must not be empty");
            a.ownership[it.key()] = r.boolean(it.value(), Reader::at(here, it.key())) ? EOS_EOwnershipStatus::EOS_OS_Owned
                                                                                     : EOS_EOwnershipStatus::EOS_OS_NotOwned;
        }
    }
    if (v.contains("accepts_invites_after"))
        a.accepts_invites_after =
            static_cast<int>(r.integer(v["accepts_invites_after"], Reader::at(where, "accepts_invites_after"), 0, 1000000));
    return a;
}

// Friends are read once every account is known, so that a friend may be listed before its account.
void read_friends(const Reader& r, const json& v, const std::string& where, const std::set<std::string>& names,
                  Account& a) {
    if (!v.contains("friends")) return;
    const std::string here = Reader::at(where, "friends");
    const json& list = r.array(v["friends"], here);
    for (size_t i = 0; i < list.size(); ++i) {
        const std::string at = Reader::at(here, i);
        FriendEntry f;
        if (list[i].is_object()) {
            r.only(list[i], at, {"account", "invalid"});
            if (!list[i].contains("account")) r.fail(at, "missing key \"account\"");
            f.account = r.account(list[i]["account"], Reader::at(at, "account"), names);
            if (list[i].contains("invalid")) f.invalid = r.boolean(list[i]["invalid"], Reader::at(at, "invalid"));
        } else if (list[i].is_string()) {
            f.account = r.account(list[i], at, names);
        } else {
            r.fail(at, std::string("expected an account name or an object, got ") + list[i].type_name());
        }
        a.friends.push_back(f);
    }
}

Attribute read_attribute(const Reader& r, const json& v, const std::string& where) {
    r.object(v, where);
    r.only(v, where, {"key", "value", "type", "visibility"});
    if (!v.contains("key")) r.fail(where, "missing key \"key\"");
    if (!v.contains("value")) r.fail(where, "missing key \"value\"");
    Attribute a;
    a.key = r.string(v["key"], Reader::at(where, "key"));
    const json& value = v["value"];
    const std::string vat = Reader::at(where, "value");
    if (v.contains("type")) {
        a.type = r.named(v["type"], Reader::at(where, "type"), kAttributeTypes);
    } else if (value.is_boolean()) {
        a.type = EOS_EAttributeType::EOS_AT_BOOLEAN;
    } else if (value.is_number_integer()) {
        a.type = EOS_EAttributeType::EOS_AT_INT64;
    } else if (value.is_number_float()) {
        a.type = EOS_EAttributeType::EOS_AT_DOUBLE;
    } else if (value.is_string()) {
        a.type = EOS_EAttributeType::EOS_AT_STRING;
    } else {
        r.fail(vat, std::string("expected a string, a number or true/false, got ") + value.type_name());
    }
    switch (a.type) {
        case EOS_EAttributeType::EOS_AT_BOOLEAN: a.as_bool = r.boolean(value, vat); break;
        case EOS_EAttributeType::EOS_AT_INT64: a.as_int64 = r.integer(value, vat, INT64_MIN, INT64_MAX); break;
        case EOS_EAttributeType::EOS_AT_DOUBLE:
            if (!value.is_number()) r.fail(vat, std::string("expected a number, got ") + value.type_name());
            a.as_double = value.get<double>();
            break;
        case EOS_EAttributeType::EOS_AT_STRING: a.as_utf8 = r.string(value, vat, false); break;
    }
    if (v.contains("visibility")) a.visibility = r.named(v["visibility"], Reader::at(where, "visibility"), kVisibilities);
    return a;
}

Lobby read_lobby(const Reader& r, const json& v, const std::string& where, const std::set<std::string>& names) {
    r.object(v, where);
    r.only(v, where,
           {"id", "owner", "members", "max_members", "permission", "presence_enabled", "allow_invites",
            "allow_host_migration", "bucket_id", "attributes"});
    Lobby l;
    if (!v.contains("id")) r.fail(where, "missing key \"id\"");
    if (!v.contains("owner")) r.fail(where, "missing key \"owner\"");
    l.id = r.string(v["id"], Reader::at(where, "id"));
    if (l.id.size() < EOS_LOBBY_MIN_LOBBYIDOVERRIDE_LENGTH || l.id.size() > EOS_LOBBY_MAX_LOBBYIDOVERRIDE_LENGTH)
        r.fail(Reader::at(where, "id"), "a lobby id has " + std::to_string(EOS_LOBBY_MIN_LOBBYIDOVERRIDE_LENGTH) + " to " +
                                            std::to_string(EOS_LOBBY_MAX_LOBBYIDOVERRIDE_LENGTH) + " characters");
    l.owner = r.account(v["owner"], Reader::at(where, "owner"), names);
    l.members = {l.owner};
    if (v.contains("members")) {
        const std::string here = Reader::at(where, "members");
        const json& list = r.array(v["members"], here);
        for (size_t i = 0; i < list.size(); ++i) {
            const std::string name = r.account(list[i], Reader::at(here, i), names);
            if (name == l.owner) continue;
            if (is_member(l, name)) r.fail(Reader::at(here, i), "\"" + name + "\" is listed twice");
            l.members.push_back(name);
        }
    }
    if (v.contains("max_members"))
        l.max_members = static_cast<uint32_t>(
            r.integer(v["max_members"], Reader::at(where, "max_members"), 1, EOS_LOBBY_MAX_LOBBY_MEMBERS));
    if (l.members.size() > l.max_members)
        r.fail(Reader::at(where, "members"), std::to_string(l.members.size()) + " members, more than max_members (" +
                                                 std::to_string(l.max_members) + ")");
    if (v.contains("permission")) l.permission = r.named(v["permission"], Reader::at(where, "permission"), kPermissions);
    if (v.contains("presence_enabled"))
        l.presence_enabled = r.boolean(v["presence_enabled"], Reader::at(where, "presence_enabled"));
    if (v.contains("allow_invites")) l.allow_invites = r.boolean(v["allow_invites"], Reader::at(where, "allow_invites"));
    if (v.contains("allow_host_migration"))
        l.allow_host_migration = r.boolean(v["allow_host_migration"], Reader::at(where, "allow_host_migration"));
    if (v.contains("bucket_id")) l.bucket_id = r.string(v["bucket_id"], Reader::at(where, "bucket_id"), false);
    if (v.contains("attributes")) {
        const std::string here = Reader::at(where, "attributes");
        const json& list = r.array(v["attributes"], here);
        for (size_t i = 0; i < list.size(); ++i) {
            Attribute a = read_attribute(r, list[i], Reader::at(here, i));
            for (const auto& b : l.attributes)
                if (b.key == a.key) r.fail(Reader::at(Reader::at(here, i), "key"), "attribute \"" + a.key + "\" is listed twice");
            l.attributes.push_back(a);
        }
        if (l.attributes.size() > EOS_LOBBYMODIFICATION_MAX_ATTRIBUTES)
            r.fail(here, "more than " + std::to_string(EOS_LOBBYMODIFICATION_MAX_ATTRIBUTES) + " attributes");
    }
    return l;
}

struct ScriptRefs {
    std::set<std::string> accounts;
    std::map<std::string, const Lobby*> lobbies;
};

ScriptEvent read_event(const Reader& r, const json& v, const std::string& where, const ScriptRefs& refs) {
    r.object(v, where);
    if (!v.contains("do")) r.fail(where, "missing key \"do\"");
    ScriptEvent e;
    e.action = r.named(v["do"], Reader::at(where, "do"), kActions);
    switch (e.action) {
        case ScriptEvent::Action::Invite:
            r.only(v, where, {"name", "at", "after", "ticks", "after_sign_in", "do", "from", "lobby", "connection_key"});
            break;
        case ScriptEvent::Action::OverlayAcceptInvite:
            r.only(v, where, {"name", "at", "after", "ticks", "after_sign_in", "do", "invite"});
            break;
        case ScriptEvent::Action::OverlayAcceptJoin:
            r.only(v, where, {"name", "at", "after", "ticks", "after_sign_in", "do", "lobby"});
            break;
        case ScriptEvent::Action::AcceptInvitation:
            r.only(v, where, {"name", "at", "after", "ticks", "after_sign_in", "do", "account"});
            break;
        case ScriptEvent::Action::Fail:
            r.only(v, where, {"name", "at", "after", "ticks", "after_sign_in", "do", "function", "code", "times"});
            break;
    }
    if (v.contains("name")) e.name = r.string(v["name"], Reader::at(where, "name"));

    const int timings = v.contains("at") + v.contains("after") + v.contains("after_sign_in");
    if (timings != 1) r.fail(where, "needs exactly one of \"at\", \"after\" and \"after_sign_in\"");
    if (v.contains("ticks") && !v.contains("after")) r.fail(Reader::at(where, "ticks"), "only goes with \"after\"");
    constexpr int64_t kMaxTick = int64_t(1) << 40;
    if (v.contains("at")) {
        e.when = ScriptEvent::When::AtTick;
        e.ticks = static_cast<uint64_t>(r.integer(v["at"], Reader::at(where, "at"), 0, kMaxTick));
        if (e.ticks == 0 && e.action != ScriptEvent::Action::Fail)
            r.fail(Reader::at(where, "at"), "only a \"fail\" event can happen at tick 0, before the platform exists");
    } else if (v.contains("after")) {
        e.when = ScriptEvent::When::AfterEvent;
        e.after = r.string(v["after"], Reader::at(where, "after"));   // resolved once every event is read
        if (v.contains("ticks")) e.ticks = static_cast<uint64_t>(r.integer(v["ticks"], Reader::at(where, "ticks"), 0, kMaxTick));
    } else {
        e.when = ScriptEvent::When::AfterSignIn;
        e.ticks = static_cast<uint64_t>(r.integer(v["after_sign_in"], Reader::at(where, "after_sign_in"), 0, kMaxTick));
    }

    auto lobby_ref = [&](const char* key) {
        const std::string at = Reader::at(where, key);
        const std::string id = r.string(v[key], at);
        if (!refs.lobbies.count(id)) r.fail(at, "\"" + id + "\" is not a lobby of this world");
        return id;
    };
    auto required = [&](const char* key) {
        if (!v.contains(key)) r.fail(where, std::string("missing key \"") + key + "\"");
    };
    switch (e.action) {
        case ScriptEvent::Action::Invite: {
            required("from");
            e.account = r.account(v["from"], Reader::at(where, "from"), refs.accounts);
            if (v.contains("lobby") == v.contains("connection_key"))
                r.fail(where, "an invite needs either \"lobby\" (an existing lobby) or \"connection_key\" (a new lobby)");
            if (v.contains("lobby")) {
                e.lobby_id = lobby_ref("lobby");
                if (!is_member(*refs.lobbies.at(e.lobby_id), e.account))
                    r.fail(Reader::at(where, "from"), "\"" + e.account + "\" is not a member of lobby \"" + e.lobby_id + "\"");
            } else {
                e.connection_key = r.string(v["connection_key"], Reader::at(where, "connection_key"), false);
            }
            break;
        }
        case ScriptEvent::Action::OverlayAcceptInvite:
            required("invite");
            e.invite = r.string(v["invite"], Reader::at(where, "invite"));   // resolved with the names
            break;
        case ScriptEvent::Action::OverlayAcceptJoin:
            required("lobby");
            e.lobby_id = lobby_ref("lobby");
            break;
        case ScriptEvent::Action::AcceptInvitation:
            required("account");
            e.account = r.account(v["account"], Reader::at(where, "account"), refs.accounts);
            break;
        case ScriptEvent::Action::Fail: {
            required("function");
            required("code");
            e.function = r.string(v["function"], Reader::at(where, "function"));
            if (e.function.rfind("EOS_", 0) != 0)
                r.fail(Reader::at(where, "function"), "expected the name of an EOS_* function");
            const json& code = v["code"];
            const std::string cat = Reader::at(where, "code");
            bool known = false;
            if (code.is_string()) {
                const std::string name = code.get<std::string>();
                for (const auto& [n, value] : result_names())
                    if (n == name) {
                        e.code = value;
                        known = true;
                    }
                if (!known) r.fail(cat, "unknown result \"" + name + "\" (expected a name such as \"EOS_NotFound\")");
            } else {
                const int64_t n = r.integer(code, cat, INT32_MIN, INT32_MAX);
                for (const auto& [name, value] : result_names())
                    if (static_cast<int64_t>(value) == n) {
                        e.code = value;
                        known = true;
                    }
                if (!known) r.fail(cat, "unknown result code " + std::to_string(n));
            }
            if (e.code == EOS_EResult::EOS_Success) r.fail(cat, "a failure needs a code other than EOS_Success");
            if (v.contains("times")) {
                const std::string tat = Reader::at(where, "times");
                if (v["times"].is_string() && v["times"].get<std::string>() == "always")
                    e.times = -1;
                else if (v["times"].is_number_integer())
                    e.times = static_cast<int>(r.integer(v["times"], tat, 1, 1000000));
                else
                    r.fail(tat, std::string("expected a positive integer or \"always\", got ") + v["times"].type_name());
            }
            break;
        }
    }
    return e;
}

void read_script(const Reader& r, const json& list, const std::string& where, const ScriptRefs& refs, World& w) {
    r.array(list, where);
    std::map<std::string, size_t> by_name;
    for (size_t i = 0; i < list.size(); ++i) {
        ScriptEvent e = read_event(r, list[i], Reader::at(where, i), refs);
        if (!e.name.empty() && !by_name.emplace(e.name, i).second)
            r.fail(Reader::at(Reader::at(where, i), "name"), "event name \"" + e.name + "\" is used twice");
        w.script.push_back(e);
    }
    for (size_t i = 0; i < w.script.size(); ++i) {
        const ScriptEvent& e = w.script[i];
        const std::string at = Reader::at(where, i);
        if (e.when == ScriptEvent::When::AfterEvent) {
            auto it = by_name.find(e.after);
            if (it == by_name.end()) r.fail(Reader::at(at, "after"), "\"" + e.after + "\" is not an event name");
            if (it->second == i) r.fail(Reader::at(at, "after"), "an event cannot wait for itself");
        }
        if (e.action == ScriptEvent::Action::OverlayAcceptInvite) {
            auto it = by_name.find(e.invite);
            if (it == by_name.end()) r.fail(Reader::at(at, "invite"), "\"" + e.invite + "\" is not an event name");
            if (w.script[it->second].action != ScriptEvent::Action::Invite)
                r.fail(Reader::at(at, "invite"), "\"" + e.invite + "\" is not an invite event");
        }
    }
    // An "after" chain that comes back to where it started would never fire.
    for (size_t i = 0; i < w.script.size(); ++i) {
        std::set<size_t> seen{i};
        size_t k = i;
        while (w.script[k].when == ScriptEvent::When::AfterEvent) {
            k = by_name.at(w.script[k].after);
            if (!seen.insert(k).second) {
                if (k == i) r.fail(Reader::at(Reader::at(where, i), "after"), "the events wait for each other in a circle");
                break;   // a circle further down the chain: reported at its own events
            }
        }
    }
}

}  // namespace

World parse_world(const json& doc, const std::string& source) {
    const Reader r(source);
    r.object(doc, "");
    r.only(doc, "", {"local_account", "accounts", "lobbies", "script"});
    if (!doc.contains("accounts")) r.fail("", "missing key \"accounts\"");
    if (!doc.contains("local_account")) r.fail("", "missing key \"local_account\"");
    World w;
    const json& accounts = r.array(doc["accounts"], "/accounts");
    std::set<std::string> names;
    std::map<std::string, std::string> epic_ids, product_ids, credentials;   // value -> account using it
    for (size_t i = 0; i < accounts.size(); ++i) {
        const std::string where = Reader::at("/accounts", i);
        Account a = read_account(r, accounts[i], where);
        if (!names.insert(a.name).second) r.fail(Reader::at(where, "name"), "account \"" + a.name + "\" is defined twice");
        // The ids and credential the simulator will give the account (derived ones included) must be its own.
        const std::string epic = a.epic_id.empty() ? derive_id("epic:" + a.name) : a.epic_id;
        const std::string puid = a.product_user_id.empty() ? derive_id("puid:" + a.name) : a.product_user_id;
        const std::string credential = a.credential.empty() ? a.name : a.credential;
        if (!epic_ids.emplace(epic, a.name).second)
            r.fail(Reader::at(where, "epic_id"), "the same Epic account id as \"" + epic_ids[epic] + "\"");
        if (!product_ids.emplace(puid, a.name).second)
            r.fail(Reader::at(where, "product_user_id"), "the same product user id as \"" + product_ids[puid] + "\"");
        if (!credentials.emplace(credential, a.name).second)
            r.fail(Reader::at(where, a.credential.empty() ? "name" : "credential"),
                   "credential \"" + credential + "\" already signs in \"" + credentials[credential] + "\"");
        w.accounts.push_back(std::move(a));
    }
    for (size_t i = 0; i < accounts.size(); ++i)
        read_friends(r, accounts[i], Reader::at("/accounts", i), names, w.accounts[i]);
    w.local_account = r.account(doc["local_account"], "/local_account", names);

    ScriptRefs refs;
    refs.accounts = names;
    if (doc.contains("lobbies")) {
        const json& lobbies = r.array(doc["lobbies"], "/lobbies");
        for (size_t i = 0; i < lobbies.size(); ++i) {
            const std::string where = Reader::at("/lobbies", i);
            Lobby l = read_lobby(r, lobbies[i], where, names);
            for (const auto& other : w.lobbies)
                if (other.id == l.id) r.fail(Reader::at(where, "id"), "lobby \"" + l.id + "\" is defined twice");
            w.lobbies.push_back(std::move(l));
        }
        for (const auto& l : w.lobbies) refs.lobbies[l.id] = &l;
    }
    if (doc.contains("script")) read_script(r, doc["script"], "/script", refs, w);
    return w;
}

World load_world_file(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    if (!in) throw std::runtime_error(path + ": cannot be opened");
    std::stringstream text;
    text << in.rdbuf();
    json doc;
    try {
        doc = json::parse(text.str());
    } catch (const json::parse_error& e) {
        // "[json.exception.parse_error.101] parse error at line 3, column 5: ..." without its tag
        std::string what = e.what();
        const size_t tag = what.find("] ");
        if (tag != std::string::npos) what = what.substr(tag + 2);
        throw std::runtime_error(path + ": not valid JSON: " + what);
    }
    return parse_world(doc, path);
}

json world_to_json(const World& w) {
    json doc = json::object();
    doc["local_account"] = w.local_account;
    json accounts = json::array();
    for (const Account& a : w.accounts) {
        json j = {{"name", a.name}};
        if (a.display_name) j["display_name"] = *a.display_name;
        if (!a.epic_id.empty()) j["epic_id"] = a.epic_id;
        if (!a.product_user_id.empty())
            j["product_user_id"] = a.product_user_id;
        else if (!a.has_connect_user)
            j["product_user_id"] = nullptr;
        if (!a.has_connect_user && !a.product_user_id.empty()) j["has_connect_user"] = false;
        if (!a.credential.empty() && a.credential != a.name) j["credential"] = a.credential;
        if (!a.friends.empty()) {
            json friends = json::array();
            for (const FriendEntry& f : a.friends)
                friends.push_back(f.invalid ? json({{"account", f.account}, {"invalid", true}}) : json(f.account));
            j["friends"] = friends;
        }
        if (a.presence) {
            json p = {{"status", name_of(kStatuses, a.presence->status)}};
            if (a.presence->product_id) p["product"] = *a.presence->product_id;
            j["presence"] = p;
        }
        if (!a.achievements.empty()) {
            json list = json::array();
            for (const Achievement& ach : a.achievements) {
                json e = {{"id", ach.id}};
                if (ach.unlock_time != -1) e["unlock_time"] = ach.unlock_time;
                list.push_back(e);
            }
            j["achievements"] = list;
        }
        if (!a.ownership.empty()) {
            json items = json::object();
            for (const auto& [item, status] : a.ownership) items[item] = status == EOS_EOwnershipStatus::EOS_OS_Owned;
            j["ownership"] = items;
        }
        if (a.accepts_invites_after) j["accepts_invites_after"] = *a.accepts_invites_after;
        accounts.push_back(j);
    }
    doc["accounts"] = accounts;
    if (!w.lobbies.empty()) {
        json lobbies = json::array();
        for (const Lobby& l : w.lobbies) {
            json j = {{"id", l.id}, {"owner", l.owner}};
            json members = json::array();
            for (const std::string& m : l.members)
                if (m != l.owner) members.push_back(m);
            if (!members.empty()) j["members"] = members;
            const Lobby defaults;
            if (l.max_members != defaults.max_members) j["max_members"] = l.max_members;
            if (l.permission != defaults.permission) j["permission"] = name_of(kPermissions, l.permission);
            if (l.presence_enabled != defaults.presence_enabled) j["presence_enabled"] = l.presence_enabled;
            if (l.allow_invites != defaults.allow_invites) j["allow_invites"] = l.allow_invites;
            if (l.allow_host_migration != defaults.allow_host_migration) j["allow_host_migration"] = l.allow_host_migration;
            if (!l.bucket_id.empty()) j["bucket_id"] = l.bucket_id;
            if (!l.attributes.empty()) {
                json attrs = json::array();
                for (const Attribute& a : l.attributes) {
                    json e = {{"key", a.key}, {"type", name_of(kAttributeTypes, a.type)}};
                    switch (a.type) {
                        case EOS_EAttributeType::EOS_AT_BOOLEAN: e["value"] = a.as_bool; break;
                        case EOS_EAttributeType::EOS_AT_INT64: e["value"] = a.as_int64; break;
                        case EOS_EAttributeType::EOS_AT_DOUBLE: e["value"] = a.as_double; break;
                        case EOS_EAttributeType::EOS_AT_STRING: e["value"] = a.as_utf8; break;
                    }
                    if (a.visibility != EOS_ELobbyAttributeVisibility::EOS_LAT_PUBLIC)
                        e["visibility"] = name_of(kVisibilities, a.visibility);
                    attrs.push_back(e);
                }
                j["attributes"] = attrs;
            }
            lobbies.push_back(j);
        }
        doc["lobbies"] = lobbies;
    }
    if (!w.script.empty()) {
        json script = json::array();
        for (const ScriptEvent& e : w.script) {
            json j = json::object();
            if (!e.name.empty()) j["name"] = e.name;
            switch (e.when) {
                case ScriptEvent::When::AtTick: j["at"] = e.ticks; break;
                case ScriptEvent::When::AfterEvent:
                    j["after"] = e.after;
                    j["ticks"] = e.ticks;
                    break;
                case ScriptEvent::When::AfterSignIn: j["after_sign_in"] = e.ticks; break;
            }
            j["do"] = name_of(kActions, e.action);
            switch (e.action) {
                case ScriptEvent::Action::Invite:
                    j["from"] = e.account;
                    if (!e.lobby_id.empty())
                        j["lobby"] = e.lobby_id;
                    else
                        j["connection_key"] = e.connection_key;
                    break;
                case ScriptEvent::Action::OverlayAcceptInvite: j["invite"] = e.invite; break;
                case ScriptEvent::Action::OverlayAcceptJoin: j["lobby"] = e.lobby_id; break;
                case ScriptEvent::Action::AcceptInvitation: j["account"] = e.account; break;
                case ScriptEvent::Action::Fail:
                    j["function"] = e.function;
                    j["code"] = result_name(e.code);
                    if (e.times < 0)
                        j["times"] = "always";
                    else
                        j["times"] = e.times;
                    break;
            }
            script.push_back(j);
        }
        doc["script"] = script;
    }
    return doc;
}

namespace {
std::string& chosen_world_file() {
    static std::string path;
    return path;
}
}  // namespace

void set_world_file(const std::string& path) { chosen_world_file() = path; }

}  // namespace eos_sim

namespace eos_sim::sim {

bool load_world_at_initialize() {
    std::string path = chosen_world_file();
    if (path.empty()) {
        const char* env = std::getenv("EOS_SIM_WORLD");
        if (env != nullptr) path = env;
    }
    if (path.empty()) return true;
    World w;
    try {
        w = load_world_file(path);
    } catch (const std::exception& e) {
        // The log callback can only be installed once EOS_Initialize has succeeded, so stderr is
        // what a developer sees; the log line reaches a callback kept from an earlier session.
        std::fprintf(stderr, "EOS simulator: world file rejected: %s\n", e.what());
        log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Error, std::string("World file rejected: ") + e.what());
        return false;
    }
    set_world(w);
    script_world_loaded();
    return true;
}

}  // namespace eos_sim::sim
