/**
 * @file control_server.h
 * The control socket: lets the program zarvo_card change and watch the card of another program.
 *
 * A client sends one line, e.g. "apply lost=3", and reads the answer until the server closes the connection:
 * a line "ok" or "error TEXT", then the text asked for. The answer to "log" ends only with the connection.
 */
#ifndef VIRTUAL_CARD_CONTROL_SERVER_H
#define VIRTUAL_CARD_CONTROL_SERVER_H

#include <functional>
#include <list>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>

#include "call_log.h"

namespace virtual_card {

class ControlServer {
 public:
  struct Answer {
    bool ok = true;
    std::string text;  ///< what was asked for, or what is wrong
  };
  /// Answers every request but "log". Runs on the server's thread.
  using Handler = std::function<Answer(std::string_view request)>;

  ControlServer(CallLog &log, Handler handler) : log_(log), handler_(std::move(handler)) {}
  ~ControlServer() { stop(); }
  ControlServer(const ControlServer &) = delete;
  ControlServer &operator=(const ControlServer &) = delete;

  /// Listens on a new socket of this path, mode 0600. Replaces a socket that nobody listens on. Returns an
  /// empty text, or what is wrong.
  std::string start(const std::string &path);
  /// Ends the thread and removes the socket. May be called twice.
  void stop();

 private:
  struct Client {
    int fd = -1;
    std::string request;
    std::string answer;  ///< what the client has not yet taken
    bool asked = false;
    bool watching = false;  ///< gets the log
    bool no_reads = false;
    std::string only;  ///< the node whose calls it gets; empty: all
    std::uint64_t lost = 0;
  };

  void loop();
  void accept_client();
  void drop(std::list<Client>::iterator client);
  /// Return false when the connection is to be closed.
  bool receive(Client &client);
  bool send_answer(Client &client);
  void answer(Client &client);
  void watch(Client &client, std::string_view options);
  void add_log_line(const LogLine &line);
  void wake() const;

  CallLog &log_;
  Handler handler_;
  std::string path_;
  int listener_ = -1;
  int wake_ = -1;
  std::atomic<bool> ending_{false};
  std::mutex mutex_;  // guards clients_: the threads of the host add lines of the log
  std::list<Client> clients_;
  std::thread thread_;
};

}  // namespace virtual_card

#endif
