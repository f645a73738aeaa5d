/**
 * @file message.h
 * What the card tells the people at the machine.
 */
#ifndef VIRTUAL_CARD_MESSAGE_H
#define VIRTUAL_CARD_MESSAGE_H

namespace virtual_card {

/// Prints "virtual card: ", a text in the format of printf() and a line end on standard error.
__attribute__((format(printf, 1, 2))) void print_message(const char *format, ...);

}  // namespace virtual_card

#endif
