# The VST 3 SDK: its interfaces, and the few sources that a host needs.
set(VST3_SDK_ROOT "/usr/share/juce/modules/juce_audio_processors/format_types/VST3_SDK"
    CACHE PATH "Folder that holds the SDK's pluginterfaces and public.sdk")
if(NOT EXISTS "${VST3_SDK_ROOT}/pluginterfaces/base/funknown.h")
    message(FATAL_ERROR "No VST 3 SDK in '${VST3_SDK_ROOT}': install the packages that scripts/setup lists, "
                        "or name another copy with -DVST3_SDK_ROOT=")
endif()

add_library(vst3sdk STATIC
    "${VST3_SDK_ROOT}/pluginterfaces/base/coreiids.cpp"
    "${VST3_SDK_ROOT}/pluginterfaces/base/funknown.cpp"
    "${VST3_SDK_ROOT}/public.sdk/source/common/memorystream.cpp"
    "${VST3_SDK_ROOT}/public.sdk/source/vst/vstinitiids.cpp")
target_include_directories(vst3sdk SYSTEM PUBLIC "${VST3_SDK_ROOT}")
target_compile_definitions(vst3sdk PUBLIC RELEASE=1)
target_compile_options(vst3sdk PRIVATE -w)
set_property(TARGET vst3sdk PROPERTY CXX_CLANG_TIDY "")
if(WIN32)
    target_link_libraries(vst3sdk PUBLIC ole32)
endif()
