/**
 * @file preview_thread.h
 * The thread that shows the card's preview picture in its own window. The dialog owns it: call these
 * functions on the GUI thread only, except videothread().
 */
#ifndef PREVIEW_THREAD_H
#define PREVIEW_THREAD_H

/// The thread's function. Ignores its argument and returns null.
void *videothread(void *);

/// Ends and joins the previous thread and starts a new one. Returns false when no thread can be created.
bool start_preview_thread();

/// Tells the thread to end. Does not wait for it.
void stop_preview_thread();

/// Waits until the thread has ended: call stop_preview_thread() before, or it may wait for ever. Does nothing
/// without a thread.
void join_preview_thread();

#endif
