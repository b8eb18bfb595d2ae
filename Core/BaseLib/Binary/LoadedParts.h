#pragma once

#include "Core/BaseLib/Binary/ByteView.h"

#include <limits>
#include <vector>

/// Where the system's loader would put the parts of a binary file, for looking up the addresses that its
/// tables hold. The parts point into the file.
class LoadedParts {
public:
    /// Adds what the file has for the `size` bytes of memory at an address; the rest of them are zeros. False
    /// when the part is impossible: more content than memory, no room below the end of memory, or not behind
    /// the part before.
    bool add(quint64 address, quint64 size, ByteView content)
    {
        if (content.size() > size || address < m_end || size > std::numeric_limits<quint64>::max() - address)
            return false;
        m_end = address + size;
        m_parts.push_back({address, content});
        return true;
    }

    /// The bytes from an address to the end of what its part has in the file; empty when there are none.
    ByteView from(quint64 address) const
    {
        for (const Part &part : m_parts) {
            if (address >= part.address && address - part.address < part.content.size())
                return part.content.from(address - part.address);
        }
        return {};
    }

private:
    struct Part {
        quint64 address;
        ByteView content;
    };
    std::vector<Part> m_parts;
    quint64 m_end = 0;
};
