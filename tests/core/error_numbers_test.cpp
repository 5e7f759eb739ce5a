// The error number, how it is kept, and the numbers of all names that results, states and reasons have.
#include <gtest/gtest.h>

#include <span>

#include "hb_client/error.h"
#include "hb_global_data/state.h"

namespace hb_test {
namespace {

struct Numbered_Name {
  int number;
  int value;
  const char* name;
};

#define HB_NUMBERED(number, name) \
  { number, name, #name }

constexpr Numbered_Name errors[] = {
    HB_NUMBERED(1, HB_ENOMORE),
    HB_NUMBERED(2, HB_ENOTREADY),
    HB_NUMBERED(3, HB_EWRONGSTATE),
    HB_NUMBERED(4, HB_EINVAL),
    HB_NUMBERED(5, HB_EGROUPTYPE),
    HB_NUMBERED(6, HB_ENOROUTE),
    HB_NUMBERED(7, HB_ENOADAPTER),
    HB_NUMBERED(8, HB_ENONETWORK),
    HB_NUMBERED(9, HB_ENONODE),
    HB_NUMBERED(10, HB_EBADREPLY),
    HB_NUMBERED(11, HB_ESUBSCRIBE),
    HB_NUMBERED(12, HB_ECOMM),
    HB_NUMBERED(13, HB_ESOCKET),
    HB_NUMBERED(14, HB_ESOCKOPT),
    HB_NUMBERED(15, HB_ECONNECT),
    HB_NUMBERED(16, HB_EDAEMONGONE),
    HB_NUMBERED(17, HB_ENOMEM),
    HB_NUMBERED(18, HB_ESENDFAULT),
    HB_NUMBERED(19, HB_ESENDWOULDBLOCK),
    HB_NUMBERED(20, HB_ESENDNOTRESTARTED),
    HB_NUMBERED(21, HB_ESENDIO),
    HB_NUMBERED(22, HB_ESEND),
    HB_NUMBERED(23, HB_ERECVFAULT),
    HB_NUMBERED(24, HB_ERECVWOULDBLOCK),
    HB_NUMBERED(25, HB_ERECVNOTRESTARTED),
    HB_NUMBERED(26, HB_ERECVIO),
    HB_NUMBERED(27, HB_ERECV),
    HB_NUMBERED(28, HB_EKEY_CONFIG),
    HB_NUMBERED(29, HB_EKEY_ROUTE),
    HB_NUMBERED(30, HB_EKEY_SEM),
    HB_NUMBERED(31, HB_ESHMGET_ACCESS),
    HB_NUMBERED(32, HB_ESHMGET_INVAL),
    HB_NUMBERED(33, HB_ESHMGET_NOENT),
    HB_NUMBERED(34, HB_ESHMGET_NOMEM),
    HB_NUMBERED(35, HB_ESHMGET_LIMIT),
    HB_NUMBERED(36, HB_ESHMGET),
    HB_NUMBERED(37, HB_ESHMAT_ACCESS),
    HB_NUMBERED(38, HB_ESHMAT_INVAL),
    HB_NUMBERED(39, HB_ESHMAT_NOENT),
    HB_NUMBERED(41, HB_ESHMAT_NOMEM),
    HB_NUMBERED(42, HB_ESHMAT),
    HB_NUMBERED(43, HB_ESEMGET_ACCESS),
    HB_NUMBERED(44, HB_ESEMGET_INVAL),
    HB_NUMBERED(45, HB_ESEMGET_NOENT),
    HB_NUMBERED(46, HB_ESEMGET_NOMEM),
    HB_NUMBERED(47, HB_ESEMGET_NOSPC),
    HB_NUMBERED(48, HB_ESEMGET),
    HB_NUMBERED(49, HB_ENOIPROUTE),
    HB_NUMBERED(50, HB_EBADSERVICEADDR),
    HB_NUMBERED(51, HB_ESAMEADDR),
    HB_NUMBERED(52, HB_ENOTSUPPORTED),
    HB_NUMBERED(53, HB_EMSGTOOBIG),
    HB_NUMBERED(54, HB_EKEY_SECURITY),
    HB_NUMBERED(55, HB_EGRACEFAILED),
    HB_NUMBERED(56, HB_EGRACETIMEOUT),
    HB_NUMBERED(58, HB_EMONITOR_READ),
    HB_NUMBERED(59, HB_EEVENTPIPE),
    HB_NUMBERED(63, HB_EVEXTBL_BUILD),
    HB_NUMBERED(64, HB_EVEXTBL_ENTRY),
    HB_NUMBERED(65, HB_EVEXTBL_INTF),
    HB_NUMBERED(68, HB_EVEXGROUP),
    HB_NUMBERED(70, HB_EVEXTBL_COPY),
    HB_NUMBERED(71, HB_EADAPTERSTATE),
    HB_NUMBERED(72, HB_EPIPEMSG),
    HB_NUMBERED(73, HB_ENODEMISSING),
    HB_NUMBERED(74, HB_EMIGRATE_PREP),
    HB_NUMBERED(75, HB_EMIGRATE_TBL),
    HB_NUMBERED(81, HB_EDISPATCH),
    HB_NUMBERED(82, HB_ENODESCRIPTORS),
    HB_NUMBERED(84, HB_ESITESUB),
    HB_NUMBERED(86, HB_ESITECONFIG_READ),
    HB_NUMBERED(87, HB_ESITECONFIG_DATA),
    HB_NUMBERED(88, HB_ESITECONFIG_EVENT),
    HB_NUMBERED(89, HB_ENOGROUPHANDLER),
    HB_NUMBERED(90, HB_ENOPIPEHANDLER),
    HB_NUMBERED(91, HB_EMIGRATE_EVENTS),
};

constexpr Numbered_Name states[] = {
    HB_NUMBERED(0, Hb_Entity_Undef),
    HB_NUMBERED(1, Hb_Entity_Up),
    HB_NUMBERED(2, Hb_Entity_Down),
};

constexpr Numbered_Name reasons[] = {
    HB_NUMBERED(0, Hb_Entity_State_Reason_Down),
    HB_NUMBERED(1, Hb_Entity_State_Reason_Up),
    HB_NUMBERED(2, Hb_Entity_State_Reason_BRIXD_Down),
    HB_NUMBERED(3, Hb_Entity_State_Reason_BRIXD_Up),
    HB_NUMBERED(4, Hb_Entity_State_Reason_LOCAL_SPLIT_Down),
    HB_NUMBERED(5, Hb_Entity_State_Reason_REMOTE_SPLIT_Down),
    HB_NUMBERED(6, Hb_Entity_State_Reason_LINK_Down),
    HB_NUMBERED(7, Hb_Entity_State_Reason_SHUT_Down),
    HB_NUMBERED(8, Hb_Entity_State_Reason_FORCE_Down),
    HB_NUMBERED(9, Hb_Entity_State_Reason_STOPPED_Down),
    HB_NUMBERED(10, Hb_Entity_State_Reason_Undef),
};

void expect_numbers(std::span<const Numbered_Name> names) {
  for (const Numbered_Name& name : names) {
    EXPECT_EQ(name.value, name.number) << name.name;
  }
}

TEST(ErrorNumbers, HaveTheirNames) { expect_numbers(errors); }

TEST(ErrorNumbers, Are76) { EXPECT_EQ(std::size(errors), 76U); }

const int number_at_start = global_hb_errno;

TEST(ErrorNumber, IsZeroBeforeTheFirstFailure) { EXPECT_EQ(number_at_start, 0); }

TEST(ErrorNumber, IsWhatWasSetLast) {
  for (const int number : {1, 91, 57, 0, -3}) {
    set_hb_errno(number);
    EXPECT_EQ(hb_get_errno(), number);
    EXPECT_EQ(global_hb_errno, number);
  }
}

TEST(Results, HaveTheirNumbers) {
  EXPECT_EQ(static_cast<int>(Hb_Success), 2);
  EXPECT_EQ(static_cast<int>(Hb_Failure), 3);
  EXPECT_EQ(sizeof(Hb_Rc), 4U);
}

TEST(TruthValues, HaveTheirNumbers) {
  EXPECT_EQ(static_cast<int>(Hb_False), 0);
  EXPECT_EQ(static_cast<int>(Hb_True), 1);
  EXPECT_EQ(sizeof(Hb_Boolean), 4U);
}

TEST(EntityStates, HaveTheirNumbers) { expect_numbers(states); }

TEST(EntityStateReasons, HaveTheirNumbers) { expect_numbers(reasons); }

}  // namespace
}  // namespace hb_test
