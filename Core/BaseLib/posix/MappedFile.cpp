#include "Core/BaseLib/MappedFile.h"

#include <QFile>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

std::shared_ptr<void> map(int file, std::size_t size)
{
    void *const data = mmap(nullptr, size, PROT_READ, MAP_SHARED, file, 0);
    if (data == MAP_FAILED)
        return nullptr;
    return std::shared_ptr<void>(data, [size](void *mapped) { munmap(mapped, size); });
}

} // namespace

MappedFile::MappedFile(const QString &path)
{
    // Opening a named pipe would otherwise wait for somebody to write into it.
    const int file = open(QFile::encodeName(path).constData(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (file < 0)
        return;
    struct stat status = {};
    if (fstat(file, &status) == 0 && S_ISREG(status.st_mode) && status.st_size > 0) {
        const auto size = static_cast<std::size_t>(status.st_size);
        m_mapping = map(file, size);
        if (m_mapping)
            m_content = ByteView(static_cast<const uchar *>(m_mapping.get()), size);
    }
    close(file);
}
