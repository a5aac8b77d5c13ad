// A measurement source over a bus service: requests go to the source's bus
// thread, answers come back through queued calls of the dispatcher.
#include "platform/host/ServiceSource.h"

#include <deque>
#include <mutex>
#include <stdexcept>
#include <unordered_map>

#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/debug/Debug.h"
#include "platform/host/BusWorker.h"
#include "platform/host/Scenario.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

std::mutex gSkippedMutex;
SkippedCells gSkipped;

class ServiceSource;

// Queued calls carry a source's id, never its address: a call that runs
// after the source is gone finds no entry. Ids are not reused.
std::mutex gRegistryMutex;
std::unordered_map<std::uintptr_t, ServiceSource*> gRegistry;
std::uintptr_t gNextId = 1;

class ServiceSource : public MeasurementSource {
 public:
  explicit ServiceSource(std::unique_ptr<ServiceProtocol> protocol)
      : protocol_(std::move(protocol)),
        dispatcher_(core::AsyncCallDispatcher::openDispatcher(
            core::AsyncCallDispatcher::MainLoopDefault)),
        queue_(dispatcher_.get()) {
    if (!queue_) throw std::runtime_error("no dispatcher on this thread");
    {
      std::lock_guard<std::mutex> lock(gRegistryMutex);
      id_ = gNextId++;
      gRegistry[id_] = this;
    }
    try {
      worker_ = std::make_unique<BusWorker>(
          *protocol_, [this](unsigned generation, std::optional<ServiceAnswer> answer,
                             std::string failure) {
            post(Report{generation, std::move(answer), std::move(failure)});
          });
    } catch (...) {
      unregister();
      throw;
    }
  }

  ~ServiceSource() override {
    unregister();
    worker_.reset();  // no report after this
  }

  void start(RadioMeasurements::Callback callback, void* context) override {
    stop();
    const std::string known = worker_->knownFailure();
    if (!known.empty()) {
      worker_->reconnect();  // the next request tries again
      reportFailure(known);
      throw std::runtime_error(known);
    }
    callback_ = callback;
    context_ = context;
    worker_->measure(generation_);
  }

  void cancel() override {
    if (callback_) {
      const std::string unfinished = worker_->unfinishedMessage();
      if (!unfinished.empty()) reportFailure(unfinished);
    }
    stop();
  }

  static void deliverQueued(void* id) {
    ServiceSource* source = nullptr;
    {
      std::lock_guard<std::mutex> lock(gRegistryMutex);
      auto entry = gRegistry.find(reinterpret_cast<std::uintptr_t>(id));
      if (entry != gRegistry.end()) source = entry->second;
    }
    // Queued calls run on the dispatcher's thread, the only one that
    // destroys sources, so the entry stays valid here.
    if (source) source->deliver();
  }

 private:
  struct Report {
    unsigned generation;
    std::optional<ServiceAnswer> answer;
    std::string failure;
  };

  void unregister() {
    std::lock_guard<std::mutex> lock(gRegistryMutex);
    gRegistry.erase(id_);
  }

  // Bus thread: one queued call per report.
  void post(Report report) {
    {
      std::lock_guard<std::mutex> lock(inboxMutex_);
      inbox_.push_back(std::move(report));
    }
    if (!queue_->queueAsyncCall(&ServiceSource::deliverQueued, reinterpret_cast<void*>(id_)))
      Debug::log(Debug::Level1, gRadioAdaptationComponentName,
                 "a measurement of the bus services was dropped: no queued call\n");
  }

  void deliver() {
    Report report;
    {
      std::lock_guard<std::mutex> lock(inboxMutex_);
      if (inbox_.empty()) return;
      report = std::move(inbox_.front());
      inbox_.pop_front();
    }
    if (report.generation != generation_ || !callback_) return;  // ended meanwhile
    RadioMeasurements::Callback callback = callback_;
    callback_ = nullptr;
    if (!report.answer) {
      reportFailure(report.failure);  // the engine's time-out ends the request
      return;
    }
    if (protocol_->cellular()) setLastSkippedCells(report.answer->skipped);
    // Last: the callback may destroy the library object and this source.
    callback(context_, std::move(report.answer->result));
  }

  // Ends the running measurement: its report, if any, is ignored.
  void stop() {
    ++generation_;
    callback_ = nullptr;
    worker_->cancel();
  }

  std::unique_ptr<ServiceProtocol> protocol_;
  gom::SharedPointer<core::IAsyncCallDispatcher> dispatcher_;
  core::IAsyncCallDispatcher* queue_;  // what the bus thread may use of it
  std::uintptr_t id_ = 0;
  std::mutex inboxMutex_;
  std::deque<Report> inbox_;
  // Dispatcher's thread only.
  unsigned generation_ = 0;
  RadioMeasurements::Callback callback_ = nullptr;
  void* context_ = nullptr;
  std::unique_ptr<BusWorker> worker_;  // last: stopped before the rest goes
};

}  // namespace

std::string ServiceProtocol::absentMessage() const {
  const BusService service = services().front();
  return std::string(service.label) + " (" + service.busName + ") is not on the system bus";
}

std::unique_ptr<MeasurementSource> makeServiceSource(std::unique_ptr<ServiceProtocol> protocol) {
  return std::make_unique<ServiceSource>(std::move(protocol));
}

void reportFailure(const std::string& message) {
  Debug::log(Debug::Level1, gRadioAdaptationComponentName, "%s\n", message.c_str());
  setLastError(message);
}

void setLastSkippedCells(const SkippedCells& skipped) {
  std::lock_guard<std::mutex> lock(gSkippedMutex);
  gSkipped = skipped;
}

}  // namespace host

SkippedCells lastSkippedCells() {
  std::lock_guard<std::mutex> lock(host::gSkippedMutex);
  return host::gSkipped;
}

}  // namespace platform
}  // namespace lodestack
