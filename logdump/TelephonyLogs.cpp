#include <iostream>
#include <new>

#include "logdump/LogdumpCommand.h"
#include "logdump/LogdumpOptions.h"
#include "logdump/TraceNames.h"
#include "platform/telephony.h"

namespace {

/// The differences between the two collections.
struct Collection {
  const char* label;
  lumo::dict (*makeRequest)(const std::string& reason, CompressionMode mode);
  bool followsLiteTrace;  ///< a lite system-logs trace leaves nothing to compress
  std::string (*defaultSuffix)();
};

lumo::dict TelephonyRequest(const std::string& reason, CompressionMode mode) {
  return {{zub::kKeyTraceAction, zub::kCollectTelephonyLogs},
          {zub::kKeyTraceDumpStateReason, reason},
          {zub::kKeyTraceDumpStatePerformCompression, static_cast<std::int64_t>(mode)}};
}

lumo::dict CoredumpRequest(const std::string& reason, CompressionMode mode) {
  return {{zub::kKeyBasebandResetType, zub::kBasebandResetTypeHard},
          {zub::kKeyBasebandResetSubType, zub::kBasebandResetSubTypeOtherErrors},
          {zub::kKeyTraceAction, zub::kCollectTelephonyLogsWithCoredump},
          {zub::kKeyBasebandResetReason, reason},
          {zub::kKeyTraceDumpStatePerformCompression, static_cast<std::int64_t>(mode)}};
}

constexpr Collection kTelephony = {"Telephony log collection: ", TelephonyRequest, true,
                                   [] { return std::string("-*"); }};
constexpr Collection kTelephonyWithCoredump = {
    "Telephony log collection with Coredump: ", CoredumpRequest, false,
    zub::trace::getCoreDumpDirSuffix};

void PrintOutcome(const Collection& collection, CompressionMode mode,
                  const TelephonyLumo::Result& result, const lumo::object& reply) {
  const bool succeeded = result.code == 0;
  std::cout << collection.label << (succeeded ? "Success" : "Failed") << std::endl;
  if (!succeeded || !reply.isDict()) return;
  try {
    const auto timestamp = lumo::dyn_cast_or_default(reply.get(zub::kKeyTimestampString), "");
    std::cout << "Path = " << buildLogPath(timestamp, mode, collection.defaultSuffix())
              << std::endl;
  } catch (const std::bad_alloc&) {  // a completion must not throw
    std::cerr << "Not enough memory" << std::endl;
  }
}

bool Collect(const LogdumpCommand& node, const Collection& collection, const dispatch::group& group,
             const std::list<std::string>& words) {
  auto mode = static_cast<CompressionMode>(defaults::compression::mode());
  std::string reason;
  bool noUi = false;
  parseLogdumpOptions(words, mode, reason, noUi);
  if (collection.followsLiteTrace && node.isSystemLogsTraceLite()) mode = CompressionMode::none;
  auto request = collection.makeRequest(reason, mode);
  if (noUi) request.set(zub::kKeyTraceUserConfirmation, false);

  const dispatch::membership sending(group);
  zub::client::PerformCommand(
      node.manager, zub::kCommandTraceDumpState,
      [&collection, mode, collecting = sending](const TelephonyLumo::Result& result,
                                                const lumo::object& reply) {
        PrintOutcome(collection, mode, result, reply);
      },
      request);
  return true;
}

CommandHandler HandlerOf(const LogdumpCommand& node, const Collection& collection) {
  return [&node, &collection](const dispatch::group& group, const std::list<std::string>& words) {
    return Collect(node, collection, group, words);
  };
}

}  // namespace

CommandHandler LogdumpCommand::telephonyLogs() const { return HandlerOf(*this, kTelephony); }

CommandHandler LogdumpCommand::telephonyLogsWithCoredump() const {
  return HandlerOf(*this, kTelephonyWithCoredump);
}
