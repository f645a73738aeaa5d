/**
 * @file requests.h
 * Answers the requests of zarvo_card.
 */
#ifndef VIRTUAL_CARD_REQUESTS_H
#define VIRTUAL_CARD_REQUESTS_H

#include "control_server.h"

namespace virtual_card {

class Card;

/// Answers "apply ITEMS", "state", "counters" and "snapshot CHANNEL".
ControlServer::Answer answer_request(Card &card, std::string_view request);

}  // namespace virtual_card

#endif
