/* What a daemon leaves behind when it is killed. */
#ifndef HBD_STALE_OBJECTS_H
#define HBD_STALE_OBJECTS_H

#include <string>

namespace hbd {

/**
 * Removes the segments and semaphores that have the keys of the file at `path`, if they are of a daemon's shape and
 * the process that made them is gone.
 */
void remove_stale_objects(const std::string& path);

}  // namespace hbd

#endif
