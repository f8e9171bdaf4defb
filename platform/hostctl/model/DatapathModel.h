//===- model/DatapathModel.h - Settings of the datapath part --------------===//
#pragma once

namespace Model {

/// Setting keys of the ENS contexts (values are decimal integers).
inline constexpr const char* kEnsMaxLcoresKey = "ens.maxLcores";
inline constexpr const char* kEnsLcoreLimitKey = "ens.lcoreLimit";
inline constexpr const char* kEnsNumaNodesKey = "ens.numaNodes";

/// Defaults of a host whose description says nothing about ENS.
inline constexpr long kEnsDefaultMaxLcores = 0;
inline constexpr long kEnsDefaultLcoreLimit = 16;
inline constexpr long kEnsDefaultNumaNodes = 1;

} // namespace Model
