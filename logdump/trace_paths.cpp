#include "logdump/trace_paths.h"

#include "platform/telephony.h"

namespace vell::trace {

const char* const kSnapshotFolder = "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/";
const char* const kLogDirPrefix = "log-bb-";
const char* const kLogTarExtension = "tar";
const char* const kLogTarGzExtension = "tar.gz";
const char* const kScratchFolder = "/private/var/wireless/Library/Logs/VellManager/";

const char* const kAlderTraceSnapshotDirectorySuffix = "-bb-trace";
const char* const kBirchTraceSnapshotDirectorySuffix = "-diag";
const char* const kBirchQDSSTraceSnapshotDirectorySuffix = "-qdss";
const char* const kAlderCoreDumpSnapshotDirectorySuffix = "-coredump";
const char* const kBirchCoreDumpSnapshotDirectorySuffix = "-cd";

}  // namespace vell::trace

namespace diag::config {

const char* const kDIAGScratchDir = "DIAG.scratch";
const char* const kQDSSScratchDir = "QDSS.scratch";

}  // namespace diag::config

namespace {

/// The vendor code of the Alder family; every other vendor's radios are of the Birch family.
constexpr int kAlderVendor = 2;

bool isAlderRadio() {
  return radioVendor() == kAlderVendor;
}

std::string endingOf(CompressionMode mode, const std::string& suffix) {
  switch (mode) {
    case kCompressionTarGz:
      return std::string(".") + vell::trace::kLogTarGzExtension;
    case kCompressionTar:
      return std::string(".") + vell::trace::kLogTarExtension;
    default:
      return suffix;
  }
}

}  // namespace

std::string vell::trace::getBasebandTraceDirSuffix(bool qdss) {
  if (isAlderRadio()) {
    return kAlderTraceSnapshotDirectorySuffix;
  }
  return qdss ? kBirchQDSSTraceSnapshotDirectorySuffix : kBirchTraceSnapshotDirectorySuffix;
}

std::string vell::trace::getCoreDumpDirSuffix() {
  static const std::string suffix = isAlderRadio() ? kAlderCoreDumpSnapshotDirectorySuffix
                                                   : kBirchCoreDumpSnapshotDirectorySuffix;
  return suffix;
}

std::string buildLogPath(std::string timestamp, CompressionMode mode, std::string suffix) {
  return std::string(vell::trace::kSnapshotFolder) + vell::trace::kLogDirPrefix + timestamp +
         endingOf(mode, suffix);
}
