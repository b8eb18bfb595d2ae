#pragma once

#include <QtGlobal>

#include <type_traits>

/// The structures of 64-bit little-endian ELF files that lead to a shared library's symbols. Written out
/// here, because only some of the systems that this builds on have a header for them. Source: System V
/// Application Binary Interface ("gABI"), chapters 4 "Object Files" and 5 "Program Loading and Dynamic
/// Linking"; its x86-64 supplement; for the table of DT_GNU_HASH, which the gABI does not describe, the
/// GNU tool chain's binutils and C library.

static_assert(Q_BYTE_ORDER == Q_LITTLE_ENDIAN, "fields are copied as they stand in the file");

struct ElfHeader { // Elf64_Ehdr
    uchar ident[16];
    quint16 type;
    quint16 machine;
    quint32 version;
    quint64 entry;
    quint64 programHeaders; ///< offset in the file
    quint64 sectionHeaders; ///< offset in the file
    quint32 flags;
    quint16 headerSize;
    quint16 programHeaderSize;
    quint16 programHeaderCount;
    quint16 sectionHeaderSize;
    quint16 sectionHeaderCount;
    quint16 sectionNames;
};
static_assert(sizeof(ElfHeader) == 64 && std::is_trivially_copyable_v<ElfHeader>);

/// How `ElfHeader::ident` begins: magic, ELFCLASS64, ELFDATA2LSB, EV_CURRENT.
inline constexpr uchar kElfIdent[] = {0x7f, 'E', 'L', 'F', 2, 1, 1};
inline constexpr quint16 kElfTypeShared = 3;     // ET_DYN
inline constexpr quint16 kElfMachineX86_64 = 62; // EM_X86_64

struct ElfProgramHeader { // Elf64_Phdr
    quint32 type;
    quint32 flags;
    quint64 offset; ///< in the file
    quint64 address;
    quint64 physicalAddress;
    quint64 fileSize;
    quint64 memorySize; ///< what exceeds `fileSize` is filled with zeros
    quint64 alignment;
};
static_assert(sizeof(ElfProgramHeader) == 56 && std::is_trivially_copyable_v<ElfProgramHeader>);

inline constexpr quint32 kElfSegmentLoad = 1;    // PT_LOAD
inline constexpr quint32 kElfSegmentDynamic = 2; // PT_DYNAMIC

struct ElfDynamicEntry { // Elf64_Dyn
    quint64 tag;
    quint64 value; ///< an address or a number
};
static_assert(sizeof(ElfDynamicEntry) == 16 && std::is_trivially_copyable_v<ElfDynamicEntry>);

inline constexpr quint64 kElfDynamicEnd = 0;              // DT_NULL
inline constexpr quint64 kElfDynamicHash = 4;             // DT_HASH
inline constexpr quint64 kElfDynamicStrings = 5;          // DT_STRTAB
inline constexpr quint64 kElfDynamicSymbols = 6;          // DT_SYMTAB
inline constexpr quint64 kElfDynamicStringsSize = 10;     // DT_STRSZ
inline constexpr quint64 kElfDynamicSymbolSize = 11;      // DT_SYMENT
inline constexpr quint64 kElfDynamicGnuHash = 0x6ffffef5; // DT_GNU_HASH

struct ElfSymbol { // Elf64_Sym
    quint32 name;  ///< offset in the string table
    uchar info;    ///< binding in the upper four bits, type in the lower
    uchar other;   ///< visibility in the lower two bits
    quint16 section;
    quint64 value;
    quint64 size;

    int binding() const { return info >> 4; }
    int visibility() const { return other & 3; }
};
static_assert(sizeof(ElfSymbol) == 24 && std::is_trivially_copyable_v<ElfSymbol>);

inline constexpr quint16 kElfSectionUndefined = 0; // SHN_UNDEF
inline constexpr int kElfBindingGlobal = 1;        // STB_GLOBAL
inline constexpr int kElfBindingWeak = 2;          // STB_WEAK
inline constexpr int kElfBindingUnique = 10;       // STB_GNU_UNIQUE
inline constexpr int kElfVisibilityDefault = 0;    // STV_DEFAULT
inline constexpr int kElfVisibilityProtected = 3;  // STV_PROTECTED

/// Starts the table of DT_HASH. Follow: 32-bit symbol indexes, one per bucket, then one per symbol: the next
/// of the same bucket. Index 0 ends a chain.
struct ElfHashHeader {
    quint32 bucketCount;
    quint32 symbolCount;
};
static_assert(sizeof(ElfHashHeader) == 8 && std::is_trivially_copyable_v<ElfHashHeader>);

/// Starts the table of DT_GNU_HASH. Follow: the 64-bit words of a Bloom filter, the 32-bit index of each
/// bucket's first symbol (0: empty), then, for each symbol from `firstSymbol` on, its 32-bit hash with the
/// lowest bit set on the last symbol of its bucket.
struct ElfGnuHashHeader {
    quint32 bucketCount;
    quint32 firstSymbol;
    quint32 filterSize; ///< in words; a power of two
    quint32 filterShift;
};
static_assert(sizeof(ElfGnuHashHeader) == 16 && std::is_trivially_copyable_v<ElfGnuHashHeader>);
