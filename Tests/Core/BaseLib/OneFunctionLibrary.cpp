// A library that counts its own unloading; built a second time with a function that nobody has.

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

#ifdef NEEDS_A_MISSING_FUNCTION
extern "C" void functionThatNobodyHas();
#endif

EXPORTED void countUnloading(int *counter)
{
#ifdef NEEDS_A_MISSING_FUNCTION
    functionThatNobodyHas();
#endif
    s_farewell.counter = counter;
}
