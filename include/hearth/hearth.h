/** @file hearth.h
 *
 * libhearth: what libquillon asks of its surroundings: messages, memory, a
 * growable byte buffer, files.
 *
 * It is a library of its own, linked dynamically and without symbol versions,
 * so that a host can put its own function in the place of any of these: a host
 * whose executable defines, say, Panic has its own called by libquillon.
 *
 * A Panic of the host's may throw a C++ exception or longjmp out of the call:
 * libquillon holds nothing at that moment that would leak.
 */
#ifndef HEARTH_H
#define HEARTH_H

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

#if defined(__GNUC__)
#define HEARTH_API __attribute__((visibility("default")))
#define HEARTH_PRINTF __attribute__((format(printf, 1, 2)))
#else
#define HEARTH_API
#define HEARTH_PRINTF
#endif

#if defined(__cplusplus)
extern "C" {
#endif

/** @name Messages
 * printf formats; the caller ends a message with its own newline.
 * @{
 */

/** Writes the message to standard error and aborts the process.
 *
 * A replacement must not return either.  One that does has the failing call
 * end at once, without effect, wherever libquillon calls it.
 */
HEARTH_API void Panic(const char *format, ...) HEARTH_PRINTF;

/** Writes the message to standard error. */
HEARTH_API void Warning(const char *format, ...) HEARTH_PRINTF;

/** Writes the message to standard error. */
HEARTH_API void Log(const char *format, ...) HEARTH_PRINTF;

/** @} */

/** @name Memory
 * Both give a block that free() releases, or null when there is none to be had
 * or the size is 0.
 * @{
 */

/** A block of size bytes, not cleared. */
HEARTH_API void *UtilSafeMalloc0(size_t size);

/** A zeroed block for count items of size bytes; null too when the product
 * does not fit a size_t.
 */
HEARTH_API void *UtilSafeCalloc0(size_t count, size_t size);

/** @} */

/** @name Growable byte buffer
 * @{
 */

/** Bytes that grow by appending.  All-zero memory is a valid empty buffer. */
typedef struct DynBuf {
    char *data;       /**< the bytes; null while nothing is allocated */
    size_t size;      /**< how many bytes there are */
    size_t allocated; /**< how many bytes data has room for */
} DynBuf;

/** Makes buffer an empty one, without looking at what it held. */
HEARTH_API void DynBuf_Init(DynBuf *buffer);

/** Appends length bytes of source, which must not lie inside the buffer.
 *
 * @return false, with the buffer as it was, when memory cannot be had
 */
HEARTH_API bool DynBuf_Append(DynBuf *buffer, const void *source, size_t length);

/** Releases the memory and leaves an empty buffer, safe to destroy again. */
HEARTH_API void DynBuf_Destroy(DynBuf *buffer);

/** @} */

/** @name Files
 * Status codes are errno values; 0 is success.
 * @{
 */

/** An open file, or none. */
typedef struct FileIODescriptor {
    int fd; /**< -1 while no file is open */
} FileIODescriptor;

enum {
    FILEIO_ACCESS_READ = 1, /**< open for reading */
    FILEIO_ACCESS_WRITE = 2 /**< open for writing */
};

enum {
    FILEIO_OPEN = 0,       /**< the file must exist */
    FILEIO_OPEN_CREATE = 4 /**< the file is created, or emptied when it exists */
};

/** Makes file a record of no file, ready for FileIO_Open. */
HEARTH_API void FileIO_Invalidate(FileIODescriptor *file);

/** Opens the named file.
 *
 * @param access  FILEIO_ACCESS_READ, FILEIO_ACCESS_WRITE, or both or-ed
 * @param action  FILEIO_OPEN or FILEIO_OPEN_CREATE
 * @return 0, or the errno value of the failure; EINVAL for an unknown access or
 *         action
 */
HEARTH_API int FileIO_Open(FileIODescriptor *file, const char *name, int access, int action);

/** The size of an open file in bytes, or -1. */
HEARTH_API int64_t FileIO_GetSize(const FileIODescriptor *file);

/** Reads up to count bytes, going on over short transfers and interruptions
 * until all are there or the file ends.
 *
 * @param actual  gets the number of bytes read, also on failure; may be null
 * @return 0, also when the file ends early, or an errno value
 */
HEARTH_API int FileIO_Read(FileIODescriptor *file, void *buffer, size_t count, size_t *actual);

/** Writes count bytes, going on over short transfers and interruptions.
 *
 * @param actual  gets the number of bytes written, also on failure; may be null
 * @return 0 or an errno value
 */
HEARTH_API int FileIO_Write(FileIODescriptor *file, const void *source, size_t count,
                            size_t *actual);

/** Closes the file.  Does nothing when none is open.
 *
 * @return 0 or an errno value
 */
HEARTH_API int FileIO_Close(FileIODescriptor *file);

/** The English text of a status code; "Success" for 0.  The text is valid for
 * the life of the process.
 */
HEARTH_API const char *FileIO_ErrorEnglish(int status);

/** @} */

#if defined(__cplusplus)
}
#endif

#endif /* HEARTH_H */
