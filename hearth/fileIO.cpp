// Files, on the system's descriptors.
#include <hearth/hearth.h>

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr mode_t kNewFileMode = 0666; // less the process's umask

// The flags of open for an access, or -1 for an access that does not exist.
int openFlags(int access) {
    switch (access) {
    case FILEIO_ACCESS_READ:
        return O_RDONLY;
    case FILEIO_ACCESS_WRITE:
        return O_WRONLY;
    case FILEIO_ACCESS_READ | FILEIO_ACCESS_WRITE:
        return O_RDWR;
    default:
        return -1;
    }
}

// Calls transfer(offset, rest) until count bytes are transferred, the file ends (a
// transfer of 0 bytes), or an error other than an interruption.
template <class Transfer>
int transferAll(size_t count, size_t *actual, Transfer transfer) {
    size_t done = 0;
    int status = 0;
    while (done < count) {
        const ssize_t moved = transfer(done, count - done);
        if (moved > 0) {
            done += static_cast<size_t>(moved);
        } else if (moved == 0) {
            break;
        } else if (errno != EINTR) {
            status = errno;
            break;
        }
    }
    if (actual != nullptr)
        *actual = done;
    return status;
}

} // namespace

void FileIO_Invalidate(FileIODescriptor *file) {
    file->fd = -1;
}

int FileIO_Open(FileIODescriptor *file, const char *name, int access, int action) {
    int flags = openFlags(access);
    if (flags < 0 || (action != FILEIO_OPEN && action != FILEIO_OPEN_CREATE))
        return EINVAL;
    flags |= O_CLOEXEC;
    if (action == FILEIO_OPEN_CREATE)
        flags |= O_CREAT | O_TRUNC;
    int fd = -1;
    do {
        fd = open(name, flags, kNewFileMode);
    } while (fd < 0 && errno == EINTR);
    if (fd < 0)
        return errno;
    file->fd = fd;
    return 0;
}

int64_t FileIO_GetSize(const FileIODescriptor *file) {
    struct stat status = {};
    return fstat(file->fd, &status) == 0 ? int64_t{status.st_size} : -1;
}

int FileIO_Read(FileIODescriptor *file, void *buffer, size_t count, size_t *actual) {
    return transferAll(count, actual, [&](size_t offset, size_t rest) {
        return read(file->fd, static_cast<char *>(buffer) + offset, rest);
    });
}

int FileIO_Write(FileIODescriptor *file, const void *source, size_t count, size_t *actual) {
    return transferAll(count, actual, [&](size_t offset, size_t rest) {
        return write(file->fd, static_cast<const char *>(source) + offset, rest);
    });
}

int FileIO_Close(FileIODescriptor *file) {
    if (file->fd < 0)
        return 0;
    // close releases the descriptor even when it fails.  Closing again after an
    // interruption could close a file that another thread has opened since.
    const int result = close(file->fd);
    file->fd = -1;
    return result == 0 || errno == EINTR ? 0 : errno;
}

const char *FileIO_ErrorEnglish(int status) {
#if defined(__GLIBC__)
    // Unlike strerror this is never translated and has no shared buffer.
    const char *const text = strerrordesc_np(status);
    return text != nullptr ? text : "Unknown error";
#else
    return std::strerror(status);
#endif
}
