/* Exit statuses. */
#ifndef HBD_EXIT_STATUS_H
#define HBD_EXIT_STATUS_H

namespace hbd {

inline constexpr int exit_success = 0; /**< stopped by a signal, or nothing was wrong with the scenario */
inline constexpr int exit_failure = 1; /**< could not start, or the scenario has a mistake */
inline constexpr int exit_usage = 2;   /**< the command line has a mistake */

}  // namespace hbd

#endif
