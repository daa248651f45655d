// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace Fuzz {

/// What stands in the array that targets begin with, as a topology. Their seeds name what is in it.
inline constexpr char const *sampleTopology = R"({"arrays":[
{"id":"array","endpoints":[{"uid":"endpoint","type":"SCSI","lunId":"1"},{"uid":"closed","type":"NFS","accessible":false},
{"type":"NFS4x","addresses":["10.0.0.1"]}]}],
"containers":[{"id":"0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9","name":"gold","maxLumoSizeMb":4096,"arrays":["array"],"volumes":[
{"uuid":"11111111-2222-3333-4444-555555555555","directoryName":"directory","sizeMb":8,"committedMb":4,"unsharedMb":2,
"metadata":[{"key":"k","value":"v"}]},
{"uuid":"22222222-2222-3333-4444-555555555555","directoryName":"bound","boundTo":"endpoint"},
{"uuid":"33333333-2222-3333-4444-555555555555","kind":"data","profile":"p"}]},
{"id":"1a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9","name":"silver","maxLumoSizeMb":1,"arrays":["array"]}]})";

} // namespace Fuzz
