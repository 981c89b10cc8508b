// POSITION: an opaque place in a framework list or another walked sequence.
#pragma once

namespace vaskel {

struct VKPositionTag;
typedef VKPositionTag* POSITION;

} // namespace vaskel
