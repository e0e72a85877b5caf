// Lobbies: creation, modification, leaving and destruction, invitations, joining, lobby details
// handles, the three lobby notifications, and the controls that play other players and the overlay.
#include <cstring>

#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;
using eos_sim::Attribute;
using eos_sim::Invitation;
using eos_sim::Lobby;

namespace {

const auto kLobby = EOS_ELogCategory::EOS_LC_Lobby;
const char* const kDetails = "EOS_HLobbyDetails";
const char* const kModification = "EOS_HLobbyModification";

struct DetailsHolder {
    Lobby snapshot;                            // the lobby as its viewer saw it when copied
};

struct ModHolder {
    std::string lobby_id;
    std::string account;                       // who asked for the modification
    std::vector<Attribute> adds;               // one per key, latest value wins
};

struct InfoCopy {
    EOS_LobbyDetails_Info info{};
    std::string id, bucket;
};

struct AttrCopy {
    EOS_Lobby_Attribute attr{};
    EOS_Lobby_AttributeData data{};
    std::string key, value;
};

bool present(const char* s) { return s != nullptr && s[0] != '\0'; }

json attribute_json(const Attribute& a) {
    json j = {{"Key", a.key}, {"ValueType", static_cast<int32_t>(a.type)},
              {"Visibility", static_cast<int32_t>(a.visibility)}};
    switch (a.type) {
        case EOS_EAttributeType::EOS_AT_BOOLEAN: j["Value"] = a.as_bool; break;
        case EOS_EAttributeType::EOS_AT_INT64: j["Value"] = a.as_int64; break;
        case EOS_EAttributeType::EOS_AT_DOUBLE: j["Value"] = a.as_double; break;
        case EOS_EAttributeType::EOS_AT_STRING: j["Value"] = a.as_utf8; break;
    }
    return j;
}

// Private attributes are seen by members only.
Lobby as_seen_by(const Lobby& l, const std::string& viewer) {
    Lobby copy = l;
    if (!is_member(l, viewer)) {
        auto& attrs = copy.attributes;
        attrs.erase(std::remove_if(attrs.begin(), attrs.end(),
                                   [](const Attribute& a) {
                                       return a.visibility == EOS_ELobbyAttributeVisibility::EOS_LAT_PRIVATE;
                                   }),
                    attrs.end());
    }
    return copy;
}

EOS_HLobbyDetails new_details(Platform* platform, const Lobby& lobby, const std::string& viewer) {
    auto* h = new DetailsHolder{as_seen_by(lobby, viewer)};
    track_copy(kDetails, platform, h, h, [h]() { delete h; });
    return reinterpret_cast<EOS_HLobbyDetails>(h);
}

std::string puid_of(const std::string& account) {
    Account* a = account_by_name(account);
    return a ? a->product_user_id : std::string();
}

EOS_ProductUserId puid_handle(const std::string& account) {
    Account* a = account_by_name(account);
    return a ? intern_product(a->product_user_id) : nullptr;
}

void set_attribute(std::vector<Attribute>& attrs, const Attribute& a) {
    for (auto& existing : attrs)
        if (existing.key == a.key) {
            existing = a;
            return;
        }
    attrs.push_back(a);
}

size_t merged_count(const std::vector<Attribute>& base, const std::vector<Attribute>& adds) {
    size_t n = base.size();
    for (auto& a : adds) {
        bool found = false;
        for (auto& b : base) found = found || b.key == a.key;
        if (!found) ++n;
    }
    return n;
}

// Checks {LocalUserId, LobbyId} of the leave/destroy/modification options.
EOS_EResult user_and_lobby(Op& op, EOS_ProductUserId user, const char* lobby_id, Account** account) {
    EOS_EResult r = connect_user(op, user, account, kLobby, "LocalUserId");
    if (r != EOS_EResult::EOS_Success) return r;
    if (!present(lobby_id)) return op.invalid(kLobby, "LobbyId: empty");
    return EOS_EResult::EOS_Success;
}

void deliver_invite_received(const Invitation& inv) {
    const std::string id = inv.id, to = inv.to, from = inv.from;
    notify("LobbyInviteReceived", [id, to, from](const Sub& s) {
        EOS_Lobby_LobbyInviteReceivedCallbackInfo info{};
        info.ClientData = s.client_data;
        info.InviteId = id.c_str();
        info.LocalUserId = puid_handle(to);
        info.TargetUserId = puid_handle(from);
        ClientCall client;
        reinterpret_cast<EOS_Lobby_OnLobbyInviteReceivedCallback>(s.fn)(&info);
    });
}

template <class Options>
EOS_NotificationId add_notify(Op& op, const Options* o, int32_t latest, const char* kind, void* client_data, void* fn) {
    op.options(o ? json({{"ApiVersion", o->ApiVersion}}) : json(nullptr));
    if (!op.ok()) return EOS_INVALID_NOTIFICATIONID;
    if (o == nullptr) {
        op.ret(op.invalid(kLobby, "options: null"));
        return EOS_INVALID_NOTIFICATIONID;
    }
    if (!version_ok(o->ApiVersion, latest)) {
        op.ret(op.invalid(kLobby, "ApiVersion", EOS_EResult::EOS_IncompatibleVersion));
        return EOS_INVALID_NOTIFICATIONID;
    }
    return add_subscription(op, kind, client_data, fn);
}

}  // namespace

// ---- create, modify, leave, destroy ---------------------------------------------------------

EOS_DECLARE_FUNC(void) EOS_Lobby_CreateLobby(EOS_HLobby Handle, const EOS_Lobby_CreateLobbyOptions* Options,
                                             void* ClientData, const EOS_Lobby_OnCreateLobbyCallback CompletionDelegate) {
    Op op("EOS_Lobby_CreateLobby", Handle, Iface::Lobby, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    Lobby proto;
    std::string override_id;
    if (Options == nullptr) {
        pre = op.invalid(kLobby, "EOS_Lobby_CreateLobbyOptions: null");
    } else {
        const EOS_Lobby_CreateLobbyOptions& o = *Options;
        const bool v9 = o.ApiVersion >= 9;   // v8 ends after bRejoinAfterKickRequiresInvite
        json platforms = nullptr;
        if (v9 && o.AllowedPlatformIds) {
            platforms = json::array();
            for (uint32_t i = 0; i < o.AllowedPlatformIdsCount && i < 64; ++i) platforms.push_back(o.AllowedPlatformIds[i]);
        }
        op.options({{"ApiVersion", o.ApiVersion},
                    {"LocalUserId", id_json(o.LocalUserId)},
                    {"MaxLobbyMembers", o.MaxLobbyMembers},
                    {"PermissionLevel", static_cast<int32_t>(o.PermissionLevel)},
                    {"bPresenceEnabled", o.bPresenceEnabled},
                    {"bAllowInvites", o.bAllowInvites},
                    {"BucketId", str_json(o.BucketId)},
                    {"bDisableHostMigration", o.bDisableHostMigration},
                    {"bEnableRTCRoom", o.bEnableRTCRoom},
                    {"LocalRTCOptions", o.LocalRTCOptions != nullptr},
                    {"LobbyId", str_json(o.LobbyId)},
                    {"bEnableJoinById", o.bEnableJoinById},
                    {"bRejoinAfterKickRequiresInvite", o.bRejoinAfterKickRequiresInvite},
                    {"AllowedPlatformIds", platforms},
                    {"AllowedPlatformIdsCount", v9 ? json(o.AllowedPlatformIdsCount) : json(nullptr)},
                    {"bCrossplayOptOut", v9 ? json(o.bCrossplayOptOut) : json(nullptr)}});
        Account* a = nullptr;
        const int perm = static_cast<int>(o.PermissionLevel);
        if (!version_ok(o.ApiVersion, EOS_LOBBY_CREATELOBBY_API_LATEST, {8})) {
            pre = op.invalid(kLobby, "EOS_Lobby_CreateLobbyOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = connect_user(op, o.LocalUserId, &a, kLobby, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (o.MaxLobbyMembers < 1 || o.MaxLobbyMembers > EOS_LOBBY_MAX_LOBBY_MEMBERS) {
            pre = op.invalid(kLobby, "EOS_Lobby_CreateLobbyOptions.MaxLobbyMembers: must be 1.." +
                                         std::to_string(EOS_LOBBY_MAX_LOBBY_MEMBERS));
        } else if (perm < 0 || perm > static_cast<int>(EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY)) {
            pre = op.invalid(kLobby, "EOS_Lobby_CreateLobbyOptions.PermissionLevel");
        } else if (o.LobbyId && (std::strlen(o.LobbyId) < EOS_LOBBY_MIN_LOBBYIDOVERRIDE_LENGTH ||
                                 std::strlen(o.LobbyId) > EOS_LOBBY_MAX_LOBBYIDOVERRIDE_LENGTH)) {
            pre = op.invalid(kLobby, "EOS_Lobby_CreateLobbyOptions.LobbyId: length");
        } else {
            proto.owner = a->name;
            proto.members = {a->name};
            proto.max_members = o.MaxLobbyMembers;
            proto.permission = o.PermissionLevel;
            proto.presence_enabled = o.bPresenceEnabled != 0;
            proto.allow_invites = o.bAllowInvites != 0;
            proto.allow_host_migration = o.bDisableHostMigration == 0;
            proto.bucket_id = o.BucketId ? o.BucketId : "";
            override_id = o.LobbyId ? o.LobbyId : "";
        }
    }
    start_async<EOS_Lobby_CreateLobbyCallbackInfo>(
        op, CompletionDelegate, pre,
        [proto, override_id](EOS_Lobby_CreateLobbyCallbackInfo& info, Keep& k) -> EOS_EResult {
            info.LobbyId = k.str("LobbyId", static_cast<const char*>(nullptr));
            if (lobbies_of(proto.owner) >= EOS_LOBBY_MAX_LOBBIES) return EOS_EResult::EOS_LimitExceeded;
            if (!override_id.empty() && lobby_by_id(override_id)) return EOS_EResult::EOS_Lobby_LobbyAlreadyExists;
            Lobby l = proto;
            l.id = override_id.empty() ? new_lobby_id() : override_id;
            world().lobbies.push_back(l);
            info.LobbyId = k.str("LobbyId", l.id);
            log(kLobby, EOS_ELogLevel::EOS_LOG_Info, "Lobby created: " + l.id);
            return EOS_EResult::EOS_Success;
        },
        [](EOS_Lobby_CreateLobbyCallbackInfo& info, Keep& k) {
            info.LobbyId = k.str("LobbyId", static_cast<const char*>(nullptr));
        });
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Lobby_UpdateLobbyModification(EOS_HLobby Handle,
                                                                const EOS_Lobby_UpdateLobbyModificationOptions* Options,
                                                                EOS_HLobbyModification* OutLobbyModificationHandle) {
    Op op("EOS_Lobby_UpdateLobbyModification", Handle, Iface::Lobby);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"LobbyId", str_json(Options->LobbyId)}});
    if (OutLobbyModificationHandle) *OutLobbyModificationHandle = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutLobbyModificationHandle == nullptr) return op.ret(op.invalid(kLobby, "OutLobbyModificationHandle: null"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_Lobby_UpdateLobbyModificationOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBY_UPDATELOBBYMODIFICATION_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_Lobby_UpdateLobbyModificationOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    Account* a = nullptr;
    EOS_EResult r = user_and_lobby(op, Options->LocalUserId, Options->LobbyId, &a);
    if (r != EOS_EResult::EOS_Success) return op.ret(r);
    Lobby* l = lobby_by_id(Options->LobbyId);
    if (l == nullptr || !is_member(*l, a->name)) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);
    auto* h = new ModHolder{l->id, a->name, {}};
    track_copy(kModification, op.platform(), h, h, [h]() { delete h; });
    *OutLobbyModificationHandle = reinterpret_cast<EOS_HLobbyModification>(h);
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_LobbyModification_AddAttribute(EOS_HLobbyModification Handle,
                                                                 const EOS_LobbyModification_AddAttributeOptions* Options) {
    Op op("EOS_LobbyModification_AddAttribute");
    Attribute attr;
    const EOS_Lobby_AttributeData* d = Options ? Options->Attribute : nullptr;
    const int type = d ? static_cast<int>(d->ValueType) : -1;
    if (Options) {
        json o = {{"ApiVersion", Options->ApiVersion}, {"Visibility", static_cast<int32_t>(Options->Visibility)}};
        if (d) {
            json a = {{"ApiVersion", d->ApiVersion}, {"Key", str_json(d->Key)}, {"ValueType", type}};
            switch (d->ValueType) {
                case EOS_EAttributeType::EOS_AT_BOOLEAN: a["Value"] = d->Value.AsBool; break;
                case EOS_EAttributeType::EOS_AT_INT64: a["Value"] = d->Value.AsInt64; break;
                case EOS_EAttributeType::EOS_AT_DOUBLE: a["Value"] = d->Value.AsDouble; break;
                case EOS_EAttributeType::EOS_AT_STRING: a["Value"] = str_json(d->Value.AsUtf8); break;
            }
            o["Attribute"] = a;
        } else {
            o["Attribute"] = nullptr;
        }
        op.options(o);
    }
    auto* h = static_cast<ModHolder*>(lookup_handle("EOS_LobbyModification_AddAttribute", kModification, Handle));
    if (h == nullptr) return op.ret(op.invalid(kLobby, "Handle"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_LobbyModification_AddAttributeOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBYMODIFICATION_ADDATTRIBUTE_API_LATEST, {1}))
        return op.ret(op.invalid(kLobby, "EOS_LobbyModification_AddAttributeOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    if (d == nullptr) return op.ret(op.invalid(kLobby, "Attribute: null"));
    if (!version_ok(d->ApiVersion, EOS_LOBBY_ATTRIBUTEDATA_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_Lobby_AttributeData.ApiVersion", EOS_EResult::EOS_IncompatibleVersion));
    if (!present(d->Key) || std::strlen(d->Key) > EOS_LOBBYMODIFICATION_MAX_ATTRIBUTE_LENGTH)
        return op.ret(op.invalid(kLobby, "Attribute.Key"));
    if (type < 0 || type > static_cast<int>(EOS_EAttributeType::EOS_AT_STRING))
        return op.ret(op.invalid(kLobby, "Attribute.ValueType"));
    if (d->ValueType == EOS_EAttributeType::EOS_AT_STRING && d->Value.AsUtf8 == nullptr)
        return op.ret(op.invalid(kLobby, "Attribute.Value.AsUtf8: null"));
    const int vis = static_cast<int>(Options->Visibility);
    if (vis < 0 || vis > static_cast<int>(EOS_ELobbyAttributeVisibility::EOS_LAT_PRIVATE))
        return op.ret(op.invalid(kLobby, "Visibility"));
    // The value is copied now: the caller may free its buffers as soon as this returns.
    attr.key = d->Key;
    attr.type = d->ValueType;
    attr.visibility = Options->Visibility;
    switch (d->ValueType) {
        case EOS_EAttributeType::EOS_AT_BOOLEAN: attr.as_bool = d->Value.AsBool != 0; break;
        case EOS_EAttributeType::EOS_AT_INT64: attr.as_int64 = d->Value.AsInt64; break;
        case EOS_EAttributeType::EOS_AT_DOUBLE: attr.as_double = d->Value.AsDouble; break;
        case EOS_EAttributeType::EOS_AT_STRING: attr.as_utf8 = d->Value.AsUtf8; break;
    }
    std::vector<Attribute> adds = h->adds;
    set_attribute(adds, attr);
    const Lobby* l = lobby_by_id(h->lobby_id);
    if (merged_count(l ? l->attributes : std::vector<Attribute>{}, adds) > EOS_LOBBYMODIFICATION_MAX_ATTRIBUTES)
        return op.ret(EOS_EResult::EOS_LimitExceeded);
    if (auto inj = op.injected()) return op.ret(inj->code);
    h->adds = std::move(adds);
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_LobbyModification_Release(EOS_HLobbyModification LobbyModificationHandle) {
    Op op("EOS_LobbyModification_Release");
    release_copy("EOS_LobbyModification_Release", kModification, LobbyModificationHandle);
}

EOS_DECLARE_FUNC(void) EOS_Lobby_UpdateLobby(EOS_HLobby Handle, const EOS_Lobby_UpdateLobbyOptions* Options,
                                             void* ClientData, const EOS_Lobby_OnUpdateLobbyCallback CompletionDelegate) {
    Op op("EOS_Lobby_UpdateLobby", Handle, Iface::Lobby, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    ModHolder mod;
    if (Options == nullptr) {
        pre = op.invalid(kLobby, "EOS_Lobby_UpdateLobbyOptions: null");
    } else {
        json o = {{"ApiVersion", Options->ApiVersion}, {"LobbyModificationHandle", nullptr}};
        ModHolder* h = nullptr;
        if (Options->LobbyModificationHandle && op.ok())
            h = static_cast<ModHolder*>(
                lookup_handle("EOS_Lobby_UpdateLobby", kModification, Options->LobbyModificationHandle));
        if (h) {
            json adds = json::array();
            for (auto& a : h->adds) adds.push_back(attribute_json(a));
            o["LobbyModificationHandle"] = {{"LobbyId", h->lobby_id}, {"Attributes", adds}};
        } else if (Options->LobbyModificationHandle) {
            o["LobbyModificationHandle"] = "<invalid handle>";
        }
        op.options(o);
        if (!version_ok(Options->ApiVersion, EOS_LOBBY_UPDATELOBBY_API_LATEST)) {
            pre = op.invalid(kLobby, "EOS_Lobby_UpdateLobbyOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if (h == nullptr) {
            pre = op.invalid(kLobby, "EOS_Lobby_UpdateLobbyOptions.LobbyModificationHandle");
        } else {
            mod = *h;   // the caller may release the modification right after this call
        }
    }
    start_async<EOS_Lobby_UpdateLobbyCallbackInfo>(
        op, CompletionDelegate, pre,
        [mod](EOS_Lobby_UpdateLobbyCallbackInfo& info, Keep& k) -> EOS_EResult {
            info.LobbyId = k.str("LobbyId", mod.lobby_id);
            Lobby* l = lobby_by_id(mod.lobby_id);
            if (l == nullptr || !is_member(*l, mod.account)) return EOS_EResult::EOS_NotFound;
            if (!mod.adds.empty() && l->owner != mod.account) return EOS_EResult::EOS_Lobby_NotOwner;
            if (merged_count(l->attributes, mod.adds) > EOS_LOBBYMODIFICATION_MAX_ATTRIBUTES)
                return EOS_EResult::EOS_LimitExceeded;
            for (auto& a : mod.adds) set_attribute(l->attributes, a);
            return EOS_EResult::EOS_Success;
        },
        [mod](EOS_Lobby_UpdateLobbyCallbackInfo& info, Keep& k) {
            info.LobbyId = mod.lobby_id.empty() ? k.str("LobbyId", static_cast<const char*>(nullptr))
                                                : k.str("LobbyId", mod.lobby_id);
        });
}

// Leave and destroy share their options and their callback shape.
template <class Options, class Info, class Callback>
static void leave_or_destroy(Op& op, const Options* o, int32_t latest, Callback cb, bool destroy) {
    EOS_EResult pre = EOS_EResult::EOS_Success;
    std::string lobby_id, account;
    bool have_id = false;
    if (o == nullptr) {
        pre = op.invalid(kLobby, "options: null");
    } else {
        op.options({{"ApiVersion", o->ApiVersion}, {"LocalUserId", id_json(o->LocalUserId)}, {"LobbyId", str_json(o->LobbyId)}});
        have_id = o->LobbyId != nullptr;
        lobby_id = have_id ? o->LobbyId : "";
        Account* a = nullptr;
        if (!version_ok(o->ApiVersion, latest))
            pre = op.invalid(kLobby, "ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        else if ((pre = user_and_lobby(op, o->LocalUserId, o->LobbyId, &a)) == EOS_EResult::EOS_Success)
            account = a->name;
    }
    auto fill = [lobby_id, have_id](Info& info, Keep& k) {
        info.LobbyId = have_id ? k.str("LobbyId", lobby_id) : k.str("LobbyId", static_cast<const char*>(nullptr));
    };
    start_async<Info>(
        op, cb, pre,
        [lobby_id, account, destroy, fill](Info& info, Keep& k) -> EOS_EResult {
            fill(info, k);
            Lobby* l = lobby_by_id(lobby_id);
            if (l == nullptr || !is_member(*l, account)) return EOS_EResult::EOS_NotFound;
            if (destroy) {
                if (l->owner != account) return EOS_EResult::EOS_Lobby_NotOwner;
                destroy_lobby(lobby_id);
                log(kLobby, EOS_ELogLevel::EOS_LOG_Info, "Lobby destroyed: " + lobby_id);
            } else {
                remove_member(lobby_id, account);
                log(kLobby, EOS_ELogLevel::EOS_LOG_Info, "Left lobby: " + lobby_id);
            }
            return EOS_EResult::EOS_Success;
        },
        fill);
}

EOS_DECLARE_FUNC(void) EOS_Lobby_LeaveLobby(EOS_HLobby Handle, const EOS_Lobby_LeaveLobbyOptions* Options,
                                            void* ClientData, const EOS_Lobby_OnLeaveLobbyCallback CompletionDelegate) {
    Op op("EOS_Lobby_LeaveLobby", Handle, Iface::Lobby, ClientData);
    leave_or_destroy<EOS_Lobby_LeaveLobbyOptions, EOS_Lobby_LeaveLobbyCallbackInfo>(
        op, Options, EOS_LOBBY_LEAVELOBBY_API_LATEST, CompletionDelegate, false);
}

EOS_DECLARE_FUNC(void) EOS_Lobby_DestroyLobby(EOS_HLobby Handle, const EOS_Lobby_DestroyLobbyOptions* Options,
                                              void* ClientData, const EOS_Lobby_OnDestroyLobbyCallback CompletionDelegate) {
    Op op("EOS_Lobby_DestroyLobby", Handle, Iface::Lobby, ClientData);
    leave_or_destroy<EOS_Lobby_DestroyLobbyOptions, EOS_Lobby_DestroyLobbyCallbackInfo>(
        op, Options, EOS_LOBBY_DESTROYLOBBY_API_LATEST, CompletionDelegate, true);
}

// ---- invitations ----------------------------------------------------------------------------

EOS_DECLARE_FUNC(void) EOS_Lobby_SendInvite(EOS_HLobby Handle, const EOS_Lobby_SendInviteOptions* Options,
                                            void* ClientData, const EOS_Lobby_OnSendInviteCallback CompletionDelegate) {
    Op op("EOS_Lobby_SendInvite", Handle, Iface::Lobby, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    std::string lobby_id, sender, target_text;
    bool have_id = false;
    if (Options == nullptr) {
        pre = op.invalid(kLobby, "EOS_Lobby_SendInviteOptions: null");
    } else {
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LobbyId", str_json(Options->LobbyId)},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"TargetUserId", id_json(Options->TargetUserId)}});
        have_id = Options->LobbyId != nullptr;
        lobby_id = have_id ? Options->LobbyId : "";
        Account* a = nullptr;
        const IdState ts = product_text(Options->TargetUserId, &target_text);
        if (!version_ok(Options->ApiVersion, EOS_LOBBY_SENDINVITE_API_LATEST)) {
            pre = op.invalid(kLobby, "EOS_Lobby_SendInviteOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = user_and_lobby(op, Options->LocalUserId, Options->LobbyId, &a)) != EOS_EResult::EOS_Success) {
        } else if (ts == IdState::Null) {
            pre = op.invalid(kLobby, "TargetUserId: null");
        } else if (ts == IdState::Garbage) {
            fault("EOS_Lobby_SendInvite: TargetUserId is not an id handle");
            pre = op.invalid(kLobby, "TargetUserId: invalid handle");
        } else {
            sender = a->name;
        }
    }
    auto fill = [lobby_id, have_id](EOS_Lobby_SendInviteCallbackInfo& info, Keep& k) {
        info.LobbyId = have_id ? k.str("LobbyId", lobby_id) : k.str("LobbyId", static_cast<const char*>(nullptr));
    };
    start_async<EOS_Lobby_SendInviteCallbackInfo>(
        op, CompletionDelegate, pre,
        [lobby_id, sender, target_text, fill](EOS_Lobby_SendInviteCallbackInfo& info, Keep& k) -> EOS_EResult {
            fill(info, k);
            Lobby* l = lobby_by_id(lobby_id);
            if (l == nullptr || !is_member(*l, sender)) return EOS_EResult::EOS_NotFound;
            // A lobby created without bAllowInvites takes no invitations.
            if (!l->allow_invites) return EOS_EResult::EOS_Lobby_InviteFailed;
            Account* target = account_by_product(target_text);
            if (target == nullptr) return EOS_EResult::EOS_InvalidUser;
            Invitation inv{new_invite_id(), lobby_id, sender, target->name};
            world().invitations.push_back(inv);
            k.out["InviteId"] = inv.id;
            if (target->name == world().local_account) deliver_invite_received(inv);
            return EOS_EResult::EOS_Success;
        },
        fill);
}

EOS_DECLARE_FUNC(void) EOS_Lobby_RejectInvite(EOS_HLobby Handle, const EOS_Lobby_RejectInviteOptions* Options,
                                              void* ClientData, const EOS_Lobby_OnRejectInviteCallback CompletionDelegate) {
    Op op("EOS_Lobby_RejectInvite", Handle, Iface::Lobby, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    std::string invite_id, account;
    bool have_id = false;
    if (Options == nullptr) {
        pre = op.invalid(kLobby, "EOS_Lobby_RejectInviteOptions: null");
    } else {
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"InviteId", str_json(Options->InviteId)},
                    {"LocalUserId", id_json(Options->LocalUserId)}});
        have_id = Options->InviteId != nullptr;
        invite_id = have_id ? Options->InviteId : "";
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_LOBBY_REJECTINVITE_API_LATEST))
            pre = op.invalid(kLobby, "EOS_Lobby_RejectInviteOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        else if ((pre = connect_user(op, Options->LocalUserId, &a, kLobby, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (!present(Options->InviteId))
            pre = op.invalid(kLobby, "InviteId: empty");
        else
            account = a->name;
    }
    auto fill = [invite_id, have_id](EOS_Lobby_RejectInviteCallbackInfo& info, Keep& k) {
        info.InviteId = have_id ? k.str("InviteId", invite_id) : k.str("InviteId", static_cast<const char*>(nullptr));
    };
    start_async<EOS_Lobby_RejectInviteCallbackInfo>(
        op, CompletionDelegate, pre,
        [invite_id, account, fill](EOS_Lobby_RejectInviteCallbackInfo& info, Keep& k) -> EOS_EResult {
            fill(info, k);
            auto& inv = world().invitations;
            for (auto it = inv.begin(); it != inv.end(); ++it)
                if (it->id == invite_id && it->to == account) {
                    inv.erase(it);
                    return EOS_EResult::EOS_Success;
                }
            return EOS_EResult::EOS_NotFound;
        },
        fill);
}

// ---- lobby details --------------------------------------------------------------------------

EOS_DECLARE_FUNC(EOS_EResult) EOS_Lobby_CopyLobbyDetailsHandleByInviteId(
    EOS_HLobby Handle, const EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions* Options,
    EOS_HLobbyDetails* OutLobbyDetailsHandle) {
    Op op("EOS_Lobby_CopyLobbyDetailsHandleByInviteId", Handle, Iface::Lobby);
    if (Options) op.options({{"ApiVersion", Options->ApiVersion}, {"InviteId", str_json(Options->InviteId)}});
    if (OutLobbyDetailsHandle) *OutLobbyDetailsHandle = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutLobbyDetailsHandle == nullptr) return op.ret(op.invalid(kLobby, "OutLobbyDetailsHandle: null"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYINVITEID_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    if (!present(Options->InviteId) || std::strlen(Options->InviteId) > EOS_LOBBY_INVITEID_MAX_LENGTH)
        return op.ret(op.invalid(kLobby, "InviteId"));
    Invitation* inv = invitation_by_id(Options->InviteId);
    Lobby* l = inv ? lobby_by_id(inv->lobby_id) : nullptr;
    if (l == nullptr) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);
    *OutLobbyDetailsHandle = new_details(op.platform(), *l, inv->to);
    op.output({{"LobbyId", l->id}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Lobby_CopyLobbyDetailsHandleByUiEventId(
    EOS_HLobby Handle, const EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions* Options,
    EOS_HLobbyDetails* OutLobbyDetailsHandle) {
    Op op("EOS_Lobby_CopyLobbyDetailsHandleByUiEventId", Handle, Iface::Lobby);
    if (Options) op.options({{"ApiVersion", Options->ApiVersion}, {"UiEventId", Options->UiEventId}});
    if (OutLobbyDetailsHandle) *OutLobbyDetailsHandle = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutLobbyDetailsHandle == nullptr) return op.ret(op.invalid(kLobby, "OutLobbyDetailsHandle: null"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYUIEVENTID_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    if (Options->UiEventId == EOS_UI_EVENTID_INVALID) return op.ret(op.invalid(kLobby, "UiEventId: invalid"));
    auto it = sessions().ui_events.find(Options->UiEventId);
    Lobby* l = it == sessions().ui_events.end() ? nullptr : lobby_by_id(it->second);
    if (l == nullptr) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);
    *OutLobbyDetailsHandle = new_details(op.platform(), *l, world().local_account);
    op.output({{"LobbyId", l->id}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Lobby_CopyLobbyDetailsHandle(EOS_HLobby Handle,
                                                               const EOS_Lobby_CopyLobbyDetailsHandleOptions* Options,
                                                               EOS_HLobbyDetails* OutLobbyDetailsHandle) {
    Op op("EOS_Lobby_CopyLobbyDetailsHandle", Handle, Iface::Lobby);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LobbyId", str_json(Options->LobbyId)},
                    {"LocalUserId", id_json(Options->LocalUserId)}});
    if (OutLobbyDetailsHandle) *OutLobbyDetailsHandle = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutLobbyDetailsHandle == nullptr) return op.ret(op.invalid(kLobby, "OutLobbyDetailsHandle: null"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_Lobby_CopyLobbyDetailsHandleOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBY_COPYLOBBYDETAILSHANDLE_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_Lobby_CopyLobbyDetailsHandleOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    Account* a = nullptr;
    EOS_EResult r = user_and_lobby(op, Options->LocalUserId, Options->LobbyId, &a);
    if (r != EOS_EResult::EOS_Success) return op.ret(r);
    Lobby* l = lobby_by_id(Options->LobbyId);
    if (l == nullptr || !is_member(*l, a->name)) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);
    *OutLobbyDetailsHandle = new_details(op.platform(), *l, a->name);
    op.output({{"LobbyId", l->id}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_Lobby_JoinLobby(EOS_HLobby Handle, const EOS_Lobby_JoinLobbyOptions* Options,
                                           void* ClientData, const EOS_Lobby_OnJoinLobbyCallback CompletionDelegate) {
    Op op("EOS_Lobby_JoinLobby", Handle, Iface::Lobby, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    std::string lobby_id, account;
    if (Options == nullptr) {
        pre = op.invalid(kLobby, "EOS_Lobby_JoinLobbyOptions: null");
    } else {
        const bool v4 = Options->ApiVersion >= 4;   // v3 ends at LocalRTCOptions
        json o = {{"ApiVersion", Options->ApiVersion},
                  {"LobbyDetailsHandle", nullptr},
                  {"LocalUserId", id_json(Options->LocalUserId)},
                  {"bPresenceEnabled", Options->bPresenceEnabled},
                  {"LocalRTCOptions", Options->LocalRTCOptions != nullptr},
                  {"bCrossplayOptOut", v4 ? json(Options->bCrossplayOptOut) : json(nullptr)}};
        DetailsHolder* h = nullptr;
        if (Options->LobbyDetailsHandle && op.ok())
            h = static_cast<DetailsHolder*>(lookup_handle("EOS_Lobby_JoinLobby", kDetails, Options->LobbyDetailsHandle));
        if (h)
            o["LobbyDetailsHandle"] = h->snapshot.id;
        else if (Options->LobbyDetailsHandle)
            o["LobbyDetailsHandle"] = "<invalid handle>";
        op.options(o);
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_LOBBY_JOINLOBBY_API_LATEST, {3})) {
            pre = op.invalid(kLobby, "EOS_Lobby_JoinLobbyOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if (h == nullptr) {
            pre = op.invalid(kLobby, "EOS_Lobby_JoinLobbyOptions.LobbyDetailsHandle");
        } else if ((pre = connect_user(op, Options->LocalUserId, &a, kLobby, "LocalUserId")) == EOS_EResult::EOS_Success) {
            // What the join needs is taken now: the details handle may be released right after.
            lobby_id = h->snapshot.id;
            account = a->name;
        }
    }
    start_async<EOS_Lobby_JoinLobbyCallbackInfo>(
        op, CompletionDelegate, pre,
        [lobby_id, account](EOS_Lobby_JoinLobbyCallbackInfo& info, Keep& k) -> EOS_EResult {
            info.LobbyId = k.str("LobbyId", lobby_id);
            Lobby* l = lobby_by_id(lobby_id);
            if (l == nullptr) return EOS_EResult::EOS_NotFound;
            if (is_member(*l, account)) return EOS_EResult::EOS_Success;
            if (l->members.size() >= l->max_members) return EOS_EResult::EOS_Lobby_TooManyPlayers;
            if (lobbies_of(account) >= EOS_LOBBY_MAX_LOBBIES) return EOS_EResult::EOS_LimitExceeded;
            add_member(*l, account);
            log(kLobby, EOS_ELogLevel::EOS_LOG_Info, "Joined lobby: " + lobby_id);
            return EOS_EResult::EOS_Success;
        },
        [lobby_id](EOS_Lobby_JoinLobbyCallbackInfo& info, Keep& k) {
            info.LobbyId = lobby_id.empty() ? k.str("LobbyId", static_cast<const char*>(nullptr))
                                            : k.str("LobbyId", lobby_id);
        });
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_LobbyDetails_CopyInfo(EOS_HLobbyDetails Handle,
                                                        const EOS_LobbyDetails_CopyInfoOptions* Options,
                                                        EOS_LobbyDetails_Info** OutLobbyDetailsInfo) {
    Op op("EOS_LobbyDetails_CopyInfo");
    if (Options) op.options({{"ApiVersion", Options->ApiVersion}});
    if (OutLobbyDetailsInfo) *OutLobbyDetailsInfo = nullptr;
    auto* h = static_cast<DetailsHolder*>(lookup_handle("EOS_LobbyDetails_CopyInfo", kDetails, Handle));
    if (h == nullptr) return op.ret(op.invalid(kLobby, "Handle"));
    if (OutLobbyDetailsInfo == nullptr) return op.ret(op.invalid(kLobby, "OutLobbyDetailsInfo: null"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_LobbyDetails_CopyInfoOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBYDETAILS_COPYINFO_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_LobbyDetails_CopyInfoOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    if (auto inj = op.injected()) return op.ret(inj->code);
    const Lobby& l = h->snapshot;
    auto* c = new InfoCopy;
    c->id = l.id;
    c->bucket = l.bucket_id;
    EOS_LobbyDetails_Info& i = c->info;
    i.ApiVersion = EOS_LOBBYDETAILS_INFO_API_LATEST;
    i.LobbyId = c->id.c_str();
    i.LobbyOwnerUserId = puid_handle(l.owner);
    i.PermissionLevel = l.permission;
    i.MaxMembers = l.max_members;
    i.AvailableSlots = l.members.size() >= l.max_members ? 0 : l.max_members - static_cast<uint32_t>(l.members.size());
    i.bAllowInvites = l.allow_invites ? EOS_TRUE : EOS_FALSE;
    i.BucketId = c->bucket.empty() ? nullptr : c->bucket.c_str();
    i.bAllowHostMigration = l.allow_host_migration ? EOS_TRUE : EOS_FALSE;
    i.bPresenceEnabled = l.presence_enabled ? EOS_TRUE : EOS_FALSE;
    track_copy("EOS_LobbyDetails_Info", nullptr, &c->info, c, [c]() { delete c; });
    *OutLobbyDetailsInfo = &c->info;
    op.output({{"LobbyId", l.id}, {"LobbyOwnerUserId", puid_of(l.owner)}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_LobbyDetails_Info_Release(EOS_LobbyDetails_Info* LobbyDetailsInfo) {
    Op op("EOS_LobbyDetails_Info_Release");
    release_copy("EOS_LobbyDetails_Info_Release", "EOS_LobbyDetails_Info", LobbyDetailsInfo);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_LobbyDetails_CopyAttributeByKey(EOS_HLobbyDetails Handle,
                                                                  const EOS_LobbyDetails_CopyAttributeByKeyOptions* Options,
                                                                  EOS_Lobby_Attribute** OutAttribute) {
    Op op("EOS_LobbyDetails_CopyAttributeByKey");
    if (Options) op.options({{"ApiVersion", Options->ApiVersion}, {"AttrKey", str_json(Options->AttrKey)}});
    if (OutAttribute) *OutAttribute = nullptr;
    auto* h = static_cast<DetailsHolder*>(lookup_handle("EOS_LobbyDetails_CopyAttributeByKey", kDetails, Handle));
    if (h == nullptr) return op.ret(op.invalid(kLobby, "Handle"));
    if (OutAttribute == nullptr) return op.ret(op.invalid(kLobby, "OutAttribute: null"));
    if (Options == nullptr) return op.ret(op.invalid(kLobby, "EOS_LobbyDetails_CopyAttributeByKeyOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_LOBBYDETAILS_COPYATTRIBUTEBYKEY_API_LATEST))
        return op.ret(op.invalid(kLobby, "EOS_LobbyDetails_CopyAttributeByKeyOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    if (!present(Options->AttrKey)) return op.ret(op.invalid(kLobby, "AttrKey: empty"));
    const Attribute* found = nullptr;
    for (auto& a : h->snapshot.attributes)
        if (a.key == Options->AttrKey) found = &a;
    if (found == nullptr) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);
    auto* c = new AttrCopy;
    c->key = found->key;
    c->value = found->as_utf8;
    EOS_Lobby_AttributeData& d = c->data;
    d.ApiVersion = EOS_LOBBY_ATTRIBUTEDATA_API_LATEST;
    d.Key = c->key.c_str();
    d.ValueType = found->type;
    switch (found->type) {
        case EOS_EAttributeType::EOS_AT_BOOLEAN: d.Value.AsBool = found->as_bool ? EOS_TRUE : EOS_FALSE; break;
        case EOS_EAttributeType::EOS_AT_INT64: d.Value.AsInt64 = found->as_int64; break;
        case EOS_EAttributeType::EOS_AT_DOUBLE: d.Value.AsDouble = found->as_double; break;
        case EOS_EAttributeType::EOS_AT_STRING: d.Value.AsUtf8 = c->value.c_str(); break;
    }
    c->attr.ApiVersion = EOS_LOBBY_ATTRIBUTE_API_LATEST;
    c->attr.Data = &c->data;
    c->attr.Visibility = found->visibility;
    track_copy("EOS_Lobby_Attribute", nullptr, &c->attr, c, [c]() { delete c; });
    *OutAttribute = &c->attr;
    op.output({{"Attribute", attribute_json(*found)}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_Lobby_Attribute_Release(EOS_Lobby_Attribute* LobbyAttribute) {
    Op op("EOS_Lobby_Attribute_Release");
    release_copy("EOS_Lobby_Attribute_Release", "EOS_Lobby_Attribute", LobbyAttribute);
}

EOS_DECLARE_FUNC(void) EOS_LobbyDetails_Release(EOS_HLobbyDetails LobbyHandle) {
    Op op("EOS_LobbyDetails_Release");
    release_copy("EOS_LobbyDetails_Release", kDetails, LobbyHandle);
}

// ---- notifications --------------------------------------------------------------------------

EOS_DECLARE_FUNC(EOS_NotificationId) EOS_Lobby_AddNotifyLobbyInviteReceived(
    EOS_HLobby Handle, const EOS_Lobby_AddNotifyLobbyInviteReceivedOptions* Options, void* ClientData,
    const EOS_Lobby_OnLobbyInviteReceivedCallback NotificationFn) {
    Op op("EOS_Lobby_AddNotifyLobbyInviteReceived", Handle, Iface::Lobby, ClientData);
    return add_notify(op, Options, EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST, "LobbyInviteReceived", ClientData,
                      reinterpret_cast<void*>(NotificationFn));
}

EOS_DECLARE_FUNC(void) EOS_Lobby_RemoveNotifyLobbyInviteReceived(EOS_HLobby Handle, EOS_NotificationId InId) {
    Op op("EOS_Lobby_RemoveNotifyLobbyInviteReceived", Handle, Iface::Lobby);
    remove_subscription(op, "LobbyInviteReceived", InId);
}

EOS_DECLARE_FUNC(EOS_NotificationId) EOS_Lobby_AddNotifyLobbyInviteAccepted(
    EOS_HLobby Handle, const EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions* Options, void* ClientData,
    const EOS_Lobby_OnLobbyInviteAcceptedCallback NotificationFn) {
    Op op("EOS_Lobby_AddNotifyLobbyInviteAccepted", Handle, Iface::Lobby, ClientData);
    return add_notify(op, Options, EOS_LOBBY_ADDNOTIFYLOBBYINVITEACCEPTED_API_LATEST, "LobbyInviteAccepted", ClientData,
                      reinterpret_cast<void*>(NotificationFn));
}

EOS_DECLARE_FUNC(void) EOS_Lobby_RemoveNotifyLobbyInviteAccepted(EOS_HLobby Handle, EOS_NotificationId InId) {
    Op op("EOS_Lobby_RemoveNotifyLobbyInviteAccepted", Handle, Iface::Lobby);
    remove_subscription(op, "LobbyInviteAccepted", InId);
}

EOS_DECLARE_FUNC(EOS_NotificationId) EOS_Lobby_AddNotifyJoinLobbyAccepted(
    EOS_HLobby Handle, const EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions* Options, void* ClientData,
    const EOS_Lobby_OnJoinLobbyAcceptedCallback NotificationFn) {
    Op op("EOS_Lobby_AddNotifyJoinLobbyAccepted", Handle, Iface::Lobby, ClientData);
    return add_notify(op, Options, EOS_LOBBY_ADDNOTIFYJOINLOBBYACCEPTED_API_LATEST, "JoinLobbyAccepted", ClientData,
                      reinterpret_cast<void*>(NotificationFn));
}

EOS_DECLARE_FUNC(void) EOS_Lobby_RemoveNotifyJoinLobbyAccepted(EOS_HLobby Handle, EOS_NotificationId InId) {
    Op op("EOS_Lobby_RemoveNotifyJoinLobbyAccepted", Handle, Iface::Lobby);
    remove_subscription(op, "JoinLobbyAccepted", InId);
}

// ---- controls: other players and the overlay ------------------------------------------------

namespace eos_sim {

std::string remote_create_lobby(const std::string& owner, const std::vector<Attribute>& attributes,
                                uint32_t max_members) {
    if (account_by_name(owner) == nullptr) return {};
    Lobby l;
    l.id = new_lobby_id();
    l.owner = owner;
    l.members = {owner};
    l.max_members = max_members;
    for (auto& a : attributes) set_attribute(l.attributes, a);
    world().lobbies.push_back(l);
    return l.id;
}

std::string remote_invite(const std::string& from, const std::string& lobby_id, const std::string& to) {
    const std::string target = to.empty() ? world().local_account : to;
    Lobby* l = lobby_by_id(lobby_id);
    if (l == nullptr || !is_member(*l, from) || account_by_name(target) == nullptr) return {};
    Invitation inv{new_invite_id(), lobby_id, from, target};
    world().invitations.push_back(inv);
    if (target == world().local_account) deliver_invite_received(inv);
    return inv.id;
}

bool remote_join(const std::string& account, const std::string& lobby_id) {
    Lobby* l = lobby_by_id(lobby_id);
    if (l == nullptr || account_by_name(account) == nullptr) return false;
    if (is_member(*l, account)) return true;
    if (l->members.size() >= l->max_members) return false;
    add_member(*l, account);
    return true;
}

bool remote_accept_invite(const std::string& account, const std::string& invite_id) {
    Invitation* inv = invitation_by_id(invite_id);
    if (inv == nullptr || inv->to != account) return false;
    return remote_join(account, inv->lobby_id);
}

void raise_invite_received(const std::string& invite_id) {
    if (Invitation* inv = invitation_by_id(invite_id)) deliver_invite_received(*inv);
}

void raise_invite_accepted(const std::string& invite_id) {
    Invitation* inv = invitation_by_id(invite_id);
    if (inv == nullptr) return;
    const Invitation copy = *inv;
    notify("LobbyInviteAccepted", [copy](const Sub& s) {
        EOS_Lobby_LobbyInviteAcceptedCallbackInfo info{};
        info.ClientData = s.client_data;
        info.InviteId = copy.id.c_str();
        info.LocalUserId = puid_handle(copy.to);
        info.TargetUserId = puid_handle(copy.from);
        info.LobbyId = copy.lobby_id.c_str();
        ClientCall client;
        reinterpret_cast<EOS_Lobby_OnLobbyInviteAcceptedCallback>(s.fn)(&info);
    });
}

uint64_t raise_join_lobby_accepted(const std::string& lobby_id) {
    auto& s = sessions();
    const uint64_t event = s.next_ui_event++;
    s.ui_events[event] = lobby_id;
    const std::string local = world().local_account;
    notify("JoinLobbyAccepted", [event, local](const Sub& sub) {
        EOS_Lobby_JoinLobbyAcceptedCallbackInfo info{};
        info.ClientData = sub.client_data;
        info.LocalUserId = puid_handle(local);
        info.UiEventId = event;
        ClientCall client;
        reinterpret_cast<EOS_Lobby_OnJoinLobbyAcceptedCallback>(sub.fn)(&info);
    });
    return event;
}

}  // namespace eos_sim
