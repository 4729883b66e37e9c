#pragma once

#include "platform/compression.h"

#include <string>

/// Folders and names of the manager's traces and collections.
namespace vell::trace {

extern const char* const kSnapshotFolder;     ///< Folder of the collections.
extern const char* const kLogDirPrefix;       ///< First part of every collection's name.
extern const char* const kLogTarExtension;    ///< Extension of a collection packed with tar(1).
extern const char* const kLogTarGzExtension;  ///< The same, compressed with gzip(1).
extern const char* const kScratchFolder;      ///< Folder of the live traces.

extern const char* const kAlderTraceSnapshotDirectorySuffix;
extern const char* const kBirchTraceSnapshotDirectorySuffix;
extern const char* const kBirchQDSSTraceSnapshotDirectorySuffix;
extern const char* const kAlderCoreDumpSnapshotDirectorySuffix;
extern const char* const kBirchCoreDumpSnapshotDirectorySuffix;

/// The suffix of a baseband trace's directory, by the family of the device's radio. `qdss`: it is
/// the QDSS trace.
std::string getBasebandTraceDirSuffix(bool qdss);

/// The suffix of a core dump's directory, by the family of the device's radio. The radio is asked
/// for on the first call only.
std::string getCoreDumpDirSuffix();

}  // namespace vell::trace

namespace diag::config {

extern const char* const kDIAGScratchDir;  ///< The live DIAG trace, below the scratch folder.
extern const char* const kQDSSScratchDir;  ///< The live QDSS trace, below the scratch folder.

}  // namespace diag::config

/// The path of a collection: the snapshot folder, the prefix, `timestamp`, and the ending. The
/// ending is a point and the extension of `mode`, or `suffix` when `mode` does not pack. From any
/// thread.
std::string buildLogPath(std::string timestamp, CompressionMode mode, std::string suffix);
