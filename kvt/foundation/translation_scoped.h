// State that is valid for one translation.
//
// A host runs translations one after the other in one process. An object that caches something for the current
// translation derives from TranslationScoped; when the next one begins, the host calls
// TranslationScopedManager::prepareForNextTranslation() and every living object drops what it holds.
//
// There is no lock: making and destroying such objects and the call itself stand under the host's own exclusion.
#pragma once

#include <kvt/foundation/export.h>

namespace kvt::ex {

/// Base class of objects that hold state for one translation. An object is known to the manager for exactly its
/// lifetime.
class KVT_EXPORT TranslationScoped {
protected:
    TranslationScoped() { registerTS(this); }
    // A copy is an object of its own and registers itself; assignment changes nobody's registration.
    TranslationScoped(const TranslationScoped&) { registerTS(this); }
    TranslationScoped& operator=(const TranslationScoped&) = default;
    virtual ~TranslationScoped() { unregisterTS(this); }

public:
    /// Drops the state held for the translation that ended. It must neither make nor destroy objects of this kind,
    /// and should not throw: an exception leaves prepareForNextTranslation() with the remaining objects not reset.
    virtual void resetForNextTranslation() = 0;

private:
    static void registerTS(TranslationScoped* object);
    static void unregisterTS(TranslationScoped* object) noexcept;
};

/// Knows all living TranslationScoped objects of the process. It owns none of them.
class KVT_EXPORT TranslationScopedManager {
public:
    TranslationScopedManager() = default;
    TranslationScopedManager(const TranslationScopedManager&) = default;
    TranslationScopedManager(TranslationScopedManager&&) = default;
    TranslationScopedManager& operator=(const TranslationScopedManager&) noexcept;
    TranslationScopedManager& operator=(TranslationScopedManager&&) noexcept;
    ~TranslationScopedManager() = default;

    /// Calls resetForNextTranslation() once on each registered object, in the order of their addresses.
    static void prepareForNextTranslation();
};

} // namespace kvt::ex
