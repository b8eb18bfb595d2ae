#pragma once

#include <QtGlobal>

#include <type_traits>

/// The structures of PE files (the Windows format of programs and libraries) that lead to what a library
/// exports and imports. Written out here, because only some of the systems that this builds on have a header
/// for them. Source: Microsoft's "PE Format" reference. Addresses are relative to where the file is
/// loaded (RVA) unless said otherwise.

static_assert(Q_BYTE_ORDER == Q_LITTLE_ENDIAN, "fields are copied as they stand in the file");

inline constexpr quint16 kDosMagic = 0x5a4d;          // "MZ"
inline constexpr quint64 kDosNewHeader = 0x3c;        // where the 32-bit offset of the PE header stands
inline constexpr quint32 kMostPeStart = 0x10000000;   // the loader takes none that lies beyond
inline constexpr quint32 kPeMagic = 0x00004550;       // "PE", two zeros
inline constexpr quint16 kPeOptionalMagic32 = 0x010b; // PE32
inline constexpr quint16 kPeOptionalMagic64 = 0x020b; // PE32+
inline constexpr quint64 kPePage = 4096;              // memory is filled from the file in such units
/// The most sections that the loader accepts (PE format, "Number of sections").
inline constexpr quint16 kMostPeSections = 96;
inline constexpr quint64 kPeSector = 512;       // the loader rounds a section's offset down to it
inline constexpr quint32 kPeDelayByAddress = 1; // dlattrRva: the entry holds relative addresses

inline constexpr quint16 kPeMachineX86 = 0x014c;     // IMAGE_FILE_MACHINE_I386
inline constexpr quint16 kPeMachineArm = 0x01c4;     // IMAGE_FILE_MACHINE_ARMNT
inline constexpr quint16 kPeMachineItanium = 0x0200; // IMAGE_FILE_MACHINE_IA64
inline constexpr quint16 kPeMachineX86_64 = 0x8664;  // IMAGE_FILE_MACHINE_AMD64
inline constexpr quint16 kPeMachineArm64 = 0xaa64;   // IMAGE_FILE_MACHINE_ARM64

struct PeHeader { // signature and IMAGE_FILE_HEADER
    quint32 magic;
    quint16 machine;
    quint16 sectionCount;
    quint32 timeStamp;
    quint32 symbols; ///< offset in the file
    quint32 symbolCount;
    quint16 optionalHeaderSize; ///< the section headers follow behind it
    quint16 flags;
};
static_assert(sizeof(PeHeader) == 24 && std::is_trivially_copyable_v<PeHeader>);

/// What IMAGE_OPTIONAL_HEADER32 and IMAGE_OPTIONAL_HEADER64 have in common: they differ behind it, and in
/// the eight bytes of `imageBase`. Follow four sizes of 32 or 64 bits, 32 bits of flags, the 32-bit count of
/// data directories and those.
struct PeOptionalHeader {
    quint16 magic;
    uchar linkerVersion[2];
    quint32 codeSize;
    quint32 dataSize;
    quint32 zeroedSize;
    quint32 entry;
    quint32 codeBase;
    quint32 imageBase[2];
    quint32 sectionAlignment;
    quint32 fileAlignment;
    quint16 versions[6];
    quint32 reserved;
    quint32 imageSize;
    quint32 headersSize; ///< that much of the file is loaded as it stands
    quint32 checkSum;
    quint16 subsystem;
    quint16 dllFlags;
};
static_assert(sizeof(PeOptionalHeader) == 72 && std::is_trivially_copyable_v<PeOptionalHeader>);

/// Where the count of data directories stands in the two forms of the optional header.
inline constexpr quint64 kPeDirectoryCount32 = 92;
inline constexpr quint64 kPeDirectoryCount64 = 108;

struct PeDirectory { // IMAGE_DATA_DIRECTORY
    quint32 address;
    quint32 size;
};
static_assert(sizeof(PeDirectory) == 8 && std::is_trivially_copyable_v<PeDirectory>);

inline constexpr quint32 kPeDirectoryExports = 0;       // IMAGE_DIRECTORY_ENTRY_EXPORT
inline constexpr quint32 kPeDirectoryImports = 1;       // IMAGE_DIRECTORY_ENTRY_IMPORT
inline constexpr quint32 kPeDirectoryExceptions = 3;    // IMAGE_DIRECTORY_ENTRY_EXCEPTION
inline constexpr quint32 kPeDirectoryRelocations = 5;   // IMAGE_DIRECTORY_ENTRY_BASERELOC
inline constexpr quint32 kPeDirectoryDelayImports = 13; // IMAGE_DIRECTORY_ENTRY_DELAY_IMPORT

struct PeSection { // IMAGE_SECTION_HEADER
    char name[8];
    quint32 memorySize; ///< 0: as much as in the file
    quint32 address;
    quint32 fileSize;
    quint32 offset; ///< in the file
    quint32 relocations[3];
    quint32 flags;
};
static_assert(sizeof(PeSection) == 40 && std::is_trivially_copyable_v<PeSection>);

struct PeExports { // IMAGE_EXPORT_DIRECTORY
    quint32 flags;
    quint32 timeStamp;
    quint32 version;
    quint32 name;
    quint32 firstOrdinal;
    quint32 functionCount;
    quint32 nameCount;
    quint32
        functions;    ///< 32-bit addresses; 0: unused; one inside of the export directory: a forwarder's text
    quint32 names;    ///< 32-bit addresses of names, sorted
    quint32 ordinals; ///< 16-bit indexes of functions, one for each name
};
static_assert(sizeof(PeExports) == 40 && std::is_trivially_copyable_v<PeExports>);

/// The sizes of the first entries of tables in which none is all zero.
inline constexpr quint32 kPeFunctionSize = 12;        // RUNTIME_FUNCTION
inline constexpr quint32 kPeRelocationHeaderSize = 8; // IMAGE_BASE_RELOCATION

struct PeImport { // IMAGE_IMPORT_DESCRIPTOR
    quint32 lookUpTable;
    quint32 timeStamp;
    quint32 forwarderChain;
    quint32 name;         ///< of the library; 0: end of the table
    quint32 addressTable; ///< 0: end of the table
};
static_assert(sizeof(PeImport) == 20 && std::is_trivially_copyable_v<PeImport>);

struct PeDelayImport { // ImgDelayDescr
    quint32 flags;
    quint32 name; ///< of the library; 0: end of the table
    quint32 moduleHandle;
    quint32 addressTable;
    quint32 nameTable;
    quint32 boundTable;
    quint32 unloadTable;
    quint32 timeStamp;
};
static_assert(sizeof(PeDelayImport) == 32 && std::is_trivially_copyable_v<PeDelayImport>);
