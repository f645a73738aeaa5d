/**
 * @file client.h
 * The client's side of the virtual card's control socket.
 */
#ifndef CARD_CLIENT_H
#define CARD_CLIENT_H

#include <functional>
#include <string>

namespace card {

/// Sends a request and calls `take` with the pieces of the answer as they come. Returns an empty text on
/// success, else what is wrong.
std::string ask(const std::string &socket, const std::string &request,
                const std::function<void(const std::string &piece)> &take);

}  // namespace card

#endif
