#include "lodestack/core/LinAsyncCallDispatcher.h"

#include <errno.h>
#include <sys/socket.h>
#include <unistd.h>

#include "core/Descriptor.h"
#include "core/GuardedCall.h"

namespace lodestack {
namespace core {

IPollSink::~IPollSink() = default;

namespace {
// Each 4-byte record is charged several hundred bytes of socket memory; the
// default send buffer holds only a few hundred. Ask for room for about ten
// thousand (the kernel caps the request at its configured maximum); the ids
// that still do not fit are remembered and sent later.
constexpr int kSendBufferBytes = 4 * 1024 * 1024;
}  // namespace

LinAsyncCallDispatcher::LinAsyncCallDispatcher()
    : readFd_(0), writeFd_(0), hasUnsent_(false), stalled_(false) {}

LinAsyncCallDispatcher::~LinAsyncCallDispatcher() {
  if (readFd_ != 0) close(readFd_);
  if (writeFd_ != 0) close(writeFd_);
  readFd_ = writeFd_ = 0;
  sinks_.clear();
}

bool LinAsyncCallDispatcher::baseInit() {
  int fds[2];
  if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, fds) != 0) return false;
  for (int& fd : fds) fd = offZero(fd);
  if (fds[0] < 0 || fds[1] < 0) {
    for (int fd : fds)
      if (fd >= 0) close(fd);
    return false;
  }
  readFd_ = fds[0];
  writeFd_ = fds[1];
  setsockopt(writeFd_, SOL_SOCKET, SO_SNDBUF, &kSendBufferBytes, sizeof kSendBufferBytes);
  return true;
}

bool LinAsyncCallDispatcher::sendId(unsigned int id) {
  if (send(writeFd_, &id, sizeof id, MSG_DONTWAIT | MSG_EOR) == sizeof id) return true;
  // A full pair is the normal case: records are waiting, and the owner sends
  // one waiting id per record it consumes. Any other failure may leave the
  // pair empty, so the waiting ids are retried from every sleep and queueing.
  if (errno != EAGAIN && errno != EWOULDBLOCK) stalled_.store(true, std::memory_order_relaxed);
  return false;
}

// Lock held (we are called from addDelegate). While earlier ids wait, this
// one joins the end of the queue, so records always travel in id order.
bool LinAsyncCallDispatcher::doScheduleDelegate(unsigned int id) {
  if (writeFd_ == 0) return false;
  if (stalled_.load(std::memory_order_relaxed)) flushUnsentLocked();
  if (unsent_.empty() && sendId(id)) return true;
  unsent_.push_back(id);
  hasUnsent_.store(true, std::memory_order_relaxed);
  return false;
}

void LinAsyncCallDispatcher::flushUnsentLocked() {
  stalled_.store(false, std::memory_order_relaxed);
  while (!unsent_.empty() && sendId(unsent_.front())) unsent_.pop_front();
  hasUnsent_.store(!unsent_.empty(), std::memory_order_relaxed);
}

void LinAsyncCallDispatcher::resendUnsent() {
  if (!stalled_.load(std::memory_order_relaxed)) return;
  ScopedLock lock(pendingLock());
  if (lock.locked()) flushUnsentLocked();  // else tried again next time
}

void LinAsyncCallDispatcher::handlePollEvent(const pollfd&) { invokeApc(); }

// One record per readiness event; further records keep the descriptor
// readable for the following turns of the loop.
void LinAsyncCallDispatcher::invokeApc() {
  unsigned int id = 0;
  if (recv(readFd_, &id, sizeof id, MSG_DONTWAIT) != sizeof id) return;
  invokeDelegate(id);
}

// The record just consumed made room for one more, and producers send
// nothing while ids wait: send the oldest waiting id.
void LinAsyncCallDispatcher::duringTake() {
  if (!hasUnsent_.load(std::memory_order_relaxed) || unsent_.empty()) return;
  if (sendId(unsent_.front())) unsent_.pop_front();
  hasUnsent_.store(!unsent_.empty(), std::memory_order_relaxed);
}

bool LinAsyncCallDispatcher::attachPollSink(const pollfd& p, IPollSink* sink) {
  if (!sink || p.fd == 0 || sinks_.count(p.fd) != 0) return false;
  bool attached = false;
  const bool returned = guardedCall([&] {
    sinks_[p.fd] = sink;
    attached = doAttachPollSink(p);
  });
  if (returned && attached) return true;
  sinks_.erase(p.fd);
  return false;
}

void LinAsyncCallDispatcher::detachPollSink(const pollfd& p) {
  doDetachPollSink(p);
  sinks_.erase(p.fd);
}

bool LinAsyncCallDispatcher::invokeCallback(const pollfd& p) {
  const auto it = sinks_.find(p.fd);
  if (it == sinks_.end()) return false;
  IPollSink* sink = it->second;
  return guardedCall([&] { sink->handlePollEvent(p); });
}

}  // namespace core
}  // namespace lodestack
