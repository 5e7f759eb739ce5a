// How every operation reports: one of two results, and an error number that a success leaves alone.
#pragma once

#include <initializer_list>

#include "hb_client/error.h"
#include "hb_global_data/state.h"
#include "support/require.h"

namespace fuzz {

inline constexpr int no_error = 0;
inline constexpr int no_number = -4711;  // stands in the error number before a call; a failure may leave it

// Success for no_error, and failure with exactly that number otherwise.
template <typename Operation>
void expect(int error, Operation operation) {
  set_hb_errno(no_number);
  const Hb_Rc rc = operation();
  REQUIRE(rc == (error == no_error ? Hb_Success : Hb_Failure));
  REQUIRE(hb_get_errno() == (error == no_error ? no_number : error));
}

// Success, or failure with one of the numbers.
template <typename Operation>
Hb_Rc expect_one_of(std::initializer_list<int> errors, Operation operation) {
  set_hb_errno(no_number);
  const Hb_Rc rc = operation();
  const int number = hb_get_errno();
  if (rc == Hb_Success) {
    REQUIRE(number == no_number);
    return rc;
  }
  REQUIRE(rc == Hb_Failure);
  bool documented = false;
  for (const int error : errors) {
    documented = documented || error == number;
  }
  REQUIRE(documented);
  return rc;
}

}  // namespace fuzz
