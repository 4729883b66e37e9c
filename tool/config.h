#pragma once

/// What kind of device and build the tool runs on.
namespace config {

namespace hw {

/// Whether the device is a watch-class product, by its product code.
bool watch();

}  // namespace hw

namespace build {

/// Whether the operating system is an internal or a carrier build.
bool internal_or_carrier();

}  // namespace build

}  // namespace config
