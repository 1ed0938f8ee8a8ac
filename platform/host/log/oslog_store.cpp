#include "platform/oslog_store.h"

#include <new>
#include <stdexcept>
#include <string>
#include <utility>

#include "platform/host/device/Device.h"
#include "platform/host/log/EntryReader.h"
#include "platform/host/log/EventFilter.h"
#include "platform/host/log/LogSource.h"
#include "platform/host/log/ReadAhead.h"
#include "platform/host/log/StopSignal.h"
#include "platform/host/log/StreamEnd.h"
#include "platform/posix/Thread.h"
#include "platform/system.h"

namespace {

/// All that a stream's thread works with.
struct Delivery {
  std::shared_ptr<host::LogSource> source;
  std::shared_ptr<host::StopSignal> stop;
  host::EventFilter filter;
  OSLogEventStream::EventHandler eventHandler;
  OSLogEventStream::InvalidationHandler invalidationHandler;
  OSLogDate from{0};
  std::optional<unsigned long> reasonOfNormalEnd;
};

/// Delivers what is wanted until the log ends or the stream is stopped, and returns the reason.
/// Throws what reading throws.
unsigned long deliverEvents(const Delivery& delivery) {
  host::ReadAhead reader(
      *delivery.stop,
      [&delivery] { return delivery.source->open(delivery.from, delivery.filter, *delivery.stop); },
      [&delivery](const host::LogEntry& entry) {
        return OSLogDate(entry.microseconds) >= delivery.from && delivery.filter.passes(entry);
      });
  while (!delivery.stop->raised() && reader.next()) {
    if (delivery.eventHandler) delivery.eventHandler(reader.event());
  }
  if (delivery.stop->raised()) return host::kStreamInvalidated;
  if (delivery.reasonOfNormalEnd) return *delivery.reasonOfNormalEnd;
  while (delivery.stop->waitReadable(-1)) {
  }
  return host::kStreamInvalidated;
}

/// Writes to the system log why the log was not read to its end.
void report(const char* why) noexcept try {
  platform::logError(std::string("Log not read to its end: ") + why);
} catch (const std::bad_alloc&) {  // the reason code has to do
}

/// Ends a stream. Nothing of it is left when the invalidation handler runs.
void end(Delivery delivery, unsigned long reason) {
  const auto handler = std::move(delivery.invalidationHandler);
  delivery = Delivery();
  if (handler) handler(reason, OSLogEventStreamPosition());
}

/// The life of a stream's thread.
void run(Delivery delivery) {
  unsigned long reason = host::kStreamUnreadable;
  try {
    reason = deliverEvents(delivery);
  } catch (const host::DamagedLog& damage) {
    reason = host::kStreamDamaged;
    report(damage.what());
  } catch (const std::bad_alloc&) {
    report("too little memory");
  } catch (const std::exception& failure) {
    report(failure.what());
  }
  end(std::move(delivery), reason);
}

class HostStream final : public OSLogEventStream {
 public:
  explicit HostStream(std::shared_ptr<host::LogSource> source)
      : stop(std::make_shared<host::StopSignal>()) {
    delivery.source = std::move(source);
    delivery.stop = stop;
    delivery.reasonOfNormalEnd = host::device().logEnd;
  }

  void setFlags(std::uint64_t) override {}  // nothing that this store does can be switched

  void setFilterPredicate(OSLogOrPredicate predicate) override {
    delivery.filter = host::EventFilter(std::move(predicate));
  }

  void setEventHandler(EventHandler handler) override {
    delivery.eventHandler = std::move(handler);
  }

  void setInvalidationHandler(InvalidationHandler handler) override {
    delivery.invalidationHandler = std::move(handler);
  }

  void activateStreamFromDate(OSLogDate date) override {
    if (delivery.source == nullptr) return;  // activated before
    delivery.from = date;
    // Shared, so that it is still there when no thread can be had.
    const auto handed = std::make_shared<Delivery>();
    std::swap(*handed, delivery);
    try {
      posix::startThread([handed] { run(std::move(*handed)); }).detach();
    } catch (const std::exception& failure) {
      report(failure.what());
      end(std::move(*handed), host::kStreamUnreadable);
    }
  }

  void invalidate() override { stop->raise(); }

 private:
  const std::shared_ptr<host::StopSignal> stop;
  Delivery delivery;
};

class HostStore final : public OSLogEventStore {
 public:
  void prepareWithCompletionHandler(PrepareHandler handler) override {
    std::shared_ptr<OSLogEventSource> source;
    std::optional<std::string> error;
    try {
      const host::Profile& device = host::device();
      if (!device.logPrepareError.empty()) throw std::runtime_error(device.logPrepareError);
      source = host::prepareLog(device.log);
    } catch (const std::exception& failure) {
      error = failure.what();
    }
    handler(std::move(source), error);
  }
};

}  // namespace

std::shared_ptr<OSLogEventStream> OSLogEventStream::initWithSource(
    std::shared_ptr<OSLogEventSource> source) {
  auto log = std::dynamic_pointer_cast<host::LogSource>(std::move(source));
  if (log == nullptr) return nullptr;
  try {
    return std::make_shared<HostStream>(std::move(log));
  } catch (const std::exception&) {
    return nullptr;
  }
}

std::shared_ptr<OSLogEventStore> OSLogEventStore::localStore() {
  return std::make_shared<HostStore>();
}
