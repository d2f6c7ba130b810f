#include "plugins/NativePlugin.h"

#include <dlfcn.h>
#include <syslog.h>

#include <utility>

#include "plugins/Exceptions.h"
#include "plugins/SharedObjectCheck.h"

namespace vantor {

namespace {

constexpr std::int32_t oldestVersion = 1;
constexpr std::int32_t newestVersion = 4;
constexpr std::int32_t hostProfileVersion = 2;  // first version with an apply-host-profile entry
constexpr std::int32_t flagsVersion = 3;        // first version with the long metadata record

std::list<std::string> Names(vantor_names names) {
    std::list<std::string> result;
    if (names != nullptr) {
        for (; *names != nullptr; ++names) {
            result.emplace_back(*names);
        }
    }
    return result;
}

std::set<std::string> NameSet(vantor_names names) {
    const std::list<std::string> list = Names(names);
    return {list.begin(), list.end()};
}

}  // namespace

NativePlugin::SharedObject::SharedObject(const std::string& file) : path(file) {
    if (const std::string reason = ReasonNotToLoad(path); !reason.empty()) {
        throw InvalidPluginException(path, reason);
    }
    dlerror();
    handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_GLOBAL);
    if (handle == nullptr) {
        throw InvalidPluginException(path, dlerror());
    }
}

NativePlugin::SharedObject::~SharedObject() { dlclose(handle); }

const void* NativePlugin::SharedObject::Find(const char* symbol) const {
    const void* const address = dlsym(handle, symbol);
    if (const char* const error = dlerror(); error != nullptr) {
        throw InvalidPluginException(path, error);
    }
    // The linker finds nothing wrong with a symbol whose address is 0; reading it would be fatal.
    if (address == nullptr) {
        throw InvalidPluginException(path, std::string("symbol ") + symbol + " has no address");
    }
    return address;
}

NativePlugin::NativePlugin(std::string pluginName, const std::string& path)
    : Plugin(std::move(pluginName)),
      object(path),
      operations(static_cast<const vantor_operations*>(object.Find("operations"))),
      metadata(static_cast<const vantor_metadata_1*>(object.Find("metadata"))) {
    apiVersion = metadata->version;
    if (apiVersion < oldestVersion || apiVersion > newestVersion) {
        throw InvalidPluginException(path, "Unsupported API version");
    }
    Describe();
}

NativePlugin::~NativePlugin() = default;

void NativePlugin::Describe() {
    Provide(Names(metadata->provides));
    Require(Names(metadata->VANTOR_REQUIRES_FIELD));
    if (apiVersion < flagsVersion) {
        return;  // the record ends here
    }
    const auto* const record = reinterpret_cast<const vantor_metadata_3*>(metadata);
    requiredFlags = NameSet(record->required_flags);
    disablingFlags = NameSet(record->disabling_flags);
    runOnce = record->run_once != 0;
    if (record->plugin_version != nullptr) {
        pluginVersion = record->plugin_version;
    }
}

void NativePlugin::Start() { Call(operations->start); }

bool NativePlugin::SupportsHostProfile() const {
    return apiVersion >= hostProfileVersion && operations->apply_host_profile != nullptr;
}

void NativePlugin::ApplyHostProfile() {
    if (!SupportsHostProfile()) {
        throw NotImplementedException("NativePlugin::ApplyHostProfile");
    }
    Call(operations->apply_host_profile);
}

void NativePlugin::Call(vantor_method method) const {
    if (method == nullptr) {
        return;
    }
    const std::uint32_t result = method();
    if (result != 0) {
        syslog(LOG_ERR, "execution failure in context '%s', returncode %u", Name().c_str(),
               static_cast<unsigned>(result));
    }
}

}  // namespace vantor
