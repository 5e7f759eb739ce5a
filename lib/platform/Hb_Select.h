// Waiting with select.
#pragma once

#include "Hb_Select_Base.h"

enum {
  Hb_Select_NO_ERROR = 0,
  Hb_Select_INVALID_DESCRIPTOR = 1,
  Hb_Select_INTERNAL_DATA_ERROR = 2,  // never set
  Hb_Select_CAUGHT_SIGNAL = 3,
  Hb_Select_INVALID_DATA_VALUE = 4,
  Hb_Select_INVALID_DATA_POINTER = 5,
  Hb_Select_WAIT_ERROR = 6,
  Hb_Select_EAGAIN = 7,
};

class Hb_Select : public Hb_Select_Base {
 public:
  Hb_Select();  // polls: its first wait returns at once
  ~Hb_Select() override;

  int32_t Error() override;
  // Success also when the time ran out; the sets then hold nothing. Set the descriptors again before each wait.
  Hb_Rc wait() override;

 private:
  int32_t myError;
};
