/**
 * @file report.h
 * Tells the card's state and counters as lines "name value" for zarvo_card.
 */
#ifndef VIRTUAL_CARD_REPORT_H
#define VIRTUAL_CARD_REPORT_H

#include <string>

#include "board.h"

namespace virtual_card {

/// A name has dots between its parts, e.g. "camera.3.signal"; channels, inputs and windows count from 1.
std::string state_report(Board &board);
std::string counters_report(const Counters &counters);

}  // namespace virtual_card

#endif
