#include "simulator/collection_writer.h"

#include "simulator/child_process.h"
#include "simulator/complaint.h"
#include "simulator/device_root.h"

#include <fstream>
#include <system_error>
#include <vector>

namespace simulator {

namespace {

namespace fs = std::filesystem;

/// Throws std::filesystem::filesystem_error when a directory cannot be made.
bool writeDirectories(const fs::path& parent, const Collection& collection,
                      const std::string& contents) {
  bool written = true;
  for (const auto& directory : collection.directories) {
    fs::create_directories(parent / directory);
    std::ofstream file(parent / directory / "request.txt", std::ios::binary);
    file << contents << "\n" << std::flush;
    written = written && file;
  }
  return written;
}

bool packDirectories(const fs::path& parent, const Collection& collection,
                     const fs::path& archive) {
  std::vector<std::string> words = {"tar",
                                    "--create",
                                    "--force-local",
                                    "--auto-compress",
                                    "--file=" + archive.string(),
                                    "--directory=" + parent.string()};
  words.insert(words.end(), collection.directories.begin(), collection.directories.end());
  const pid_t tar = startChild(words, {}).process;
  return tar > 0 && awaitChild(tar) == 0;
}

}  // namespace

bool writeCollection(const fs::path& root, const Collection& collection,
                     const std::string& contents) {
  const auto snapshots = root / kSnapshotDirectory;
  try {
    if (collection.archive.empty()) {
      return writeDirectories(snapshots, collection, contents);
    }
    const auto staging = root / "var/tmp" / collection.archive;
    const bool packed = writeDirectories(staging, collection, contents) &&
                        packDirectories(staging, collection, snapshots / collection.archive);
    fs::remove_all(staging);
    return packed;
  } catch (const fs::filesystem_error& error) {
    complain(std::string("cannot write a collection: ") + error.what());
    return false;
  }
}

}  // namespace simulator
