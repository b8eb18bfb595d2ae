#pragma once

#include <pluginterfaces/fst/aeffectx.h>

#include <cstddef>
#include <cstdint>

/// The VST 2.4 binary interface: structures and most numbers come from the header above.
///
/// NOTE: that header gives made-up numbers (100000 and up, marked as deprecated) to names whose published
/// number it does not know. Those that are needed stand here under the same names; never use the unqualified
/// ones.
namespace VstPublished {

inline constexpr std::int32_t audioMasterIdle = 3;
inline constexpr std::int32_t audioMasterPinConnected = 4;
inline constexpr std::int32_t audioMasterGetNumAutomatableParameters = 11;
inline constexpr std::int32_t audioMasterIOChanged = 13;
inline constexpr std::int32_t audioMasterNeedIdle = 14;
inline constexpr std::int32_t audioMasterGetLanguage = 38;
inline constexpr std::int32_t audioMasterUpdateDisplay = 42;
inline constexpr std::int32_t audioMasterOpenFileSelector = 45;
inline constexpr std::int32_t audioMasterCloseFileSelector = 46;

inline constexpr std::int32_t effEditIdle = 19;
inline constexpr std::int32_t effSetBypass = 44;
inline constexpr std::int32_t effIdle = 53;
inline constexpr std::int32_t effGetParameterProperties = 56;
inline constexpr std::int32_t effSetEditKnobMode = 61;
inline constexpr std::int32_t effBeginSetProgram = 67;
inline constexpr std::int32_t effEndSetProgram = 68;

inline constexpr std::int32_t kVstProcessLevelUser = 1;
inline constexpr std::int32_t kVstProcessLevelRealtime = 2;
inline constexpr std::int32_t kVstLangEnglish = 1;

/// What `effGetParameterProperties` fills in.
struct VstParameterProperties {
    float stepFloat;
    float smallStepFloat;
    float largeStepFloat;
    char label[64];
    std::int32_t flags;
    std::int32_t minInteger;
    std::int32_t maxInteger;
    std::int32_t stepInteger;
    std::int32_t largeStepInteger;
    char shortLabel[8];
    std::int16_t displayIndex;
    std::int16_t category;
    std::int16_t numParametersInCategory;
    std::int16_t reserved;
    char categoryLabel[24];
    char future[16];
};

/// A speaker of an arrangement. Its place in the room, which comes first, is left at zero: the type says it.
struct VstSpeakerProperties {
    float azimuth;
    float elevation;
    float radius;
    float reserved;
    char name[64];
    std::int32_t type;
    char future[28];
};

} // namespace VstPublished

// The published layout on 64-bit systems, of what is read or written here.
static_assert(offsetof(AEffect, magic) == 0 && offsetof(AEffect, dispatcher) == 8);
static_assert(offsetof(AEffect, numPrograms) == 40 && offsetof(AEffect, numParams) == 44);
static_assert(offsetof(AEffect, numInputs) == 48 && offsetof(AEffect, numOutputs) == 52);
static_assert(offsetof(AEffect, flags) == 56 && offsetof(AEffect, resvd1) == 64);
static_assert(offsetof(AEffect, initialDelay) == 80 && offsetof(AEffect, uniqueID) == 112);
static_assert(offsetof(AEffect, version) == 116 && offsetof(AEffect, processReplacing) == 120);
static_assert(sizeof(VstIntPtr) == sizeof(void *));
static_assert(offsetof(VstPublished::VstParameterProperties, label) == 12);
static_assert(offsetof(VstPublished::VstParameterProperties, shortLabel) == 96);
static_assert(offsetof(VstPublished::VstParameterProperties, categoryLabel) == 112);
static_assert(sizeof(VstPublished::VstParameterProperties) == 152);
static_assert(offsetof(VstPublished::VstSpeakerProperties, name) == 16);
static_assert(offsetof(VstPublished::VstSpeakerProperties, type) == 80);
static_assert(sizeof(VstPublished::VstSpeakerProperties) == 112);
