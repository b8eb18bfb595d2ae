#pragma once

#include <QByteArray>
#include <QtEndian>

#include <vector>

/// Where things are in the images that `PeBuilder` makes.
namespace PePlace {
inline constexpr int kNewHeader = 0x3c;
inline constexpr int kMachine = 0x44;
inline constexpr int kSectionCount = 0x46;
inline constexpr int kOptionalHeaderSize = 0x54;
inline constexpr int kFlags = 0x56;
inline constexpr int kOptionalHeader = 0x58;
inline constexpr int kSectionAlignment = kOptionalHeader + 32;
inline constexpr int kHeadersSize = kOptionalHeader + 60;
inline constexpr int kDirectoryCount = kOptionalHeader + 108; // of 64-bit images, as all that follow
inline constexpr int kDirectories = kDirectoryCount + 4;
inline constexpr int kSection = kDirectories + 16 * 8;
inline constexpr int kTables = 0x200; ///< of the section, loaded at `kTablesAddress`
inline constexpr int kTablesAddress = 0x1000;
/// The export directory starts the section.
inline constexpr int kFunctionCount = kTables + 20;
inline constexpr int kNameCount = kTables + 24;
inline constexpr int kFunctionTable = kTables + 28;
inline constexpr int kNameTable = kTables + 32;
inline constexpr int kOrdinalTable = kTables + 36;
} // namespace PePlace

struct PeContent {
    std::vector<QByteArray> exports;
    std::vector<QByteArray> imports;
    std::vector<QByteArray> delayImports;
    quint16 machine = 0x8664;
    bool is64Bit = true;
};

/// Writes the small image of a Windows library, byte by byte as the format has it: headers and one section of
/// tables.
class PeBuilder : PeContent {
public:
    explicit PeBuilder(const PeContent &content)
        : PeContent(content)
        , m_bytes(PePlace::kTables, '\0')
    {}

    QByteArray build()
    {
        addExports();
        addLibraries(1, imports, 20, 12);
        addLibraries(13, delayImports, 32, 4);
        m_bytes.append(QByteArray(512 - m_bytes.size() % 512, '\0'));
        writeHeaders();
        return m_bytes;
    }

    /// Changes a number of `width` bytes.
    static void put(QByteArray &bytes, int offset, int width, quint32 value)
    {
        uchar little[4];
        qToLittleEndian(value, little);
        bytes.replace(offset, width, reinterpret_cast<const char *>(little), width);
    }

private:
    void put16(int offset, int value) { put(m_bytes, offset, 2, quint32(value)); }
    void put32(int offset, int value) { put(m_bytes, offset, 4, quint32(value)); }
    int directory(int index) const { return PePlace::kDirectories - (is64Bit ? 0 : 16) + 8 * index; }
    int addressOf(int offset) const { return offset - PePlace::kTables + PePlace::kTablesAddress; }
    int add(const QByteArray &content)
    {
        m_bytes.append(content);
        return addressOf(m_bytes.size() - content.size());
    }

    void addExports()
    {
        using namespace PePlace;
        if (exports.empty())
            return;
        const int count = static_cast<int>(exports.size());
        put32(directory(0), kTablesAddress);
        add(QByteArray(40, '\0'));
        put32(kFunctionCount, count);
        put32(kNameCount, count);
        put32(kFunctionTable, add(QByteArray(4 * count, '\x55')));
        const int names = m_bytes.size();
        put32(kNameTable, add(QByteArray(4 * count, '\0')));
        put32(kOrdinalTable, add(QByteArray(2 * count, '\0')));
        for (int index = 0; index < count; ++index) {
            put16(names + 4 * count + 2 * index, index);
            put32(names + 4 * index, add(exports[static_cast<size_t>(index)] + '\0'));
        }
    }

    void addLibraries(int index, const std::vector<QByteArray> &libraries, int entrySize, int nameOffset)
    {
        if (libraries.empty())
            return;
        int entry = m_bytes.size();
        put32(directory(index), add(QByteArray(entrySize * int(libraries.size() + 1), '\0')));
        for (const QByteArray &library : libraries) {
            put32(entry, 1);
            put32(entry + 16, 1);
            put32(entry + nameOffset, add(library + '\0'));
            entry += entrySize;
        }
    }

    void writeHeaders()
    {
        using namespace PePlace;
        const int directories = 16;
        const int section = directory(directories);
        m_bytes.replace(0, 2, "MZ");
        put32(kNewHeader, 0x40);
        put32(0x40, 0x4550);
        put16(kMachine, machine);
        put16(kSectionCount, 1);
        put16(kOptionalHeaderSize, section - kOptionalHeader);
        put16(kFlags, 0x2022);
        put16(kOptionalHeader, is64Bit ? 0x20b : 0x10b);
        put32(kSectionAlignment, 0x1000);
        put32(kHeadersSize, kTables);
        put32(directory(0) - 4, directories);
        put32(section + 8, m_bytes.size() - kTables);
        put32(section + 12, kTablesAddress);
        put32(section + 16, m_bytes.size() - kTables - 1);
        put32(section + 20, kTables + 1); // rounded down when it is loaded
    }

    QByteArray m_bytes;
};
