#pragma once

#include <cstdint>

/// How collected logs are packed, as the manager's interface counts it. Values other than the three
/// below may come from the device profile and are passed on unchanged.
using CompressionMode = std::int64_t;

inline constexpr CompressionMode kCompressionNone = 0;
inline constexpr CompressionMode kCompressionTarGz = 1;
inline constexpr CompressionMode kCompressionTar = 2;

/// The device's default compression mode.
CompressionMode defaultCompressionMode();

/// Whether the device can compress collected logs at all.
bool compressionSupported();
