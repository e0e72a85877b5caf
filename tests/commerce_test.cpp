// Ownership of catalogue items and the store checkout.
#include "tarnwick_test.h"

using namespace tw;
using eos_sim::Failure;

namespace {

using Ids = std::vector<std::optional<std::string>>;

std::string epic_of(const std::string &account) { return eos_sim::derive_id("epic:" + account); }

Ids numbered(int count)
{
    Ids ids;
    for (int i = 0; i < count; ++i)
        ids.push_back("item_" + std::to_string(i));
    return ids;
}

}  // namespace

class Commerce : public TarnwickTest {
protected:
    // Asks for these ids (an array built from them, or the array given) and
    // ticks until the closure ran: nullopt for a null list.
    std::optional<Ids> owned(varray *itemIds)
    {
        host::ClosureRef onOwned = host::make_closure("PA_v");
        p.query_ownership(itemIds, onOwned->vm);
        EXPECT_EQ(hlrt::root_count(), 1u);
        for (int i = 0; i < 10 && onOwned->count() == 0; ++i)
            tick();
        // The list is the game's now: hold it through the collections.
        varray *list = onOwned->count() ? arg_array(onOwned->last(), 0) : nullptr;
        host::Held keep(list);
        tick_collecting(2);
        EXPECT_EQ(onOwned->count(), 1u);
        if (!list)
            return std::nullopt;
        EXPECT_EQ(list->at, &hlt_bytes);
        // Each id is a VM copy that keeps its terminating zero.
        for (void *slot : host::array_slots(list)) {
            auto *id = static_cast<vbyte *>(slot);
            EXPECT_EQ(host::bytes_size(id), static_cast<long>(host::read_bytes(id).value_or("").size() + 1));
        }
        return host::array_bytes(list);
    }
    std::optional<Ids> owned(const Ids &ids) { return owned(host::bytes_array(ids)); }

    nlohmann::json last_query() const { return eos_sim::calls("EOS_Ecom_QueryOwnership").back().options; }
};

TEST_F(Commerce, OnlyOwnedItemsComeBackInTheSdksOrder)
{
    sign_in();
    eos_sim::update_world([](eos_sim::World &w) {
        w.accounts[0].ownership["item_bow"] = EOS_EOwnershipStatus::EOS_OS_Owned;
        w.accounts[0].ownership["item_odd"] = static_cast<EOS_EOwnershipStatus>(2);
    });
    std::optional<Ids> got = owned(Ids{"item_bow", "item_shield", "item_odd", "item_unknown", "item_sword"});
    ASSERT_TRUE(got.has_value());
    EXPECT_EQ(*got, (Ids{"item_bow", "item_sword"}));
    EXPECT_EQ(last_query(), (nlohmann::json{{"ApiVersion", 2},
                                            {"LocalUserId", epic_of("me")},
                                            {"CatalogItemIds", {"item_bow", "item_shield", "item_odd", "item_unknown", "item_sword"}},
                                            {"CatalogItemIdCount", 5},
                                            {"CatalogNamespace", nullptr}}));
    expect_clean();
}

TEST_F(Commerce, NothingOwnedIsAnEmptyListAndAFailedQueryNull)
{
    sign_in();
    std::optional<Ids> got = owned(Ids{"item_shield"});
    ASSERT_TRUE(got.has_value());
    EXPECT_TRUE(got->empty());
    got = owned(Ids{});
    ASSERT_TRUE(got.has_value());
    EXPECT_TRUE(got->empty());
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 0);

    size_t lines = egs_lines().size();
    eos_sim::inject("EOS_Ecom_QueryOwnership", Failure::once(EOS_EResult::EOS_NoConnection));
    EXPECT_EQ(owned(Ids{"item_sword"}), std::nullopt);
    EXPECT_EQ(egs_lines().size(), lines);
    // A not-final answer is no answer: the closure runs once, on the real one.
    eos_sim::inject("EOS_Ecom_QueryOwnership", Failure::retry());
    EXPECT_EQ(owned(Ids{"item_sword"}), std::optional<Ids>(Ids{"item_sword"}));
    expect_clean();
}

TEST_F(Commerce, TheSdksLimitOf400IdsFailsALongerListWithNull)
{
    sign_in();
    EXPECT_EQ(owned(numbered(400)), std::optional<Ids>(Ids{}));
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 400);
    EXPECT_EQ(owned(numbered(401)), std::nullopt);
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 401);
    expect_clean();
}

TEST_F(Commerce, AMissingOrForeignArrayAsksForNoneAndNullEntriesAreSkipped)
{
    sign_in();
    EXPECT_EQ(owned(static_cast<varray *>(nullptr)), std::optional<Ids>(Ids{}));
    EXPECT_TRUE(logged("[EGS] No catalogue item ids, ownership asked for none"));
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 0);

    varray *numbers = hl_alloc_array(&hlt_i32, 2);
    host::Held keep(numbers);
    EXPECT_EQ(owned(numbers), std::optional<Ids>(Ids{}));
    EXPECT_TRUE(logged("[EGS] Catalogue item ids are not bytes, ownership asked for none"));
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 0);

    EXPECT_EQ(owned(Ids{std::nullopt, "item_shield", std::nullopt, "item_sword"}), std::optional<Ids>(Ids{"item_sword"}));
    EXPECT_TRUE(logged("[EGS] Null catalogue item ids skipped : 2"));
    EXPECT_EQ(last_query()["CatalogItemIds"], (nlohmann::json{"item_shield", "item_sword"}));
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 2);

    // Only nulls: asked for none.
    EXPECT_EQ(owned(Ids{std::nullopt}), std::optional<Ids>(Ids{}));
    EXPECT_EQ(last_query()["CatalogItemIdCount"], 0);
    EXPECT_TRUE(logged("[EGS] Null catalogue item ids skipped : 1"));
    expect_clean();
}

TEST_F(Commerce, WithoutAClosureTheQueryIsSentAndNothingFollows)
{
    sign_in();
    p.query_ownership(host::bytes_array(std::vector<std::string>{"item_sword"}), nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    auto asked = eos_sim::calls("EOS_Ecom_QueryOwnership");
    ASSERT_EQ(asked.size(), 1u);
    EXPECT_EQ(asked[0].client_data, nullptr);
    tick_collecting(3);
    EXPECT_EQ(eos_sim::calls("EOS_Ecom_QueryOwnership")[0].result, std::optional<EOS_EResult>(EOS_EResult::EOS_Success));
    expect_clean();
}

TEST_F(Commerce, CheckoutAsksForTheOneOfferThroughItsDescriptorOrItsSymbol)
{
    sign_in();
    host::Descriptor d = host::describe("store_checkout");
    ASSERT_TRUE(d.found);
    EXPECT_EQ(d.signature, std::optional<std::string>("PB_v"));
    EXPECT_EQ(host::symbol("hleos_store_checkout"), reinterpret_cast<void *>(p.store_checkout));

    size_t lines = egs_lines().size();
    auto by_symbol = reinterpret_cast<void (*)(vbyte *)>(host::symbol("hleos_store_checkout"));
    p.store_checkout(host::bytes("offer_one"));
    by_symbol(host::bytes("offer_two"));
    auto checkouts = eos_sim::calls("EOS_Ecom_Checkout");
    ASSERT_EQ(checkouts.size(), 2u);
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(checkouts[i].options,
                  (nlohmann::json{{"ApiVersion", 1},
                                  {"LocalUserId", epic_of("me")},
                                  {"OverrideCatalogNamespace", nullptr},
                                  {"EntryCount", 1},
                                  {"Entries", nlohmann::json::array({nlohmann::json{
                                                 {"ApiVersion", 1}, {"OfferId", i ? "offer_two" : "offer_one"}}})}}));
        EXPECT_EQ(checkouts[i].client_data, nullptr);
    }
    tick_collecting(2);
    EXPECT_EQ(eos_sim::calls("EOS_Ecom_Checkout")[1].result, std::optional<EOS_EResult>(EOS_EResult::EOS_Success));
    EXPECT_EQ(egs_lines().size(), lines);
    expect_clean();
}

TEST_F(Commerce, ACheckoutTheSdkRefusesChangesNothingForTheGame)
{
    host::InitConfigValues values = config();
    values.enableOverlay = false;
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    ASSERT_TRUE(init(values, onLogin));
    ASSERT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    size_t lines = egs_lines().size();
    p.store_checkout(host::bytes("offer_one"));
    tick_collecting(2);
    EXPECT_EQ(eos_sim::calls("EOS_Ecom_Checkout")[0].result, std::optional<EOS_EResult>(EOS_EResult::EOS_NotConfigured));
    EXPECT_EQ(egs_lines().size(), lines);
    // Everything else goes on as before.
    EXPECT_EQ(owned(Ids{"item_sword"}), std::optional<Ids>(Ids{"item_sword"}));
    expect_clean();
}

TEST_F(Commerce, NothingIsAskedWithoutAPlatform)
{
    host::ClosureRef onOwned = host::make_closure("PA_v");
    p.query_ownership(host::bytes_array(std::vector<std::string>{"item_sword"}), onOwned->vm);
    p.store_checkout(host::bytes("offer_one"));
    EXPECT_EQ(onOwned->count(), 0u);
    EXPECT_TRUE(logged("[EGS] No EOS platform, query_ownership ignored"));
    EXPECT_TRUE(logged("[EGS] No EOS platform, store_checkout ignored"));
    EXPECT_TRUE(eos_sim::calls().empty());
    expect_clean();
}
