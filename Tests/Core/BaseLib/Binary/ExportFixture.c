// A library whose tables are read and whose code never runs. What it does with the entry point's name depends
// on the macro that it is built with.

#define VISIBLE __attribute__((visibility("default")))

#if defined(ENTRY_exported)
VISIBLE void VSTPluginMain(void) {}
#elif defined(ENTRY_weak)
VISIBLE __attribute__((weak)) void VSTPluginMain(void) {}
#elif defined(ENTRY_protected)
__attribute__((visibility("protected"))) void VSTPluginMain(void) {}
#elif defined(ENTRY_hidden)
__attribute__((visibility("hidden"))) void VSTPluginMain(void) {}
#elif defined(ENTRY_undefined)
VISIBLE void VSTPluginMain(void);
VISIBLE void (*const kEntry)(void) = VSTPluginMain;
#elif defined(ENTRY_weakUndefined)
VISIBLE __attribute__((weak)) void VSTPluginMain(void);
VISIBLE void (*const kEntry)(void) = VSTPluginMain;
#endif

// Neighbours, so that symbols share their places in the look-up tables.
#define NEIGHBOUR(name)                                                                                      \
    VISIBLE void name(void) {}
#define NEIGHBOURS(name) NEIGHBOUR(name##A) NEIGHBOUR(name##B) NEIGHBOUR(name##C) NEIGHBOUR(name##D)
NEIGHBOURS(VSTPlugin)
NEIGHBOURS(VSTPluginMain)
NEIGHBOURS(plug)
NEIGHBOURS(other)
