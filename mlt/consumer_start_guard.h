// A guard on the start of MLT's avformat consumer (the encoder melt, Kdenlive and Shotcut render
// with), whose thread can otherwise find the consumer not yet running and end at once.
#pragma once

namespace veltrane_mlt {

// Every avformat consumer the MLT factory makes from now on in this process has its start
// guarded. Called once each time MLT's factory starts and registers this module.
void guardEncoderStarts();

}  // namespace veltrane_mlt
