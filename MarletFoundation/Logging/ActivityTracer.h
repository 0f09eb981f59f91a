#pragma once

#include <memory>
#include <string>

#include "MarletFoundation/Logging/ActivityTracingEvent.h"
#include "MarletFoundation/Logging/MLFReporting.h"
#include "MarletFoundation/Platform/DispatchQueue.h"

namespace MarletFoundation {

/// Records what a learner does in a document: free-form events in the file "activity.log" in the
/// application-support directory, typed events in the telemetry service. All of it happens in order on a queue in
/// the background, so no caller waits. Always held shared: what waits on the queue drops the typed events of a tracer that is gone.
/// Any thread.
class MARLET_EXPORT ActivityTracer : public std::enable_shared_from_this<ActivityTracer> {
 public:
  /// The process's own. Making it registers the default of "EnableActivityTracing", which hosts read by a
  /// `UserDefaultBoolKey`; the tracer itself doesn't look at it.
  static const std::shared_ptr<ActivityTracer>& sharedTracer();
  /// Another one, for a host that keeps events of its own apart.
  static std::shared_ptr<ActivityTracer> make();
  ActivityTracer(const ActivityTracer&) = delete;
  ActivityTracer& operator=(const ActivityTracer&) = delete;

  /// Adds a line to the file: the time, the name, and the data as JSON. As long as the file can't be written, or its
  /// directory not be made, tracing is off, which is logged once. That the host knows no such directory is a fatal error.
  void traceEvent(std::string name, ActivityTracingEvent::Data data);
  /// Sends the event. One that can't be sent is logged and dropped.
  void traceTelvaneEvent(ActivityTracingEvent event);

  /// Whether the telemetry service could be set up, asked on `loggingQueue`.
  bool reporterEnabled() const { return reporterEnabled_; }
  /// Where everything happens; a host waits for what it traced with an empty `sync`.
  const DispatchQueue loggingQueue{"com.quorvex.Marlets.activityLogging", DispatchQueue::Kind::serial,
                                   DispatchQuality::background};

 private:
  ActivityTracer() = default;
  void startReporter();

  // Both are used on the queue only.
  std::shared_ptr<MLFReporting> reporter_;
  bool reporterEnabled_ = false;
};

/// Forward to `sharedTracer`.
MARLET_EXPORT void TraceEvent(std::string name, ActivityTracingEvent::Data data);
MARLET_EXPORT void TraceTelvaneEvent(ActivityTracingEvent event);

}  // namespace MarletFoundation
