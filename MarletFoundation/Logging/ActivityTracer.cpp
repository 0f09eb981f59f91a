#include "MarletFoundation/Logging/ActivityTracer.h"

#include <atomic>
#include <ctime>
#include <filesystem>

#include "MarletFoundation/Logging/SystemLog.h"
#include "MarletFoundation/Logging/UserDefaultBoolKey.h"
#include "MarletFoundation/Platform/AppendedFile.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/JSONSerialization.h"

namespace MarletFoundation {
namespace {

/// The file at its end, made when it isn't there, with its directory. Throws what stands against it.
Descriptor openLog() {
  const auto& directory = HostEnvironment::current().applicationSupportDirectory;
  if (!directory) fatalError("There is no application-support directory for the activity log.");
  std::error_code failure;
  std::filesystem::create_directories(directory->path(), failure);
  if (failure) throwPosix(failure.value(), directory->path());
  return openToAppend(directory->appendingPathComponent("activity.log").path());
}

/// Adds a line. As long as that fails, tracing is off, which is logged once and not for each event.
void writeLine(const std::string& line) {
  static std::atomic<bool> isOff = false;
  try {
    const auto file = openLog();
    if (writeAll(file.get(), line) != 0) throwPosix(errno, "activity.log");
    isOff = false;
  } catch (const ErrorObject& error) {
    if (!isOff.exchange(true)) log("Activity tracing is off: " + error.description());
  }
}

/// "2026-11-23 05:20:40 +0000"
std::string printedNow() {
  const auto now = std::time(nullptr);
  std::tm parts{};
  ::gmtime_r(&now, &parts);
  char text[32];
  return {text, std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S +0000", &parts)};
}

std::string lineOf(const std::string& name, const ActivityTracingEvent::Data& data) {
  const auto start = "[" + printedNow() + "] " + name;
  try {
    return start + " " + JSONSerialization::write(*objectOf(data)) + "\n";
  } catch (const Error&) {
    return start + " <Error Serializing JSON>\n";
  }
}

}  // namespace

std::shared_ptr<ActivityTracer> ActivityTracer::make() {
  return std::shared_ptr<ActivityTracer>(new ActivityTracer());
}

const std::shared_ptr<ActivityTracer>& ActivityTracer::sharedTracer() {
  static const auto& tracer = *new auto([] {
    UserDefaults::registerDefault("EnableActivityTracing", false);
    return make();
  }());
  return tracer;
}

void ActivityTracer::traceEvent(std::string name, ActivityTracingEvent::Data data) {
  loggingQueue.async([name = std::move(name), data = std::move(data)] { writeLine(lineOf(name, data)); });
}

void ActivityTracer::traceTelvaneEvent(ActivityTracingEvent event) {
  loggingQueue.async([weak = weak_from_this(), event = std::move(event)] {
    const auto tracer = weak.lock();
    if (!tracer) return;
    if (!tracer->reporter_) tracer->startReporter();
    if (!tracer->reporter_) return;
    try {
      tracer->reporter_->sendMessage(static_cast<std::uint16_t>(event.category),
                                     static_cast<std::uint16_t>(event.type), *objectOf(event.data));
    } catch (const Error&) {
      log("Telvane Error, dropping log message");
    }
  });
}

void ActivityTracer::startReporter() {
  reporter_ = std::make_shared<MLFReporting>();
  reporter_->startConfiguration([weak = weak_from_this()](const std::vector<std::string>& results) {
    const auto tracer = weak.lock();
    if (!tracer) return;
    tracer->loggingQueue.async([weak, isGood = !results.empty()] {
      const auto owner = weak.lock();
      if (!owner) return;
      owner->reporterEnabled_ = isGood;
      if (isGood) return;
      log("Error setting up Telvane!");
      owner->reporter_.reset();
    });
  });
}

void TraceEvent(std::string name, ActivityTracingEvent::Data data) {
  ActivityTracer::sharedTracer()->traceEvent(std::move(name), std::move(data));
}

void TraceTelvaneEvent(ActivityTracingEvent event) {
  ActivityTracer::sharedTracer()->traceTelvaneEvent(std::move(event));
}

}  // namespace MarletFoundation
