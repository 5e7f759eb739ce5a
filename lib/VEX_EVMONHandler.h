// Base of the VEX-mode handlers: it owns a descriptor, registers it, routes a ready descriptor to its handler, and has
// the operations with which every handler builds events and fills a caller's outputs.
//
// What the interface leaves open:
// - A handler that memory has no place for in the registry is left without a descriptor; one whose path cannot be kept
//   is as one whose monitor could not be opened, with `ENOMEM` as result and error. A pipe needs no path.
// - Two handlers may have the same descriptor, when somebody closed it behind the library's back and the system handed
//   it out again. Leaving empties the first slot of the descriptor, whoever's it is. A handler that is destroyed then
//   leaves its own slot to the one that lost it, and no slot keeps it, however often it registered.
// - A number of a node or an adapter that the lists have no place for is left out; the others count.
// - The adapters that come with a joining node are those that the cluster services report up and that the configuration
//   knows, by node, name and address. They are named by their numbers in the table that is about to take effect, as
//   that one is in force when the event is taken; in the table still in force they are up from then on.
// - Without memory for an event nothing of it is told: constructAdapterEventOnNode() fails with `HB_ENOMEM` and leaves
//   the states of the adapters as they were, the others leave the pointer null.
#pragma once

#include <cstdint>

#include "hb_client/events.h"
#include "hb_global_data/state.h"
#include "hb_global_data/vex_event_queue.h"

class EVMONHandler;

// One slot of the registry; empty with -1 and null.
struct FDHandlerArray {
  int fd;
  EVMONHandler* handler;
};
typedef FDHandlerArray HandlerInstancesMap;

// What the list of adapters of an event has for an adapter that the event is about.
inline constexpr Hb_Incarnation VEX_named_in_group = 0;

// What opening a monitor yields where there are none.
inline constexpr int VEX_monitors_are_absent = -1;

// In the place of a node's number: no node is named.
inline constexpr zu_int32_t VEX_no_node = -1;

class EVMONHandler {
 public:
  EVMONHandler(char* fname, const char* p_initstr);  // opens a monitor, and registers it when that succeeds
  EVMONHandler(int32_t* fds, char* path);            // for pipes: the derived class sets the descriptor and registers
  virtual ~EVMONHandler();
  EVMONHandler(const EVMONHandler&) = delete;
  EVMONHandler& operator=(const EVMONHandler&) = delete;

  // Reads what the descriptor delivers and fills the caller's outputs, or queues events. Never called on a base object.
  virtual Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p);

  int getFileDescriptor();
  int getOpenFileError();
  int getVEXEVMOpenRCInConstructor();

  // All registered descriptors and a -1, in a new array of the caller's.
  static int* getFileDescriptors();
  static int getNumbersOfFileDescriptors();

  // Serves the first descriptor of the list that has a handler.
  static void dispatch(int* descriptor_list, Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p,
                       Hb_Rc* rc);

  void selfRegister();
  void selfUnregister();

  // Each extends the event, and makes it first when there is none.
  void construct_an_adapter_event(Hb_VEX_Event** _adpt, zu_int32_t _event, Hb_Adapter_Number _adpt_num);
  void constructNodeEvent(zu_int32_t _node, Hb_VEX_Event** _evt, zu_int32_t _evtType);
  void constructConfigEvent(Hb_VEX_Event** _evt);

  // A new event about the node's adapters; there is none when no adapter is concerned.
  // Fails when the cluster services do not say which adapters a joining node has.
  Hb_Rc constructAdapterEventOnNode(zu_int32_t _node, Hb_VEX_Event** _evt, zu_int32_t _evtType);

  // Each answers a caller without the queue.
  void fillInOneAdapterEvent(Hb_Events* _event, char* _name, Hb_Group* _group, Hb_Seq_Num* _seqnum);
  void fillInNodeEventInfo(zu_int32_t _node, zu_int32_t _evtType, char* _name, Hb_Group* _group);
  void fillInSiteEventInfo(zu_int32_t _site, zu_int32_t _evtType, char* _name, Hb_Group* _group);

  // From a queued event's group to a caller's.
  void copy_adapter_Hb_Group(Hb_Group* source, Hb_Group* destination);
  void copy_node_Hb_Group(Hb_Group* source, Hb_Group* destination);
  void copy_site_split_Hb_Group(Hb_Group* source, Hb_Group* destination);
  void copy_site_merge_Hb_Group(Hb_Group* source, Hb_Group* destination);

  // What changed from the table in force to a new one, as one event of each kind. Without memory for an event its
  // pointer stays null.
  void compare_global_config_tables(Hb_Configuration_Internal* new_table, Hb_VEX_Event** adapter_death,
                                    Hb_VEX_Event** node_death, Hb_VEX_Event** config, Hb_VEX_Event** adapter_join,
                                    Hb_VEX_Event** node_join);
  void generate_event_for_missing_tbl2_adapters(Hb_Configuration_Internal* table1, Hb_Configuration_Internal* table2,
                                                zu_int32_t kind, Hb_VEX_Event** event);
  void generate_event_for_missing_tbl2_node(Hb_Configuration_Internal* table1, Hb_Configuration_Internal* table2,
                                            zu_int32_t kind, Hb_VEX_Event** event);
  void generate_event_for_config_change(Hb_Configuration_Internal* table1, Hb_Configuration_Internal* table2,
                                        Hb_VEX_Event** event);

  // The registry. Slots are only appended: one that was emptied stays empty. The array is never freed.
  static int32_t numbersOfFileDescriptors;  // live ones
  static int32_t handlerListSlots;          // capacity
  static int32_t currentSlots;              // ever used
  static HandlerInstancesMap* handlerInstances;

  // While it is set, a monitor that cannot be opened as there are none at all is no error to be traced.
  static bool absence_is_no_error;

 private:
  int32_t open_and_register(char* fname, const char* p_initstr);
  void drop_descriptor();
  void leave_slots_to(HandlerInstancesMap emptied);

 protected:
  int32_t evmon_fd;
  char* evmon_fname;
  int vex_open_file_rc;
  int32_t open_file_errno;
};
