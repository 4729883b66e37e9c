#include "tests/in_process/device.h"

#include "platform/compression.h"
#include "platform/helper_client.h"
#include "platform/manager_client.h"
#include "platform/program.h"
#include "platform/telephony.h"

using in_process::device;

// clang-format off

int productCode() { return device.productCode; }
int radioVendor() { return device.radioVendor; }
bool radioDiagSupportsQdss() { return false; }
bool isInternalBuild() { return false; }
bool isCarrierBuild() { return false; }
CompressionMode defaultCompressionMode() { return kCompressionNone; }
bool compressionSupported() { return true; }
std::set<std::string> processNames() { return device.processNames; }
const char* getprogname() { return device.programName.c_str(); }

// clang-format on

class BusConnection {};

vell::HelperClient::~HelperClient() = default;

std::shared_ptr<vell::HelperClient> vell::HelperClient::create(const char*,
                                                               std::shared_ptr<LogServer>) {
  return nullptr;
}

CommandResult vell::HelperClient::perform(helper::TaskID, const char*, MessageDict, MessageDict&) {
  return {};
}

class vell::client::Manager {};

std::shared_ptr<vell::client::Manager> vell::client::CreateManager(const std::string& clientName,
                                                                   WorkQueue queue) {
  device.clientCalls.push_back("CreateManager " + clientName + " " + queue.label());
  return std::make_shared<Manager>();
}

void vell::client::RegisterEventHandler(std::shared_ptr<Manager>, const std::string& eventName,
                                        EventHandler handler) {
  device.clientCalls.push_back("RegisterEventHandler " + eventName);
  device.eventHandler = std::move(handler);
}

void vell::client::EventsOn(std::shared_ptr<Manager>) {
  device.clientCalls.emplace_back("EventsOn");
}

void vell::client::EventsOff(std::shared_ptr<Manager>) {
  device.clientCalls.emplace_back("EventsOff");
}

void vell::client::PerformCommand(std::shared_ptr<Manager>, const std::string&,
                                  Completion completion, MessageDict) {
  completion({}, {});
}

CommandResult vell::client::PerformCommand(std::shared_ptr<Manager>, const std::string&,
                                           MessageDict, MessageDict*) {
  return {};
}
