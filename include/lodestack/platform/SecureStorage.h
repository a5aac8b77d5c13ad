/* SecureStorage: the platform's store of small secrets (keys), kept by name.
 *
 * This is the platform's own C interface, which the key utility of the
 * encrypted storage calls; on a handset the platform provides it. The host
 * build of this library implements it so that everything runs on an ordinary
 * Linux machine: one file per name in a private directory, created with mode
 * 0700 (files 0600), each entry replaced atomically (written to a temporary
 * file, synced, renamed over the old one) so that a crash leaves either the
 * old or the new secret, never half of one. The directory is
 *   $LODESTACK_SECURE_STORAGE_DIR, when set and not empty; otherwise
 *   $XDG_DATA_HOME/lodestack/secure-storage (an absolute XDG_DATA_HOME), or
 *   $HOME/.local/share/lodestack/secure-storage;
 * missing directories are made with mode 0700, and an existing storage
 * directory of this user is narrowed to 0700. A directory owned by another
 * user is refused.
 *
 * Names are 1 to 200 characters, without "/" and not starting with ".".
 * An entry holds at most 65536 bytes. Results are negative errno values on
 * failure (-EINVAL for a bad name or argument, -ENOENT for a missing entry,
 * -EFBIG for a too long entry, -EACCES for a refused directory, others as
 * the system reports them). Any thread may call; concurrent puts of one name
 * leave one of the values whole.
 */
#ifndef LODESTACK_PLATFORM_SECURESTORAGE_H
#define LODESTACK_PLATFORM_SECURESTORAGE_H

#include <stddef.h>

#include "lodestack/core/Export.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Reads the entry `name`: 0 with `*data` pointing to a new buffer of
 * `*length` bytes (the caller releases it with free()), or a negative error
 * with `*data` null and `*length` 0. A missing or unreadable entry is an
 * error, never a crash. */
LODESTACK_EXPORT int ssa_get(const char* name, char** data, size_t* length);

/* Stores `length` bytes of `data` under `name`, replacing any earlier
 * entry: the number of bytes stored, or a negative error (the earlier entry
 * is then unchanged). */
LODESTACK_EXPORT int ssa_put(const char* name, const char* data, size_t length);

/* Removes the entry `name`: 0, or a negative error (-ENOENT when there is
 * none). */
LODESTACK_EXPORT int ssa_delete(const char* name);

#ifdef __cplusplus
}
#endif

#endif /* LODESTACK_PLATFORM_SECURESTORAGE_H */
