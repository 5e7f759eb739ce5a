#include "Hb_Csock_Base.h"

namespace {
// Level of the interface that this source implements; nothing reads it.
[[maybe_unused]] constexpr int Hb_CsockMajorVersion = 1;
[[maybe_unused]] constexpr int Hb_CsockMinorVersion = 0;
}  // namespace

Hb_Csock_Base::Hb_Csock_Base() : myError(0) {}
Hb_Csock_Base::~Hb_Csock_Base() = default;

int32_t Hb_Csock_Base::Error() { return myError; }
