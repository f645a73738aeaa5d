// Answers the requests of zarvo_card.
#include "requests.h"

#include "card.h"
#include "item_values.h"
#include "picture/snapshot.h"
#include "report.h"

namespace virtual_card {

ControlServer::Answer answer_request(Card &card, std::string_view request) {
  const auto [word, rest] = split(request, ' ');
  if (word == "apply") {
    std::string error = card.board().apply(rest);
    return {error.empty(), error};
  }
  if (word == "state") return {true, state_report(card.board())};
  if (word == "counters") return {true, counters_report(counters())};
  if (word == "snapshot") {
    const auto channel = number_in(rest, 1u, kChannels);
    if (!channel)
      return {false, "channel \"" + std::string(rest) + "\" is wrong; expected: a number from 1 to 16"};
    return {true, to_ppm(card.runner().look(*channel - 1))};
  }
  return {false, "request \"" + std::string(word) +
                     "\" is unknown; possible are apply, state, counters, log, snapshot"};
}

}  // namespace virtual_card
