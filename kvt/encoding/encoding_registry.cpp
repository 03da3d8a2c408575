// The registry of encodings and the choice of the system encoding.
#include <kvt/encoding/detail/encoding_registry.h>

#include <kvt/encoding/detail/code_page_names.h>
#include <kvt/encoding/detail/debugger_view.h>
#include <kvt/encoding/detail/icu.h>
#include <kvt/platform/code_page.h>

#include <algorithm>

namespace kvt::ex::detail {
namespace {

// The canonical name of the encoding that the process's locale names.
std::string resolveSystemName() {
    const platform::CodeSet codeSet = platform::processCodeSet();
    for (const std::string_view name : {codePageName(codeSet.codePage), std::string_view(codeSet.name)}) {
        // Some versions of ICU take an empty name for their own default.
        std::string normalised = name.empty() ? std::string() : EncodingRegistry::normaliseName(name);
        if (!normalised.empty()) {
            return normalised;
        }
    }
    return EncodingRegistry::normaliseName("ISO-8859-1");
}

constexpr std::array<std::string_view, EncodingRegistry::firstDynamic> fixedNames = {
    "UTF-8",        "US-ASCII",     "UTF-16LE",         "UTF-32LE",
    "UTF-16BE",     "UTF-32BE",     "ISO-8859-1",       "ISO-8859-2",
    "ISO-8859-3",   "ISO-8859-4",   "ISO-8859-5",       "ISO-8859-6",
    "ISO-8859-7",   "ISO-8859-8",   "ISO-8859-9",       "iso-8859-11-2001",
    "ISO-8859-13",  "ISO-8859-15",  "windows-1250",     "windows-1251",
    "windows-1252", "windows-1253", "windows-1254",     "windows-1255",
    "windows-1256", "windows-1257", "windows-1258",     "" /* System */,
    "zqt-binary",   "zqt-wwjd",     "Unknown Encoding",
};

std::array<std::string_view, EncodingRegistry::firstDynamic> namesWithSystem(std::string_view systemName) {
    auto names = fixedNames;
    names[Encoding::System] = systemName;
    return names;
}

} // namespace

DebuggerView encodingNames{};

EncodingRegistry& EncodingRegistry::instance() {
    // Never destroyed: destructors of static objects convert text, too, in whatever order they run.
    static auto& registry = *new EncodingRegistry();
    return registry;
}

// The system's name stands behind the fixed names: the first insertion of a key wins, so a system encoding that has
// a fixed id keeps that id, and only another one evaluates to `System` itself.
EncodingRegistry::EncodingRegistry()
    : systemName_(resolveSystemName()),
      staticIds_{
          {"UTF-8", Encoding::Utf8},
          {"UTF-16LE", Encoding::Utf16LE},
          {"UTF-32LE", Encoding::Utf32LE},
          {"UTF-16BE", Encoding::Utf16BE},
          {"UTF-32BE", Encoding::Utf32BE},
          {"US-ASCII", Encoding::UsAscii},
          {"ISO-8859-1", Encoding::Iso8859_1},
          {"ISO-8859-2", Encoding::Iso8859_2},
          {"ISO-8859-3", Encoding::Iso8859_3},
          {"ISO-8859-4", Encoding::Iso8859_4},
          {"ISO-8859-5", Encoding::Iso8859_5},
          {"ISO-8859-6", Encoding::Iso8859_6},
          {"ISO-8859-7", Encoding::Iso8859_7},
          {"ISO-8859-8", Encoding::Iso8859_8},
          {"ISO-8859-9", Encoding::Iso8859_9},
          {"iso-8859-11-2001", Encoding::Iso8859_11},
          {"ISO-8859-13", Encoding::Iso8859_13},
          {"ISO-8859-15", Encoding::Iso8859_15},
          {"windows-1250", Encoding::Windows1250},
          {"windows-1251", Encoding::Windows1251},
          {"windows-1252", Encoding::Windows1252},
          {"windows-1253", Encoding::Windows1253},
          {"windows-1254", Encoding::Windows1254},
          {"windows-1255", Encoding::Windows1255},
          {"windows-1256", Encoding::Windows1256},
          {"windows-1257", Encoding::Windows1257},
          {"windows-1258", Encoding::Windows1258},
          {"zqt-binary", Encoding::Binary},
          {"zqt-wwjd", Encoding::Wwjd},
          {systemName_, Encoding::System},
          {"", Encoding::Unknown},
          {"zqt-system", Encoding::System},
          {"ANSI", Encoding::System},
          {"SYSTEM", Encoding::System},
          {"system", Encoding::System},
          {"BINARY", Encoding::Binary},
          {"binary", Encoding::Binary},
      },
      typeNames_(namesWithSystem(systemName_)) {
    encodingNames = {typeNames_.data(), &dynamicNames_};
}

std::uint32_t EncodingRegistry::lookupId(std::string_view name) {
    if (const auto id = staticIds_.find(name)) {
        return *id;
    }
    if (const auto id = dynamicIds_.find(name)) {
        return *id;
    }
    const std::lock_guard lock(mutex_);
    // It may have come in meanwhile.
    if (const auto id = dynamicIds_.find(name)) {
        return *id;
    }
    const std::string canonical = normaliseName(name);
    // An unknown name is found here: its canonical form is empty, and the empty name is `Unknown`.
    if (const auto id = staticIds_.find(canonical)) {
        dynamicIds_.insert(name, *id);
        return *id;
    }
    if (const auto id = dynamicIds_.find(canonical)) {
        dynamicIds_.insert(name, *id);
        return *id;
    }
    const auto count = static_cast<std::uint32_t>(dynamicNames_.size());
    const std::uint32_t id = count + firstDynamic;
    std::string_view& view = dynamicViews_.make(count);
    dynamicNames_.push_back(canonical);
    view = dynamicNames_.back();
    dynamicCount_.store(count + 1, std::memory_order_release);
    try {
        dynamicIds_.insert(canonical, id);
        dynamicIds_.insert(name, id);
    } catch (...) {
        // Without its key the name would take an id that nobody can find. (If the key is in, so is the name.)
        if (!dynamicIds_.find(canonical)) {
            dynamicCount_.store(count, std::memory_order_release);
            dynamicNames_.pop_back();
        }
        throw;
    }
    return id;
}

std::string_view EncodingRegistry::nameOf(std::uint32_t id) {
    if (id < firstDynamic) {
        return typeNames_[id];
    }
    const std::uint32_t index = id - firstDynamic;
    return index < dynamicCount_.load(std::memory_order_acquire) ? *dynamicViews_.find(index)
                                                                 : std::string_view();
}

std::string EncodingRegistry::normaliseName(std::string_view name) {
    // ICU wants a terminated name, so that text behind a zero does not count.
    const std::string terminated(name);
    std::string standard = icu::standardName(terminated.c_str());
    if (standard == "UTF-16") {
        return "UTF-16LE";
    }
    if (standard == "UTF-32") {
        return "UTF-32LE";
    }
    return standard;
}

} // namespace kvt::ex::detail
