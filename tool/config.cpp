#include "tool/config.h"

#include "platform/telephony.h"

#include <algorithm>
#include <array>

namespace {

constexpr std::array kWatchClassProductCodes = {58, 59, 60, 61, 87, 88, 103, 104, 105, 106};

}  // namespace

bool config::hw::watch() {
  return std::find(kWatchClassProductCodes.begin(), kWatchClassProductCodes.end(), productCode()) !=
         kWatchClassProductCodes.end();
}

bool config::build::internal_or_carrier() {
  return isInternalBuild() || isCarrierBuild();
}
