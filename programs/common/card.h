/**
 * @file card.h
 * Helpers for all programs and examples: an open card that closes itself, and exceptions for failed SDK
 * calls.
 */
#ifndef CARD_H
#define CARD_H

#include <stdexcept>
#include <string>

#include "zv_lib.h"

/// Returns the meaning of a status as a text for the user.
inline const char *status_text(int status) {
  switch (status) {
    case ZV_ERR_OPEN:
      return "a device node could not be opened; load the driver or preload the virtual card";
    case ZV_ERR_ALREADY_OPEN:
      return "a card is already open in this process";
    case ZV_ERR_NO_MEMORY:
      return "out of memory, or a region of the card could not be mapped";
    case ZV_ERR_MODE:
      return "no such preview mode";
    case ZV_ERR_CHANNEL:
      return "channel out of range";
    case ZV_ERR_STANDARD:
      return "no such video standard";
    case ZV_ERR_RESOLUTION:
      return "no such resolution";
    case ZV_ERR_CONFIG:
      return "the settings are invalid or exceed the frame-rate budget of the card";
    case ZV_ERR_PARAM:
      return "value out of range";
    case ZV_ERR_THREAD_CREATE:
      return "a thread could not be created";
    case ZV_ERR_THREAD_JOIN:
      return "a thread could not be joined";
    case ZV_ERR_CLOSE:
      return "a device node could not be closed";
    case ZV_ERR_DEVICE:
      return "the driver or the card refused or did not reply";
    default:
      return "unknown status";
  }
}

/// Throws if an SDK call has failed, for example "zv_Open failed with status 1: a device node ...".
inline void check(int status, const char *call) {
  if (status != ZV_OK) {
    throw std::runtime_error(std::string(call) + " failed with status " + std::to_string(status) + ": " +
                             status_text(status));
  }
}

/// An open card. The destructor stops a capture that still runs and closes the card.
struct Card {
  HANDLE handle = nullptr;

  Card() { check(zv_Open(&handle), "zv_Open"); }
  ~Card() {
    zv_Stop(handle);
    zv_Close(handle);
  }
  Card(const Card &) = delete;
  Card &operator=(const Card &) = delete;
};

#endif
