#include "tests/in_process/device.h"

#include "platform/compression.h"
#include "platform/helper_client.h"
#include "platform/program.h"
#include "platform/telephony.h"

#include <cstdlib>
#include <iostream>
#include <memory>
#include <utility>

namespace {

std::unique_ptr<in_process::Device>& present() {
  static std::unique_ptr<in_process::Device> there;
  return there;
}

}  // namespace

in_process::Device& in_process::device() {
  return *present();
}

in_process::Device& in_process::startDevice(const std::string& profileText) {
  closeClients();
  auto file = SettingsFile::parse(profileText);
  auto faults = file.faults;
  auto& started = *(present() = std::make_unique<Device>());
  started.model = simulator::DeviceModel::fromProfile(file, faults);
  started.profile = DeviceProfile::from(file);
  if (!faults.empty()) {
    std::cerr << "profile, line " << faults.front().line << ": " << faults.front().what << "\n";
    std::abort();
  }
  started.managerRuns = started.model.managerRuns();
  return started;
}

int radioType() {
  return in_process::device().profile.radioType;
}

int productCode() {
  return in_process::device().profile.productCode;
}

int radioVendor() {
  return in_process::device().profile.radioVendor;
}

bool radioDiagSupportsQdss() {
  return in_process::device().profile.radioDiagQdss;
}

bool isInternalBuild() {
  return in_process::device().profile.internalBuild;
}

bool isCarrierBuild() {
  return in_process::device().profile.carrierBuild;
}

CompressionMode defaultCompressionMode() {
  return in_process::device().profile.defaultCompression;
}

bool compressionSupported() {
  return in_process::device().profile.compressionSupported;
}

const char* getprogname() {
  return in_process::device().programName.c_str();
}

class vell::HelperClient::Connection {};

vell::HelperClient::HelperClient(std::unique_ptr<Connection> opened)
    : connection(std::move(opened)) {}

vell::HelperClient::~HelperClient() = default;

std::shared_ptr<vell::HelperClient> vell::HelperClient::create(
    const char* /*name*/, std::shared_ptr<LogServer> /*logServer*/) {
  return std::shared_ptr<HelperClient>(new HelperClient(nullptr));
}

CommandResult vell::HelperClient::perform(helper::TaskID /*task*/, const char* command,
                                          MessageDict /*request*/, MessageDict& reply) {
  const auto answer = in_process::device().model.performHelperCommand(command);
  reply = answer.reply;
  return {answer.status, answer.message};
}
