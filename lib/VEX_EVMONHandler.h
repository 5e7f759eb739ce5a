// Base of the VEX-mode handlers: it owns a descriptor, registers it, routes a ready descriptor to its handler, and has
// the operations with which every handler builds events and fills a caller's outputs.
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

class EVMONHandler {
 public:
  EVMONHandler(char* fname, const char* p_initstr);  // opens a monitor, and registers it when that succeeds
  EVMONHandler(int32_t* fds, char* path);            // for pipes: the derived class sets the descriptor and registers
  virtual ~EVMONHandler();
  EVMONHandler(const EVMONHandler&) = delete;
  EVMONHandler& operator=(const EVMONHandler&) = delete;

  // Reads what the descriptor delivers and fills the caller's outputs, or queues events. Never called on a base object.
  virtual Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p);

  int getFileDescriptor() { return evmon_fd; }
  int getOpenFileError() { return open_file_errno; }
  int getVEXEVMOpenRCInConstructor() { return vex_open_file_rc; }

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

  // What changed from the table in force to a new one, as one event of each kind.
  void compare_global_config_tables(Hb_Configuration_Internal* new_table, Hb_VEX_Event** adapter_death,
                                    Hb_VEX_Event** node_death, Hb_VEX_Event** config, Hb_VEX_Event** adapter_join,
                                    Hb_VEX_Event** node_join);
  void generate_event_for_missing_tbl2_adapters(Hb_Configuration_Internal* table1, Hb_Configuration_Internal* table2,
                                                zu_int32_t kind, Hb_VEX_Event** event);
  void generate_event_for_missing_tbl2_node(Hb_Configuration_Internal* table1, Hb_Configuration_Internal* table2,
                                            zu_int32_t kind, Hb_VEX_Event** event);
  void generate_event_for_config_change(Hb_Configuration_Internal* table1, Hb_Configuration_Internal* table2,
                                        Hb_VEX_Event** event);

  // The registry. Slots are only appended: one that was emptied stays empty.
  static int32_t numbersOfFileDescriptors;  // live ones
  static int32_t handlerListSlots;          // capacity
  static int32_t currentSlots;              // ever used
  static HandlerInstancesMap* handlerInstances;

 protected:
  int32_t evmon_fd;
  char* evmon_fname;
  int vex_open_file_rc;
  int32_t open_file_errno;
};
