/**
 * @file preview_picture.h
 * Fetches preview pictures with the SDK.
 */
#ifndef CONTRACT_PREVIEW_PICTURE_H
#define CONTRACT_PREVIEW_PICTURE_H

#include "image.h"
#include "zv_lib.h"

namespace contract {

/// Returns a preview picture that the card has composed after this call. Throws std::runtime_error if none of
/// the size of the standard and the width comes within two seconds.
Image settled_preview(HANDLE card);

}  // namespace contract

#endif
