// A library that counts its own unloading.

#ifdef _WIN32
#define EXPORTED extern "C" __declspec(dllexport)
#else
#define EXPORTED extern "C" __attribute__((visibility("default")))
#endif

namespace {

struct Farewell {
    int *counter = nullptr;
    ~Farewell()
    {
        if (counter)
            ++*counter;
    }
};
Farewell s_farewell;

} // namespace

EXPORTED void countUnloading(int *counter) { s_farewell.counter = counter; }
