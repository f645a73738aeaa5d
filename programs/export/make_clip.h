/**
 * @file make_clip.h
 * Finds the recordings of a clip, and makes it.
 */
#ifndef EXPORT_MAKE_CLIP_H
#define EXPORT_MAKE_CLIP_H

#include "options.h"
#include "report.h"

namespace clips {

/// Throws std::runtime_error if no clip is written.
void make_clip(const Options &options, Report &report);

}  // namespace clips

#endif
