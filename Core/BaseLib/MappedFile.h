#pragma once

#include "Core/BaseLib/ByteView.h"

#include <QString>

#include <memory>

/// The content of a regular file in memory, read-only, while the object lives. Empty when the file is
/// missing, special or cannot be read. Should the file shrink meanwhile, touching what it lost is a fault.
class MappedFile {
public:
    explicit MappedFile(const QString &path);

    ByteView content() const { return m_content; }

private:
    std::shared_ptr<void> m_mapping;
    ByteView m_content;
};
