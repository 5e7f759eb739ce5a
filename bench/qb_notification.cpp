#include "qb_notification.h"

#include <unistd.h>

#include <cstring>
#include <stdexcept>
#include <string>

namespace bench {
namespace {

constexpr int32_t event_id = 1;
constexpr int32_t without_limit = -1;
constexpr size_t largest_message = 64U << 10;

qb_loop_t* running_loop = nullptr;  // libqb's call-backs for descriptors do not say which loop they are for

int32_t add_descriptor(enum qb_loop_priority priority, int32_t descriptor, int32_t events, void* data,
                       qb_ipcs_dispatch_fn_t call) {
  return qb_loop_poll_add(running_loop, priority, descriptor, events, data, call);
}

int32_t change_descriptor(enum qb_loop_priority priority, int32_t descriptor, int32_t events, void* data,
                          qb_ipcs_dispatch_fn_t call) {
  return qb_loop_poll_mod(running_loop, priority, descriptor, events, data, call);
}

int32_t remove_descriptor(int32_t descriptor) { return qb_loop_poll_del(running_loop, descriptor); }

int32_t add_job(enum qb_loop_priority priority, void* data, qb_loop_job_dispatch_fn call) {
  return qb_loop_job_add(running_loop, priority, data, call);
}

int32_t accept_everybody(qb_ipcs_connection_t*, uid_t, gid_t) { return 0; }
int32_t ignore_message(qb_ipcs_connection_t*, void*, size_t) { return 0; }
void ignore_destruction(qb_ipcs_connection_t*) {}

void require_qb(bool good, const char* what) {
  if (!good) throw std::runtime_error(std::string(what) + " failed");
}

std::string service_name() { return "hb_bench." + std::to_string(getpid()); }

}  // namespace

QbNotification::QbNotification(size_t payload_size)
    : sent_(sizeof(qb_ipc_response_header) + payload_size), received_(sent_.size()) {
  serve();
  connect();
}

QbNotification::~QbNotification() {
  qb_ipcc_disconnect(client_);
  server_.join();
  qb_ipcs_destroy(service_);
  qb_loop_destroy(loop_);
}

void QbNotification::serve() {
  static qb_ipcs_service_handlers handlers = {accept_everybody, keep, ignore_message, stop, ignore_destruction};
  static qb_ipcs_poll_handlers descriptors = {add_job, add_descriptor, change_descriptor, remove_descriptor};
  loop_ = qb_loop_create();
  running_loop = loop_;
  require_qb(loop_ != nullptr, "qb_loop_create");
  service_ = qb_ipcs_create(service_name().c_str(), 0, QB_IPC_SHM, &handlers);
  require_qb(service_ != nullptr, "qb_ipcs_create");
  qb_ipcs_service_context_set(service_, this);
  qb_ipcs_poll_handlers_set(service_, &descriptors);
  require_qb(qb_ipcs_run(service_) == 0, "qb_ipcs_run");
}

void QbNotification::connect() {
  server_ = std::jthread([loop = loop_] { qb_loop_run(loop); });
  client_ = qb_ipcc_connect(service_name().c_str(), largest_message);
  if (client_ == nullptr) server_.detach();  // nobody is left who would end it
  require_qb(client_ != nullptr, "qb_ipcc_connect");
  connected_.acquire();
}

void QbNotification::keep(qb_ipcs_connection_t* connection) {
  auto* self = static_cast<QbNotification*>(qb_ipcs_connection_service_context_get(connection));
  self->connection_ = connection;
  self->connected_.release();
}

int32_t QbNotification::stop(qb_ipcs_connection_t*) {
  qb_loop_stop(running_loop);
  return 0;
}

void QbNotification::send(const Bytes& payload) {
  const qb_ipc_response_header header = {event_id, static_cast<int32_t>(sent_.size()), 0};
  std::memcpy(sent_.data(), &header, sizeof header);
  std::memcpy(sent_.data() + sizeof header, payload.data(), payload.size());
  const auto size = static_cast<ssize_t>(sent_.size());
  require_qb(qb_ipcs_event_send(connection_, sent_.data(), sent_.size()) == size, "qb_ipcs_event_send");
}

void QbNotification::take() {
  const auto size = static_cast<ssize_t>(received_.size());
  require_qb(qb_ipcc_event_recv(client_, received_.data(), received_.size(), without_limit) == size,
             "qb_ipcc_event_recv");
}

}  // namespace bench
