#include "Core/BaseLib/WorkstationServices/WorkstationFolders.h"

#include <QString>

#include <algorithm>
#include <array>
#include <atomic>
#include <iterator>
#include <string>

namespace {

using namespace WorkstationFolders;
using PathBuffer = std::array<wchar_t, kPathSize>;

PathBuffer s_system{};
PathBuffer s_work{};
PathBuffer s_preset{};
PathBuffer s_aux{};
PathBuffer s_themes{};
PathBuffer s_shaders{};
PathBuffer s_installRoot{};
bool s_shadersOverride = false;

enum class Result { Own, Scratch };

struct Row {
    Folder folder;
    const PathBuffer &root;
    const wchar_t *below;
    Result result;
};

const Row kRows[] = {
    {Folder::Debug, s_work, L"\\Debug", Result::Own},
    {Folder::Undo, s_work, L"\\Undo", Result::Own},
    {Folder::Media, s_work, L"\\Media", Result::Own},
    {Folder::Meters, s_work, L"\\Meters", Result::Own},
    {Folder::Temp, s_work, L"\\Temp", Result::Own},
    {Folder::DeviceInfo, s_work, L"\\DeviceInfo", Result::Own},
    {Folder::MXFIndexedFiles, s_work, L"\\MXF_Indexed_Files", Result::Scratch},
    {Folder::TemplateRamps, s_work, L"\\Template Ramps", Result::Own},
    {Folder::VideoStream, s_work, L"\\VideoStream", Result::Own},
    {Folder::WorkRoot, s_work, L"", Result::Own},

    {Folder::Macros, s_preset, L"\\Macros", Result::Own},
    {Folder::Dissolves, s_preset, L"\\Dissolves", Result::Own},
    {Folder::EQPresets, s_preset, L"\\EQ Presets", Result::Scratch},
    {Folder::FXPresets, s_preset, L"\\FX Presets", Result::Scratch},
    {Folder::FadePresets, s_preset, L"\\Fade Presets", Result::Scratch},
    {Folder::UserMachines, s_preset, L"\\Machines", Result::Own},
    {Folder::EdlConfig, s_preset, L"\\EdlConfig", Result::Scratch},
    {Folder::CapturePreset, s_preset, L"\\CapturePreset", Result::Own},
    {Folder::PresetRoot, s_preset, L"", Result::Own},

    {Folder::Effects, s_system, L"\\Effects", Result::Own},
    {Folder::VSTPlugins, s_system, L"\\Effects\\VSTPlugins", Result::Own},
    {Folder::Pictures, s_system, L"\\Pictures", Result::Own},
    {Folder::FileFormatPlugins, s_system, L"\\FileFormatPlugins", Result::Own},
    {Folder::SystemMachines, s_system, L"\\Machines", Result::Own},
    {Folder::Shaders, s_system, L"\\Shaders", Result::Scratch},
    {Folder::SystemRoot, s_system, L"", Result::Own},
};

PathBuffer s_results[std::size(kRows)];
PathBuffer s_profiles{};

PathBuffer &scratch()
{
    static PathBuffer pool[kScratchResults];
    static std::atomic<std::size_t> next{0};
    return pool[next++ % kScratchResults];
}

/// Builds a path and cuts it at the limit. A text is never read further than there is room for: it may lack
/// its terminator.
class PathText {
public:
    PathText &add(const wchar_t *text)
    {
        while (text && m_length < kPathSize - 1 && *text)
            m_buffer[m_length++] = *text++;
        return *this;
    }
    PathText &add(const PathBuffer &text) { return add(text.data()); }
    /// The name of a file in the folder so far; nothing for a null one.
    PathText &addFile(const wchar_t *fileName) { return fileName ? add(L"\\").add(fileName) : *this; }
    PathText &stripSeparators()
    {
        while (m_length > 0 && (m_buffer[m_length - 1] == L'\\' || m_buffer[m_length - 1] == L'/'))
            m_buffer[--m_length] = L'\0';
        return *this;
    }
    /// Copies it: the texts added may have come from the same buffer.
    const wchar_t *into(PathBuffer &target)
    {
        if (m_length == kPathSize - 1 && isFirstHalf(m_buffer[m_length - 1]))
            m_buffer[--m_length] = L'\0';
        target = m_buffer;
        return target.data();
    }

private:
    /// Of a character that takes two, where wide characters have 16 bits.
    static bool isFirstHalf(wchar_t character) { return character >= 0xD800 && character <= 0xDBFF; }

    PathBuffer m_buffer{};
    std::size_t m_length = 0;
};

} // namespace

void WorkstationFolders::setSystemFolder(const wchar_t *folder)
{
    PathText().add(folder).stripSeparators().into(s_system);
    s_work = s_preset = s_aux = s_system;
    PathText().add(s_system).add(L"\\Themes").into(s_themes);
    PathText().add(s_system).add(L"\\Shaders").into(s_shaders);
}

int WorkstationFolders::setWorkFolder(const wchar_t *folder)
{
    PathText().add(folder).into(s_work);
    return 0;
}

int WorkstationFolders::setPresetFolder(const wchar_t *folder)
{
    PathText().add(folder).into(s_preset);
    return 0;
}

int WorkstationFolders::setAuxFolder(const wchar_t *folder)
{
    PathText().add(folder).into(s_aux);
    return 0;
}

void WorkstationFolders::setInstallRoot(const wchar_t *folder) { PathText().add(folder).into(s_installRoot); }

void WorkstationFolders::setShadersOverride(bool on) { s_shadersOverride = on; }

const wchar_t *WorkstationFolders::folderPath(Folder folder, const wchar_t *fileName)
{
    const Row &row = *std::find_if(std::begin(kRows), std::end(kRows),
                                   [=](const Row &one) { return one.folder == folder; });
    PathText path;
    if (folder == Folder::Shaders && s_shadersOverride)
        path.add(s_shaders);
    else
        path.add(row.root).add(row.below);
    path.addFile(fileName);
    return path.into(row.result == Result::Scratch ? scratch() : s_results[&row - kRows]);
}

const wchar_t *WorkstationFolders::installRootPath(const wchar_t *fileName)
{
    PathText path;
    if (s_installRoot[0] != L'\0')
        path.add(s_installRoot).add(fileName);
    return path.into(scratch());
}

const wchar_t *WorkstationFolders::profilesPath(const wchar_t *fileName)
{
    const std::wstring temporary = qEnvironmentVariable("TMP").toStdWString();
    return PathText().add(temporary.c_str()).add(L"\\tesselprofiles\\").add(fileName).into(s_profiles);
}

const wchar_t *WorkstationFolders::auxFolder() { return s_aux.data(); }

const wchar_t *WorkstationFolders::themesFolder() { return s_themes.data(); }
