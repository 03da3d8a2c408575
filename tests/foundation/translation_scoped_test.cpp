// Objects that hold state for one translation, and the call that makes them drop it.
#include <kvt/foundation/translation_scoped.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <new>
#include <optional>
#include <random>
#include <stdexcept>
#include <type_traits>
#include <utility>
#include <vector>

namespace {

using kvt::ex::TranslationScoped;
using kvt::ex::TranslationScopedManager;

class Cache : public TranslationScoped {
public:
    explicit Cache(std::vector<const Cache*>& log) : log_(&log) {}
    void resetForNextTranslation() override {
        ++resets_;
        log_->push_back(this);
    }
    int resets() const { return resets_; }

private:
    std::vector<const Cache*>* log_;
    int resets_ = 0;
};

bool inAddressOrder(const std::vector<const Cache*>& log) {
    return std::is_sorted(log.begin(), log.end(), std::less<>());
}

TEST(TranslationScoped, IsMadeAndDestroyedByDerivedClassesOnly) {
    static_assert(std::is_abstract_v<TranslationScoped>);
    static_assert(std::is_polymorphic_v<TranslationScoped>);
    static_assert(!std::is_constructible_v<TranslationScoped>);
    static_assert(!std::is_destructible_v<TranslationScoped>);
    static_assert(std::has_virtual_destructor_v<Cache>);
    SUCCEED();
}

TEST(TranslationScoped, WithNothingRegisteredThereIsNothingToDo) {
    EXPECT_NO_THROW(TranslationScopedManager::prepareForNextTranslation());
}

TEST(TranslationScoped, EachLivingObjectIsResetOncePerCall) {
    std::vector<const Cache*> log;
    Cache a(log);
    Cache b(log);
    EXPECT_EQ(a.resets(), 0);
    for (int call = 1; call <= 3; ++call) {
        TranslationScopedManager::prepareForNextTranslation();
        EXPECT_EQ(a.resets(), call);
        EXPECT_EQ(b.resets(), call);
    }
}

TEST(TranslationScoped, ADestroyedObjectIsNotReset) {
    std::vector<const Cache*> log;
    Cache stays(log);
    auto goes = std::make_unique<Cache>(log);
    goes.reset();
    TranslationScopedManager::prepareForNextTranslation();
    EXPECT_EQ(log, std::vector<const Cache*>{&stays});
}

TEST(TranslationScoped, ResetsRunInAddressOrderWhateverTheOrderOfRegistration) {
    std::vector<const Cache*> log;
    constexpr std::size_t count = 40;
    std::vector<std::optional<Cache>> places(count);
    std::vector<std::size_t> order(count);
    for (std::size_t i = 0; i < count; ++i) {
        order[i] = i;
    }
    std::mt19937 random(99);
    for (int round = 0; round < 5; ++round) {
        std::shuffle(order.begin(), order.end(), random);
        for (const std::size_t i : order) {
            places[i].emplace(log);
        }
        log.clear();
        TranslationScopedManager::prepareForNextTranslation();
        EXPECT_EQ(log.size(), count);
        EXPECT_TRUE(inAddressOrder(log));
        for (const std::size_t i : order) {
            places[i].reset();
        }
    }
}

TEST(TranslationScoped, AnObjectInTheSamePlaceRegistersAnew) {
    std::vector<const Cache*> log;
    std::optional<Cache> place(std::in_place, log);
    place.emplace(log);
    TranslationScopedManager::prepareForNextTranslation();
    EXPECT_EQ(log.size(), 1u);
    EXPECT_EQ(place->resets(), 1);
}

TEST(TranslationScoped, ACopyIsAnObjectOfItsOwn) {
    std::vector<const Cache*> log;
    Cache original(log);
    {
        Cache copy(original);
        copy = original;
        TranslationScopedManager::prepareForNextTranslation();
        EXPECT_EQ(log.size(), 2u);
        EXPECT_EQ(copy.resets(), 1);
    }
    TranslationScopedManager::prepareForNextTranslation();
    EXPECT_EQ(original.resets(), 2);
    EXPECT_EQ(log.size(), 3u);
}

TEST(TranslationScopedManager, IsAssignableAndOwnsNothing) {
    std::vector<const Cache*> log;
    const Cache cache(log);
    {
        TranslationScopedManager a;
        TranslationScopedManager b;
        EXPECT_EQ(&(a = b), &a);
        EXPECT_EQ(&(a = std::move(b)), &a);
    }
    TranslationScopedManager::prepareForNextTranslation();
    EXPECT_EQ(cache.resets(), 1);
}

} // namespace
