// RadioAdaptationCommon: the request engine every platform's adaptation
// shares. It hands out request ids, keeps at most one pending request per
// kind, guards cellular requests with a 3000 ms and WLAN requests with a
// 10000 ms cancel timer, stamps results with their time (property 205) and,
// while the modem reports an unreliable state, the UTRA measurements with the
// start of that state (207), and delivers each result to the observer.
//
// A platform class derives from it, is constructed, must have init() return
// true (it opens the calling thread's dispatcher), and then supplies the
// hooks: doRequest/doCancelRequest start and cancel a measurement,
// doParseMeasurement turns pushed data into a container, and the platform
// reports every finished measurement with handleRequestComplete. A result
// that completes inside the platform's own start call must pass
// deliverAsync = true: it is then queued and delivered from the dispatcher's
// loop, one queued call per result, oldest first, so the observer is never
// called from inside requestMeasurements. Time-outs are delivered at once,
// inside the timer callback, with status Timeout and no object.
//
// Single-threaded: every operation, hook and callback runs on the thread of
// the dispatcher opened by init(); nothing is locked. Destruction cancels
// pending requests without notifying, removes the queued calls and drops
// undelivered results.
#ifndef LODESTACK_RADIOADAPTATION_RADIOADAPTATIONCOMMON_H
#define LODESTACK_RADIOADAPTATION_RADIOADAPTATIONCOMMON_H

#include <ctime>
#include <deque>
#include <map>

#include "lodestack/core/IAsyncCallDispatcher.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/radioadaptation/IRadioAdaptation.h"

namespace lodestack {
namespace radioadaptation {

class LODESTACK_EXPORT RadioAdaptationCommon : public IRadioAdaptation, public core::ITimerObserver {
 public:
  // Bit of networkStatus(): cellular measurements cannot be trusted now (a
  // dedicated-channel state, or just after a change of radio technology).
  static constexpr int kUnreliableMeasurementsFlag = 0x1000;
  static constexpr int kCellularTimeoutMs = 3000;
  static constexpr int kWlanTimeoutMs = 10000;

  // One pending notification.
  struct Result {
    unsigned int requestId;  // 0 for pushed data
    int type;                // one MeasurementType bit
    gom::SharedPointer<gom::GenericObject> measurements;  // container root or null
    Status status;
  };

  ~RadioAdaptationCommon() override;

  Status requestMeasurements(int types, unsigned int& requestId) override;
  Status cancelRequest(unsigned int requestId) override;
  Status setSimulationEnabled(bool enabled) override;
  Status setObserver(IRadioAdaptationObserver* observer) override;
  void onSubscriptionChanged(int types, bool subscribed) override;
  // `data` points to a gom::SharedPointer<gom::GenericObject> holding a
  // container (see doParseMeasurement; a platform may take its own form).
  // Ok once the result is queued; InvalidArgument for a bad kind or null
  // data; Failed when the object is not a container.
  Status pushMeasurement(const void* data, int size, int types) override;
  // `data` points to the 32-bit status word (see doParseNetworkStatus).
  Status pushNetworkStatus(const void* data, int subscription, MeasurementType type) override;
  int networkStatus(int subscription) override;
  int wifiStatus(int subscription) override;
  int gnssStatus(int subscription) override;

  // Opens the calling thread's dispatcher; false when it cannot be opened.
  // Call once, before anything else.
  virtual bool init();
  // The cancel timer of a pending request expired: the platform is told to
  // cancel and the observer hears Timeout at once.
  void timeout(core::ITimer* timer) override;

 protected:
  RadioAdaptationCommon();

  // Platform hooks. The defaults: NotSupported for requests and
  // cancellations; see doParseMeasurement; the status word `data` points to.
  virtual Status doRequest(MeasurementType type);
  virtual Status doCancelRequest(MeasurementType type);
  // The container of pushed `data`, with `status` set: here `data` points to
  // a gom::SharedPointer<gom::GenericObject>; null data gives
  // InvalidArgument and null.
  virtual gom::SharedPointer<gom::GenericObject> doParseMeasurement(const void* data, int type,
                                                                    Status& status);
  virtual int doParseNetworkStatus(const void* data, MeasurementType type, Status& status);

  bool hasObserver() const { return observer != nullptr; }
  // `types` when it names exactly one kind, else 0.
  static int verifyMeasurementTypes(int types);
  Status startCancelTimer(MeasurementType type);
  Status stopCancelTimer(MeasurementType type);
  // Forgets every pending request (the platform is told), without notifying.
  void cancelAllRequests();
  // The platform's report of a finished measurement of `type`: stops its
  // timer, stamps the container and delivers it (queued when deliverAsync,
  // at once otherwise) with the pending request's id, or 0 when none is
  // pending. A status other than Ok and UnreliableMeasurement drops the
  // object. Throws WrongObjectType when a kept object is not a container.
  void handleRequestComplete(MeasurementType type,
                             const gom::SharedPointer<gom::GenericObject>& measurements,
                             Status status, bool deliverAsync);
  void scheduleNotification(const Result& result);
  void issueNotification(const Result& result);
  void issueNextNotification();
  void handleAsyncCallPrivate();

  // Stamps every measurement of the cellular collections of `object` with
  // property 205 = time where it has none. Ok for a null object; Failed for
  // time -1; otherwise the first failure of the per-collection form (an
  // empty collection stops the walk with NotFound).
  Status addTimeStamp(gom::SharedPointer<gom::GenericObject>& object, long time);
  // Sets `propertyId` = value on every element of collection `collectionId`
  // that lacks it. Ok when the collection is absent; NotFound when it is
  // empty; Failed for an element without an object.
  Status addTimeStamp(gom::SharedPointer<gom::GenericObject>& object, unsigned short collectionId,
                      unsigned short propertyId, unsigned int value);
  // While bit 0x1000 is set, stamps the UTRA-FDD and UTRA-TDD measurements
  // with property 207 = unreliableSince.
  Status addUnreliableStateTimeStamp(gom::SharedPointer<gom::GenericObject>& object);

 private:
  // The receiver of this engine's queued calls.
  class AsyncHelper : public core::IAsyncCallReceiver {
   public:
    void handleAsyncCall(void* param) override;
    RadioAdaptationCommon* owner = nullptr;
  };

  gom::SharedPointer<core::ITimer>& cancelTimer(MeasurementType type);

  IRadioAdaptationObserver* observer;
  gom::SharedPointer<core::IAsyncCallDispatcher> dispatcher;
  AsyncHelper asyncHelper;
  unsigned int requestCounter;
  std::map<MeasurementType, unsigned int> pendingRequests;
  std::deque<Result> notificationQueue;

 protected:
  // The last cellular status word (bit kUnreliableMeasurementsFlag) and the
  // time (seconds since the epoch) the unreliable state began, 0 when
  // unknown or not in it. Platform classes keep both up to date.
  int networkStatusFlags;
  std::time_t unreliableSince;

 private:
  int wifiStatusValue;
  int gnssStatusValue;
  gom::SharedPointer<core::ITimer> cellularCancelTimer;
  gom::SharedPointer<core::ITimer> wlanCancelTimer;
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_RADIOADAPTATIONCOMMON_H
