// The set of living TranslationScoped objects, and the walk over it.
#include <kvt/foundation/translation_scoped.h>

#include <functional>
#include <set>

namespace kvt::ex {
namespace {

// std::less, not the built-in comparison: only it orders unrelated addresses.
using Registered = std::set<TranslationScoped*, std::less<TranslationScoped*>>;

Registered& registered() {
    // Never destroyed: an object with static storage of another module may unregister after this module's statics
    // are gone.
    static auto* const objects = new Registered();
    return *objects;
}

} // namespace

void TranslationScoped::registerTS(TranslationScoped* object) {
    registered().insert(object);
}

void TranslationScoped::unregisterTS(TranslationScoped* object) noexcept {
    registered().erase(object);
}

TranslationScopedManager& TranslationScopedManager::operator=(const TranslationScopedManager&) noexcept {
    return *this;
}

TranslationScopedManager& TranslationScopedManager::operator=(TranslationScopedManager&&) noexcept {
    return *this;
}

void TranslationScopedManager::prepareForNextTranslation() {
    for (TranslationScoped* object : registered()) {
        object->resetForNextTranslation();
    }
}

} // namespace kvt::ex
