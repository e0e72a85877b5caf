// The friend list, gathered from one friend-list query, two queries per friend
// and the product user id mappings, and the friends overlay.
#include "state.h"

#include <cstdlib>
#include <cstring>

// The SDK caps a mappings query at this many account ids.
enum { MAPPINGS_BATCH = 128 };
// A friend count beyond this is not a friend list.
enum { MAX_FRIENDS = 1 << 20 };

// One entry of the handle -> slot index built at fan-out.
struct FriendSlot {
    EOS_EpicAccountId id;
    int slot;
};

// One friend-list request while its per-friend and mappings queries gather.
struct FriendsQuery {
    closure_cell *cell;
    varray *friend_list;       // rooted until delivery
    int presence_count;
    int user_info_count;
    int mappings_done;
    const char **account_ids;  // the valid friends' epicId strings, in slot order
    int *account_slots;        // the slot of each account_ids entry
    int valid_count;
    int mapping_batches_left;
    FriendSlot *index;         // open addressing, index_mask + 1 entries
    unsigned index_mask;
    EOS_EpicAccountId *first_ids; // per slot: its friend's handle if no earlier slot has it, else null
    int user_info_next;        // where the next user info lookup looks first
    int presence_next;         // likewise for presences
};

// One mappings query over account_ids[first .. first + count).
struct FriendsMappingBatch {
    FriendsQuery *query;
    int first;
    int count;
};

static void EOS_CALL on_query_friends(const EOS_Friends_QueryFriendsCallbackInfo *info);
static void EOS_CALL on_friend_user_info(const EOS_UserInfo_QueryUserInfoCallbackInfo *info);
static void EOS_CALL on_friend_presence(const EOS_Presence_QueryPresenceCallbackInfo *info);
static void EOS_CALL on_friend_mappings(const EOS_Connect_QueryExternalAccountMappingsCallbackInfo *info);

HL_PRIM void HL_NAME(query_friends)(vclosure *onFriends)
{
    if (!platform_ready("query_friends"))
        return;
    EOS_Friends_QueryFriendsOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LocalUserId = g_epic_account_id;
    closure_cell *cell = closure_cell_new(onFriends);
    EOS_Friends_QueryFriends(EOS_Platform_GetFriendsInterface(g_platform), &options, cell, on_query_friends);
}

HL_PRIM void HL_NAME(show_friends)()
{
    if (!platform_ready("show_friends"))
        return;
    EOS_UI_ShowFriendsOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LocalUserId = g_epic_account_id;
    EOS_UI_ShowFriends(EOS_Platform_GetUIInterface(g_platform), &options, nullptr,
                       on_complete_ignore<EOS_UI_ShowFriendsCallbackInfo>);
}

// Handles are addresses a few dozen bytes apart: every bit is mixed into the
// low bits the table uses, or neighbouring handles would share probe runs.
static unsigned slot_hash(EOS_EpicAccountId id, unsigned mask)
{
    uint64_t bits = static_cast<uint64_t>(reinterpret_cast<uintptr_t>(id));
    bits ^= bits >> 33;
    bits *= 0xFF51AFD7ED558CCDull;
    bits ^= bits >> 33;
    bits *= 0xC4CEB9FE1A85EC53ull;
    bits ^= bits >> 33;
    return static_cast<unsigned>(bits) & mask;
}

// Keeps the first slot of each account, so lookups answer in index order.
// Returns false when an earlier slot already has this account.
static bool index_insert(FriendsQuery *query, EOS_EpicAccountId id, int slot)
{
    unsigned at = slot_hash(id, query->index_mask);
    while (query->index[at].id) {
        if (query->index[at].id == id)
            return false;
        at = (at + 1) & query->index_mask;
    }
    query->index[at].id = id;
    query->index[at].slot = slot;
    return true;
}

// The slot of the first friend whose account handle is account_id, or -1.
// Completions mostly arrive in the order their queries were issued, so the
// slot after the caller's previous answer (*next) is tried first: for a long
// list that spares a cache miss in the index per completion.
static int find_friend_index(FriendsQuery *query, EOS_EpicAccountId account_id, int *next)
{
    if (!account_id || !query->index)
        return -1;
    int guess = *next;
    if (guess >= 0 && guess < query->friend_list->size && query->first_ids[guess] == account_id) {
        *next = guess + 1;
        return guess;
    }
    unsigned at = slot_hash(account_id, query->index_mask);
    while (query->index[at].id) {
        if (query->index[at].id == account_id) {
            *next = query->index[at].slot + 1;
            return query->index[at].slot;
        }
        at = (at + 1) & query->index_mask;
    }
    return -1;
}

static vdynobj *friend_record(FriendsQuery *query, int slot)
{
    return hl_aptr(query->friend_list, vdynobj *)[slot];
}

static void friends_query_free(FriendsQuery *query)
{
    std::free(query->account_ids);
    std::free(query->account_slots);
    std::free(query->index);
    std::free(query->first_ids);
    std::free(query);
}

// Delivers the list once every query the request issued has completed.
static void friends_query_try_deliver(FriendsQuery *query)
{
    if (query->user_info_count < query->valid_count || query->presence_count < query->valid_count ||
        !query->mappings_done)
        return;
    deliver_array(cell_closure(query->cell), query->friend_list);
    hl_remove_root(&query->friend_list);
    closure_cell_free(query->cell);
    friends_query_free(query);
}

static void deliver_no_friends(closure_cell *cell, EOS_EResult result)
{
    egs_log("[EGS] Failed to query friends : %d\n", result_code(result));
    deliver_array(cell_closure(cell), nullptr);
    closure_cell_free(cell);
}

// Starts the mappings queries; returns how many were handed to the SDK.
static int query_mappings(FriendsQuery *query, EOS_HConnect connect)
{
    int batches = (query->valid_count + MAPPINGS_BATCH - 1) / MAPPINGS_BATCH;
    if (batches == 0)
        batches = 1; // an empty list still asks once; that completion completes it
    query->mapping_batches_left = batches;
    int started = 0;
    for (int b = 0; b < batches; ++b) {
        FriendsMappingBatch *batch = static_cast<FriendsMappingBatch *>(std::malloc(sizeof(FriendsMappingBatch)));
        if (!batch) {
            egs_log("[EGS] Failed to retreive external products id : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
            query->mapping_batches_left -= 1;
            continue;
        }
        batch->query = query;
        batch->first = b * MAPPINGS_BATCH;
        batch->count = query->valid_count - batch->first < MAPPINGS_BATCH ? query->valid_count - batch->first : MAPPINGS_BATCH;
        EOS_Connect_QueryExternalAccountMappingsOptions options;
        std::memset(&options, 0, sizeof options);
        options.ApiVersion = 1;
        options.LocalUserId = g_product_user_id;
        options.AccountIdType = EOS_EExternalAccountType::EOS_EAT_EPIC;
        options.ExternalAccountIds = query->account_ids ? query->account_ids + batch->first : nullptr;
        options.ExternalAccountIdCount = static_cast<uint32_t>(batch->count);
        ++started;
        EOS_Connect_QueryExternalAccountMappings(connect, &options, batch, on_friend_mappings);
    }
    return started;
}

static void EOS_CALL on_query_friends(const EOS_Friends_QueryFriendsCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    closure_cell *cell = static_cast<closure_cell *>(info->ClientData);
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        deliver_no_friends(cell, info->ResultCode);
        return;
    }
    EOS_HFriends friends = EOS_Platform_GetFriendsInterface(g_platform);
    EOS_HUserInfo user_info = EOS_Platform_GetUserInfoInterface(g_platform);
    EOS_HPresence presence = EOS_Platform_GetPresenceInterface(g_platform);
    EOS_HConnect connect = EOS_Platform_GetConnectInterface(g_platform);

    EOS_Friends_GetFriendsCountOptions count_options;
    std::memset(&count_options, 0, sizeof count_options);
    count_options.ApiVersion = 1;
    count_options.LocalUserId = g_epic_account_id;
    int n = EOS_Friends_GetFriendsCount(friends, &count_options);
    if (n < 0 || n > MAX_FRIENDS) {
        egs_log("[EGS] Invalid friends count : %d\n", n);
        n = 0;
    }

    FriendsQuery *query = static_cast<FriendsQuery *>(std::calloc(1, sizeof(FriendsQuery)));
    unsigned index_size = 16;
    while (index_size < 2u * static_cast<unsigned>(n))
        index_size *= 2;
    if (query) {
        query->account_ids = static_cast<const char **>(std::calloc(n ? n : 1, sizeof(const char *)));
        query->account_slots = static_cast<int *>(std::calloc(n ? n : 1, sizeof(int)));
        query->index = static_cast<FriendSlot *>(std::calloc(index_size, sizeof(FriendSlot)));
        query->first_ids = static_cast<EOS_EpicAccountId *>(std::calloc(n ? n : 1, sizeof(EOS_EpicAccountId)));
    }
    if (!query || !query->account_ids || !query->account_slots || !query->index || !query->first_ids) {
        if (query)
            friends_query_free(query);
        deliver_no_friends(cell, EOS_EResult::EOS_UnexpectedError);
        return;
    }
    query->cell = cell;
    query->index_mask = index_size - 1;
    query->friend_list = hl_alloc_array(&hlt_dynobj, n);
    hl_add_root(&query->friend_list);

    for (int i = 0; i < n; ++i) {
        EOS_Friends_GetFriendAtIndexOptions at_options;
        std::memset(&at_options, 0, sizeof at_options);
        at_options.ApiVersion = 1;
        at_options.LocalUserId = g_epic_account_id;
        at_options.Index = i;
        EOS_EpicAccountId id = EOS_Friends_GetFriendAtIndex(friends, &at_options);
        char text[33];
        if (!EOS_EpicAccountId_IsValid(id) || !epic_id_text(id, text)) {
            egs_log("[EGS] Invalid friend id (index %d)\n", i);
            continue;
        }
        vdynobj *record = hl_alloc_dynobj();
        vbyte *epic_id = to_vm_bytes(text);
        set_bytes_field(record, "epicId", epic_id);
        hl_aptr(query->friend_list, vdynobj *)[i] = record;
        query->account_ids[query->valid_count] = reinterpret_cast<const char *>(epic_id);
        query->account_slots[query->valid_count] = i;
        query->valid_count += 1;
        query->first_ids[i] = id;

        EOS_UserInfo_QueryUserInfoOptions user_options;
        std::memset(&user_options, 0, sizeof user_options);
        user_options.ApiVersion = 1;
        user_options.LocalUserId = g_epic_account_id;
        user_options.TargetUserId = id;
        EOS_UserInfo_QueryUserInfo(user_info, &user_options, query, on_friend_user_info);

        EOS_Presence_QueryPresenceOptions presence_options;
        std::memset(&presence_options, 0, sizeof presence_options);
        presence_options.ApiVersion = 1;
        presence_options.LocalUserId = g_epic_account_id;
        presence_options.TargetUserId = id;
        EOS_Presence_QueryPresence(presence, &presence_options, query, on_friend_presence);
    }
    // The index is built in one pass once the queries are issued (none can
    // complete before this callback returns): the table stays in cache while
    // it is filled, instead of meeting the SDK's work between two entries.
    for (int k = 0; k < query->valid_count; ++k) {
        int slot = query->account_slots[k];
        if (!index_insert(query, query->first_ids[slot], slot))
            query->first_ids[slot] = nullptr;
    }
    // Once a query is started its completion owns the request; only when none
    // could be started is it completed here.
    if (query_mappings(query, connect) == 0) {
        query->mappings_done = 1;
        friends_query_try_deliver(query);
    }
}

static void EOS_CALL on_friend_user_info(const EOS_UserInfo_QueryUserInfoCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    FriendsQuery *query = static_cast<FriendsQuery *>(info->ClientData);
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to retreive user infos : %d\n", result_code(info->ResultCode));
    } else {
        int k = find_friend_index(query, info->TargetUserId, &query->user_info_next);
        if (k < 0) {
            egs_log("[EGS] Query details for an unknown user\n");
        } else {
            EOS_UserInfo_CopyUserInfoOptions options;
            std::memset(&options, 0, sizeof options);
            options.ApiVersion = 3;
            options.LocalUserId = g_epic_account_id;
            options.TargetUserId = info->TargetUserId;
            EOS_UserInfo *user = nullptr;
            EOS_EResult result = EOS_UserInfo_CopyUserInfo(EOS_Platform_GetUserInfoInterface(g_platform), &options, &user);
            if (result != EOS_EResult::EOS_Success || !user) {
                egs_log("[EGS] Failed to retreive name : %d\n", result_code(result));
            } else {
                if (user->DisplayName)
                    set_bytes_field(friend_record(query, k), "name", to_vm_bytes(user->DisplayName));
                EOS_UserInfo_Release(user);
            }
        }
    }
    query->user_info_count += 1;
    friends_query_try_deliver(query);
}

static void EOS_CALL on_friend_presence(const EOS_Presence_QueryPresenceCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    FriendsQuery *query = static_cast<FriendsQuery *>(info->ClientData);
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Can't receive presence info : %d\n", result_code(info->ResultCode));
    } else {
        int k = find_friend_index(query, info->TargetUserId, &query->presence_next);
        if (k < 0) {
            egs_log("[EGS] Query presence of an unknown user\n");
        } else {
            bool online = false;
            EOS_Presence_CopyPresenceOptions options;
            std::memset(&options, 0, sizeof options);
            options.ApiVersion = 3;
            options.LocalUserId = g_epic_account_id;
            options.TargetUserId = info->TargetUserId;
            EOS_Presence_Info *presence = nullptr;
            EOS_EResult result = EOS_Presence_CopyPresence(EOS_Platform_GetPresenceInterface(g_platform), &options, &presence);
            if (result != EOS_EResult::EOS_Success || !presence) {
                egs_log("[EGS] Can't copy presence info : %d\n", result_code(result));
            } else {
                online = presence->ProductId && std::strcmp(presence->ProductId, g_product_id) == 0;
                EOS_Presence_Info_Release(presence);
            }
            set_bool_field(friend_record(query, k), "online", online);
        }
    }
    query->presence_count += 1;
    friends_query_try_deliver(query);
}

static void EOS_CALL on_friend_mappings(const EOS_Connect_QueryExternalAccountMappingsCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    FriendsMappingBatch *batch = static_cast<FriendsMappingBatch *>(info->ClientData);
    FriendsQuery *query = batch->query;
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to retreive external products id : %d\n", result_code(info->ResultCode));
    } else {
        EOS_HConnect connect = EOS_Platform_GetConnectInterface(g_platform);
        for (int j = batch->first; j < batch->first + batch->count; ++j) {
            EOS_Connect_GetExternalAccountMappingsOptions options;
            std::memset(&options, 0, sizeof options);
            options.ApiVersion = 1;
            options.LocalUserId = g_product_user_id;
            options.AccountIdType = EOS_EExternalAccountType::EOS_EAT_EPIC;
            options.TargetExternalUserId = query->account_ids[j];
            EOS_ProductUserId product_user = EOS_Connect_GetExternalAccountMapping(connect, &options);
            char text[33];
            // A friend without a product user id gets no productId at all.
            if (product_user && product_id_text(product_user, text))
                set_bytes_field(friend_record(query, query->account_slots[j]), "productId", to_vm_bytes(text));
        }
    }
    std::free(batch);
    query->mapping_batches_left -= 1;
    if (query->mapping_batches_left > 0)
        return;
    std::free(query->account_ids);
    query->account_ids = nullptr;
    std::free(query->account_slots);
    query->account_slots = nullptr;
    query->mappings_done = 1;
    friends_query_try_deliver(query);
}
