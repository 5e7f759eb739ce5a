#include "VEX_EVMONHandler.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <new>

#include "VEX_HBC_trace.h"
#include "text_copy.h"
#include "zu_cu.h"
#include "zu_evm.h"

int32_t EVMONHandler::numbersOfFileDescriptors = 0;
int32_t EVMONHandler::handlerListSlots = 0;
int32_t EVMONHandler::currentSlots = 0;
HandlerInstancesMap* EVMONHandler::handlerInstances = nullptr;
bool EVMONHandler::absence_is_no_error = false;

namespace {

constexpr int32_t slots_at_once = 10;
constexpr int step_did_not_run = -1;
constexpr HandlerInstancesMap empty_slot = {-1, nullptr};

// Without an array there are no slots, whatever their number says.
HandlerInstancesMap* slots_end() {
  return EVMONHandler::handlerInstances != nullptr ? EVMONHandler::handlerInstances + EVMONHandler::handlerListSlots
                                                   : nullptr;
}

// The first slot of the descriptor, or the end.
HandlerInstancesMap* find_slot(int descriptor) {
  return std::find_if(EVMONHandler::handlerInstances, slots_end(), [descriptor](const FDHandlerArray& slot) {
    return slot.fd == descriptor && slot.handler != nullptr;
  });
}

// A new array with the slots so far and empty ones behind them, or null.
HandlerInstancesMap* copy_of_slots(int32_t capacity) {
  auto* slots = new (std::nothrow) HandlerInstancesMap[static_cast<size_t>(capacity)];
  if (slots != nullptr) {
    auto* rest = std::copy_n(EVMONHandler::handlerInstances, EVMONHandler::currentSlots, slots);
    std::fill(rest, slots + capacity, empty_slot);
  }
  return slots;
}

// Whether there is a slot to append. Without an array everything is counted anew.
bool make_room() {
  if (EVMONHandler::handlerInstances == nullptr) {
    EVMONHandler::handlerListSlots = 0;
    EVMONHandler::currentSlots = 0;
    EVMONHandler::numbersOfFileDescriptors = 0;
  }
  if (EVMONHandler::currentSlots < EVMONHandler::handlerListSlots) {
    return true;
  }
  const int32_t capacity = EVMONHandler::handlerListSlots + slots_at_once;
  HandlerInstancesMap* slots = copy_of_slots(capacity);
  if (slots == nullptr) {
    return false;
  }
  delete[] EVMONHandler::handlerInstances;
  EVMONHandler::handlerInstances = slots;
  EVMONHandler::handlerListSlots = capacity;
  return true;
}

void trace_not_registered(const char* path, int descriptor) {
  if (path != nullptr) {
    trace_data(Trace_Errors, trace_monitor_not_registered, {block_of_text(path), block_of(descriptor)});
  } else {
    trace_values(Trace_Errors, trace_handler_not_registered, descriptor);
  }
}

}  // namespace

EVMONHandler::EVMONHandler(char* fname, const char* p_initstr)
    : evmon_fd(-1), evmon_fname(nullptr), vex_open_file_rc(step_did_not_run), open_file_errno(0) {
  int rc = step_did_not_run;
  if (fname == nullptr) {
    trace(Trace_Errors, trace_monitor_without_path);
    __zu_assert("NULL != fname", "lib/VEX_EVMONHandler", __LINE__);
  } else {
    rc = open_and_register(fname, p_initstr);
  }
  vex_open_file_rc = rc;
}

// The path is kept before the monitor is opened, as nothing may fail behind that.
int32_t EVMONHandler::open_and_register(char* fname, const char* p_initstr) {
  evmon_fname = new_copy_of(fname);
  if (evmon_fname == nullptr) {
    errno = ENOMEM;
  }
  const int rc = evmon_fname != nullptr ? zu_evm_open(fname, p_initstr, &evmon_fd) : ENOMEM;
  open_file_errno = errno;
  if (rc != 0 || evmon_fd < 0) {
    if (rc != VEX_monitors_are_absent || !absence_is_no_error) {
      trace_data(Trace_Errors, trace_monitor_not_opened,
                 {block_of_text(fname), block_of(rc), block_of(open_file_errno)});
    }
    evmon_fd = -1;
    delete[] evmon_fname;
    evmon_fname = nullptr;
    return rc;
  }
  trace_data(Trace_Info, trace_monitor_opened, {block_of_text(evmon_fname), block_of(evmon_fd)});
  selfRegister();
  return rc;
}

EVMONHandler::EVMONHandler(int32_t* /*fds*/, char* path)
    : evmon_fd(-1),
      evmon_fname(path != nullptr ? new_copy_of(path) : nullptr),
      vex_open_file_rc(step_did_not_run),
      open_file_errno(0) {}

EVMONHandler::~EVMONHandler() {
  const HandlerInstancesMap* first = find_slot(evmon_fd);
  const HandlerInstancesMap emptied = first != slots_end() ? *first : empty_slot;
  selfUnregister();
  leave_slots_to(emptied);
  drop_descriptor();
  delete[] evmon_fname;
}

void EVMONHandler::drop_descriptor() {
  if (evmon_fd != -1) {
    close(evmon_fd);
    evmon_fd = -1;
  }
}

Hb_Rc EVMONHandler::handler(Hb_Events* /*events*/, char* /*name*/, Hb_Group* /*group*/, Hb_Seq_Num* /*seqnum_p*/) {
  return Hb_Failure;
}

void EVMONHandler::selfRegister() {
  if (evmon_fd == -1) {
    trace_not_registered(evmon_fname, evmon_fd);
    return;
  }
  if (!make_room()) {
    set_hb_errno(HB_ENOMEM);
    trace_not_registered(evmon_fname, evmon_fd);
    drop_descriptor();
    return;
  }
  handlerInstances[currentSlots] = {evmon_fd, this};
  ++currentSlots;
  ++numbersOfFileDescriptors;
}

void EVMONHandler::selfUnregister() {
  HandlerInstancesMap* slot = find_slot(evmon_fd);
  if (slot == slots_end()) {
    return;
  }
  *slot = empty_slot;
  if (numbersOfFileDescriptors < 1) {
    set_hb_errno(HB_ENODESCRIPTORS);
    trace_values(Trace_Errors, trace_none_registered, HB_ENODESCRIPTORS, numbersOfFileDescriptors);
    return;
  }
  --numbersOfFileDescriptors;
}

// No slot keeps a handler that is gone. The first that does goes to the handler whose slot was emptied in its place, if
// there is such a one; all others are empty and count no more.
void EVMONHandler::leave_slots_to(HandlerInstancesMap emptied) {
  HandlerInstancesMap heir = emptied.handler != this ? emptied : empty_slot;
  std::for_each(handlerInstances, slots_end(), [this, &heir](FDHandlerArray& slot) {
    if (slot.handler != this) {
      return;
    }
    slot = heir;
    if (heir.handler == nullptr && numbersOfFileDescriptors > 0) {
      --numbersOfFileDescriptors;
    }
    heir = empty_slot;
  });
}

int EVMONHandler::getFileDescriptor() { return evmon_fd; }
int EVMONHandler::getOpenFileError() { return open_file_errno; }
int EVMONHandler::getVEXEVMOpenRCInConstructor() { return vex_open_file_rc; }

int* EVMONHandler::getFileDescriptors() {
  const int32_t limit = std::max(numbersOfFileDescriptors, 0);
  auto* descriptors = new (std::nothrow) int[static_cast<size_t>(limit) + 1];
  if (descriptors == nullptr) {
    return nullptr;
  }
  int32_t count = 0;
  for (const HandlerInstancesMap* slot = handlerInstances; slot != slots_end() && count < limit; ++slot) {
    if (slot->fd != -1) {
      descriptors[count++] = slot->fd;
    }
  }
  descriptors[count] = -1;
  return descriptors;
}

int EVMONHandler::getNumbersOfFileDescriptors() { return numbersOfFileDescriptors; }

void EVMONHandler::dispatch(int* descriptor_list, Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p,
                            Hb_Rc* rc) {
  trace(Trace_Info, trace_dispatch_begins);
  if (descriptor_list == nullptr) {
    trace(Trace_Info, trace_dispatch_ends);
    return;
  }
  for (const int* descriptor = descriptor_list; *descriptor != -1; ++descriptor) {
    const HandlerInstancesMap* slot = find_slot(*descriptor);
    if (slot != slots_end()) {
      *rc = slot->handler->handler(events, name, group, seqnum_p);
      trace(Trace_Info, trace_dispatch_ends);
      return;
    }
  }
  set_hb_errno(HB_EDISPATCH);
  trace_values(Trace_Errors, trace_dispatch_without_handler, descriptor_list[0]);
  *rc = Hb_Failure;
  trace(Trace_Info, trace_dispatch_ends);
}
