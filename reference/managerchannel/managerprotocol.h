#pragma once

// The channel between the index manager of the server API library and the
// running server instance it manages.
//
// Transport: a Unix-domain stream socket per instance (managerconnection.h),
// carrying frames as the comm transport does (u32 little-endian byte count,
// then one record). Each record is one compact JSON object.
//
//   request  {"op": NAME, ...fields of the request}
//   answer   {"status": 0 or a cv::rovo::status code, "text": why it failed, ...fields}
//
// A connection carries one request at a time; each is answered before the
// next is read. A request with an unknown "op" is answered with Unsupported,
// so a newer library can tell an older server from a broken one.

#include <QLatin1String>

#include <cstddef>
#include <string_view>

namespace sorvik::manager {

// RUNTIME/<class>/<name>.sock as for the comm library's local services:
// the default local server's channel, and the instance with port name P at
// RUNTIME/VEK_INDEX_MANAGER_SERVER/P.sock.
inline constexpr std::u16string_view kLocalName = u"VEK_INDEX_MANAGER";
inline constexpr std::u16string_view kLocalClass = u"VEK_INDEX_MANAGER_SEARCH_BROWSE";
inline constexpr std::u16string_view kInstanceClass = u"VEK_INDEX_MANAGER_SERVER";

// Records above these sizes are refused before they are decoded.
inline constexpr std::size_t kMaxRequestBytes = std::size_t(1) << 20;
inline constexpr std::size_t kMaxAnswerBytes = std::size_t(16) << 20;

inline constexpr QLatin1String kOp("op");
inline constexpr QLatin1String kStatus("status");
inline constexpr QLatin1String kText("text");

namespace op {
// -> version (packed, see sorvik/packedversion.h), portName ("" for the
//    default local server), serverFlag (true for a --portname instance),
//    store (the configuration store file the instance serves)
inline constexpr QLatin1String Hello("hello");
// generation -> answered once the server has applied that configuration
//    generation (or a later one); applied
inline constexpr QLatin1String WaitApplied("wait-applied");
// -> applied, browseTimeoutMs, queryTimeoutMs, waiting (wait-applied
//    requests not yet answered), applyDelayMs
inline constexpr QLatin1String State("state");
inline constexpr QLatin1String ResetTimeoutFiles("reset-timeout-files");
inline constexpr QLatin1String ResetFailedFiles("reset-failed-files");
// kind (1 browse and connection, 2 query), milliseconds
inline constexpr QLatin1String SetServiceTimeout("set-service-timeout");

// The indexer and the property side of the index. A level is one of the
// keys "sorvik_root", "qdm_channelgroup", "qdm_channel" (case ignored);
// another is answered with NotFound.
// -> done, total (equal unless indexing runs), time (ms since 1970 of the
//    last progress; absent before any), passes (completed since the start),
//    running, pending (indexing is due once the idle time has passed)
inline constexpr QLatin1String IndexingProgress("indexing-progress");
// -> levels: [{name, key, displayNames: {language: text}}]
inline constexpr QLatin1String PropertyModel("property-model");
// level -> properties: [{name, occurrences}] by name
inline constexpr QLatin1String LevelProperties("level-properties");
// level -> the server counts the level's occurrences anew, in the background
inline constexpr QLatin1String CountOccurrences("count-occurrences");
// level -> counting (true until the count asked for has ended)
inline constexpr QLatin1String CountingOccurrences("counting-occurrences");
// level, property -> state (101 when it is not optimized)
inline constexpr QLatin1String OptimizationState("optimization-state");
// level -> properties: [{name, state}] by name, also those no longer indexed
inline constexpr QLatin1String OptimizedProperties("optimized-properties");
} // namespace op

namespace field {
inline constexpr QLatin1String Version("version");
inline constexpr QLatin1String PortName("portName");
inline constexpr QLatin1String ServerFlag("serverFlag");
inline constexpr QLatin1String Store("store");
inline constexpr QLatin1String Generation("generation");
inline constexpr QLatin1String Applied("applied");
inline constexpr QLatin1String BrowseTimeoutMs("browseTimeoutMs");
inline constexpr QLatin1String QueryTimeoutMs("queryTimeoutMs");
inline constexpr QLatin1String Waiting("waiting");
inline constexpr QLatin1String ApplyDelayMs("applyDelayMs");
inline constexpr QLatin1String Kind("kind");
inline constexpr QLatin1String Milliseconds("milliseconds");
inline constexpr QLatin1String Done("done");
inline constexpr QLatin1String Total("total");
inline constexpr QLatin1String Time("time");
inline constexpr QLatin1String Passes("passes");
inline constexpr QLatin1String Running("running");
inline constexpr QLatin1String Pending("pending");
inline constexpr QLatin1String Levels("levels");
inline constexpr QLatin1String Name("name");
inline constexpr QLatin1String Key("key");
inline constexpr QLatin1String DisplayNames("displayNames");
inline constexpr QLatin1String Level("level");
inline constexpr QLatin1String Property("property");
inline constexpr QLatin1String Properties("properties");
inline constexpr QLatin1String Occurrences("occurrences");
inline constexpr QLatin1String State("state");
inline constexpr QLatin1String Counting("counting");
} // namespace field

// The requests the configuration store carries for the server
// (rovo::AddRequest) about optimized properties; the argument is a JSON
// object {"level": key, "property": name, "state": state} (no state for
// unoptimize-property).
namespace request {
inline constexpr QLatin1String OptimizeProperty("optimize-property");
inline constexpr QLatin1String UnoptimizeProperty("unoptimize-property");
} // namespace request

} // namespace sorvik::manager
