/**
 * @file preview_thread.h
 * The thread that shows the card's preview picture in a window of its own. The dialog owns it: these
 * functions but videothread() are called on the GUI thread only.
 */
#ifndef PREVIEW_THREAD_H
#define PREVIEW_THREAD_H

/// The thread itself; the argument is not used, the result is null.
void *videothread(void *);

/// Lets the previous thread end and starts a new one. False when no thread can be created.
bool start_preview_thread();

/// Tells the thread to end, and does not wait for it.
void stop_preview_thread();

/// Waits for the end of a thread that was told to end, or that ends by itself. Harmless without one.
void join_preview_thread();

#endif
