// Lists the CLAP modules given, on the bare headers and nothing of ours: a line for each plug-in,
// "path|id|name|vendor|features| inputs|outputs", the channels being those of the main ports. Plug-ins that
// misbehave take it along.

#include <clap/entry.h>
#include <clap/ext/audio-ports.h>
#include <clap/plugin-factory.h>

#include <cstdio>
#include <string>

#ifdef _WIN32
#include <windows.h>
static HMODULE load(const char *path) { return LoadLibraryA(path); }
static const auto symbolOf = &GetProcAddress;
static const auto unload = &FreeLibrary;
#else
#include <dlfcn.h>
static void *load(const char *path) { return dlopen(path, RTLD_NOW | RTLD_LOCAL); }
static const auto symbolOf = &dlsym;
static const auto unload = &dlclose;
#endif

static unsigned channels(const clap_plugin_t *plugin, bool isInput)
{
    unsigned sum = 0;
    const void *const extension = plugin->get_extension(plugin, CLAP_EXT_AUDIO_PORTS);
    const auto *const ports = static_cast<const clap_plugin_audio_ports_t *>(extension);
    for (uint32_t index = 0; ports && index < ports->count(plugin, isInput); ++index) {
        clap_audio_port_info_t info = {};
        if (ports->get(plugin, index, isInput, &info) && (info.flags & CLAP_AUDIO_PORT_IS_MAIN) != 0)
            sum += info.channel_count;
    }
    return sum;
}

static void list(const char *path, const clap_plugin_factory_t *factory, const clap_host_t *host)
{
    for (uint32_t index = 0; index < factory->get_plugin_count(factory); ++index) {
        const clap_plugin_descriptor_t *const about = factory->get_plugin_descriptor(factory, index);
        std::string features;
        for (const char *const *feature = about->features; *feature; ++feature)
            features += (features.empty() ? "" : "|") + std::string(*feature);
        const clap_plugin_t *const plugin = factory->create_plugin(factory, host, about->id);
        if (plugin->init(plugin))
            std::printf("%s|%s|%s|%s|%s|%u|%u\n", path, about->id, about->name, about->vendor,
                        features.c_str(), channels(plugin, true), channels(plugin, false));
        plugin->destroy(plugin);
    }
}

int main(int count, char **paths)
{
    const auto none = [](const clap_host_t *) {};
    const clap_host_t host = {CLAP_VERSION,
                              nullptr,
                              "Lister",
                              "",
                              "",
                              "1",
                              [](const clap_host_t *, const char *) -> const void * { return nullptr; },
                              none,
                              none,
                              none};
    for (int index = 1; index < count; ++index) {
        const auto library = load(paths[index]);
        const auto *const entry =
            library ? reinterpret_cast<const clap_plugin_entry_t *>(symbolOf(library, "clap_entry"))
                    : nullptr;
        if (!entry || !entry->init(paths[index]))
            return std::fprintf(stderr, "cannot load %s\n", paths[index]);
        list(paths[index],
             static_cast<const clap_plugin_factory_t *>(entry->get_factory(CLAP_PLUGIN_FACTORY_ID)), &host);
        entry->deinit();
        unload(library);
    }
    return 0;
}
