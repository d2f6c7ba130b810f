#ifndef VANTOR_PLUGINS_NATIVEPLUGIN_H
#define VANTOR_PLUGINS_NATIVEPLUGIN_H

#include <string>

#include "plugins/Plugin.h"
#include "vantor/plugin.h"

namespace vantor {

// A plugin made from a shared object that exports "operations" and "metadata" (vantor/plugin.h).
// Owns the dynamic linker's handle; both objects lie in the loaded file.
class NativePlugin : public Plugin {
public:
    // Opens the shared object and links the plugin to its barriers. Throws InvalidPluginException
    // with `path` and the reason, having closed what it opened and linked nothing. The path should
    // hold a slash: without one the linker searches its own folders.
    NativePlugin(std::string pluginName, const std::string& path);

    // Closes the shared object.
    ~NativePlugin() override;

    // Calls the start entry, if there is one. A result other than 0 is logged (LOG_ERR). Throws
    // what the entry throws.
    void Start() override;

    bool SupportsHostProfile() const override;

    // As Start(), with the apply-host-profile entry. Throws NotImplementedException without one.
    void ApplyHostProfile() override;

private:
    // A handle of the dynamic linker's, closed with its owner.
    class SharedObject {
    public:
        explicit SharedObject(const std::string& file);
        ~SharedObject();
        SharedObject(const SharedObject&) = delete;
        SharedObject& operator=(const SharedObject&) = delete;

        // The address of an exported object. Throws InvalidPluginException.
        const void* Find(const char* symbol) const;

    private:
        const std::string path;
        void* handle = nullptr;
    };

    void Describe();
    void Call(vantor_method method) const;

    SharedObject object;
    const vantor_operations* operations;
    const vantor_metadata_1* metadata;  // a vantor_metadata_3 from version 3 on
};

}  // namespace vantor

#endif
