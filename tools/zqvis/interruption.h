// Ctrl-C between two files: the one in hand is finished, so that no partial file is left.
#ifndef ZQVIS_INTERRUPTION_H
#define ZQVIS_INTERRUPTION_H

// While it lives, the first request to stop (SIGINT, SIGTERM) is only noted; a second one ends the
// program at once. Requests that were ignored stay so. One at a time.
class Interruption {
  public:
    Interruption();
    ~Interruption();
    Interruption(const Interruption&) = delete;
    Interruption& operator=(const Interruption&) = delete;

    static bool requested();
    // Ends the program as the request would have done; returns if there was none.
    static void follow();

  private:
    using Handler = void (*)(int);
    Handler on_interrupt_;
    Handler on_terminate_;
};

#endif
