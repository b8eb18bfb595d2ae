#pragma once

#include <cstddef>

/// The workstation's data folders: a few roots, set once at start-up before other threads start, and what is
/// derived from them. Every text has at most 260 wide characters, the terminator included, and is cut there
/// silently: the path limit of the system that the layout is made for. Paths
/// have backslashes on every platform; an unset root leaves a relative one.
///
/// A result lies in a buffer of 260 characters, never null. That of most getters belongs to the getter, whose
/// next call overwrites it, so that two threads must not share a getter; scratch results come from a pool and
/// outlive at least the next `kScratchResults - 1` scratch results of any thread.
namespace WorkstationFolders {

inline constexpr std::size_t kPathSize = 260;
inline constexpr std::size_t kScratchResults = 16;

enum class Folder {
    // of the work folder
    Debug,
    Undo,
    Media,
    Meters,
    Temp,
    DeviceInfo,
    MXFIndexedFiles, ///< scratch
    TemplateRamps,
    VideoStream,
    WorkRoot,
    // of the preset folder
    Macros,
    Dissolves,
    EQPresets,   ///< scratch
    FXPresets,   ///< scratch
    FadePresets, ///< scratch
    UserMachines,
    EdlConfig, ///< scratch
    CapturePreset,
    PresetRoot,
    // of the system folder
    Effects,
    VSTPlugins,
    Pictures,
    FileFormatPlugins,
    SystemMachines,
    Shaders, ///< scratch
    SystemRoot
};

/// Sets the system folder, without the separators at its end, and with it all other roots. In all the setters
/// a null text counts as an empty one.
void setSystemFolder(const wchar_t *folder);
/// Each sets one root to the text as it is; gives 0.
int setWorkFolder(const wchar_t *folder);
int setPresetFolder(const wchar_t *folder);
int setAuxFolder(const wchar_t *folder);
void setInstallRoot(const wchar_t *folder);
/// When on, the shaders lie in the folder that was derived when the system folder was set.
void setShadersOverride(bool on);

/// A folder, or with a name the path of a file in it.
const wchar_t *folderPath(Folder folder, const wchar_t *fileName = nullptr);
/// The install root with the name put right behind it; empty while no root is set. Scratch.
const wchar_t *installRootPath(const wchar_t *fileName = nullptr);
/// The folder of profiles below the one that the environment variable TMP names, with a separator at its end,
/// or a file in it.
const wchar_t *profilesPath(const wchar_t *fileName = nullptr);

const wchar_t *auxFolder();
const wchar_t *themesFolder();

} // namespace WorkstationFolders
