/** @file hearth.h
 *
 * libhearth: messages, memory, a growable byte buffer and files for libquillon.
 *
 * It is a separate library without symbol versions, so that a host can replace any of its
 * functions: libquillon calls the one that the host's executable defines.  Include this header
 * where you define one: the compiler then sees that it has the right parameters.
 *
 * A host's Panic may throw a C++ exception or longjmp out of the call: libquillon holds no
 * memory at that moment that would leak.
 */
#ifndef HEARTH_H
#define HEARTH_H

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

#if defined(HEARTH_BUILD)
/* Weak: the host's function goes before this one in a static library too. */
#define HEARTH_API __attribute__((visibility("default"), weak))
#elif defined(__GNUC__)
#define HEARTH_API __attribute__((visibility("default")))
#else
#define HEARTH_API
#endif

#if defined(__GNUC__)
#define HEARTH_PRINTF __attribute__((format(printf, 1, 2)))
#else
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
 * A replacement should not return.  If it does, the function of libquillon that called it
 * returns at once.
 *
 * @param format  for printf, with its arguments
 */
HEARTH_API void Panic(const char *format, ...) HEARTH_PRINTF;

/** Writes the message, of an error in the caller, to standard error.
 *
 * @param format  for printf, with its arguments
 */
HEARTH_API void Warning(const char *format, ...) HEARTH_PRINTF;

/** Writes the message, of a failure at run time, to standard error.
 *
 * @param format  for printf, with its arguments
 */
HEARTH_API void Log(const char *format, ...) HEARTH_PRINTF;

/** @} */

/** @name Memory
 * Both return a block that the caller releases with free(), or null when memory cannot be
 * allocated or the size is 0.
 * @{
 */

/** Allocates a block of size bytes, not cleared. */
HEARTH_API void *UtilSafeMalloc0(size_t size);

/** Allocates a block of count items of size bytes, cleared; null too when the product does
 * not fit a size_t.
 */
HEARTH_API void *UtilSafeCalloc0(size_t count, size_t size);

/** @} */

/** @name Growable byte buffer
 * @{
 */

/** Bytes that grow by appending.  All-zero memory is a valid empty buffer. */
typedef struct DynBuf {
    char *data;       /**< the bytes; null while nothing is allocated */
    size_t size;      /**< bytes in use */
    size_t allocated; /**< bytes allocated */
} DynBuf;

/** Sets a buffer to the empty one without releasing what it held. */
HEARTH_API void DynBuf_Init(DynBuf *buffer);

/** Appends bytes.
 *
 * @param buffer  the buffer
 * @param source  the bytes; only read; not inside the buffer; may be null when length is 0
 * @param length  how many
 * @return false, with the buffer unchanged, when memory cannot be allocated
 */
HEARTH_API bool DynBuf_Append(DynBuf *buffer, const void *source, size_t length);

/** Releases the memory and sets the buffer to the empty one; may be called again. */
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

/** What a file is opened for, combined with |. */
typedef enum FileIOAccess {
    FILEIO_ACCESS_READ = 1, /**< reading */
    FILEIO_ACCESS_WRITE = 2 /**< writing */
} FileIOAccess;

/** What opening a file does. */
typedef enum FileIOAction {
    FILEIO_OPEN = 0,       /**< opens a file that exists */
    FILEIO_OPEN_CREATE = 4 /**< creates the file, or truncates it when it exists */
} FileIOAction;

/** Sets a record to no file.  Done first, it makes FileIO_Close safe in every case. */
HEARTH_API void FileIO_Invalidate(FileIODescriptor *file);

/** Opens a file.
 *
 * @param file    output; unchanged on failure
 * @param name    path of the file
 * @param access  FileIOAccess bits, at least one
 * @param action  a FileIOAction
 * @return 0 or an errno value; EINVAL for an unknown access or action
 */
HEARTH_API int FileIO_Open(FileIODescriptor *file, const char *name, int access, int action);

/** Returns the size of an open file in bytes, or -1. */
HEARTH_API int64_t FileIO_GetSize(const FileIODescriptor *file);

/** Reads count bytes, or as many as there are before the end of the file.
 *
 * Short transfers and interruptions are continued.
 *
 * @param file    the file
 * @param buffer  receives the bytes
 * @param count   how many
 * @param actual  receives the number of bytes read, also on failure; may be null
 * @return 0, also at the end of the file, or an errno value
 */
HEARTH_API int FileIO_Read(FileIODescriptor *file, void *buffer, size_t count, size_t *actual);

/** Writes count bytes.
 *
 * Short transfers and interruptions are continued.
 *
 * @param file    the file
 * @param source  the bytes; only read
 * @param count   how many
 * @param actual  receives the number of bytes written, also on failure; may be null
 * @return 0 or an errno value
 */
HEARTH_API int FileIO_Write(FileIODescriptor *file, const void *source, size_t count,
                            size_t *actual);

/** Closes a file; does nothing when none is open.
 *
 * @return 0 or an errno value
 */
HEARTH_API int FileIO_Close(FileIODescriptor *file);

/** Returns the English text of a status code, "Success" for 0.  The text is never freed. */
HEARTH_API const char *FileIO_ErrorEnglish(int status);

/** @} */

#if defined(__cplusplus)
}
#endif

#endif /* HEARTH_H */
