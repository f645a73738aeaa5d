/**
 * @file sdl.h
 * The preview window. Only the preview thread calls these functions but the first.
 */
#ifndef APP_SDL_H
#define APP_SDL_H

/// Sets the two variables by which SDL takes its fast overlay; InitialSDL() does the same. A program calls
/// it before it has a second thread: a variable that exists is replaced in place, while one that is new
/// may move the environment away from under a thread that reads it.
void set_overlay_environment();

/// Opens the window and makes the overlay, both `width` x `height` pixels. 0 on success; -1, with the
/// reason printed, when there is no window or no overlay. CloseSDL() is due in either case.
int InitialSDL(int width, int height);

/// Shows, in a window that InitialSDL() has opened, one packed UYVY picture of `length` bytes; what is longer
/// than the overlay is left out.
void UpDataYUVScreen(unsigned char *picture, int length);

/// Writes the frame rate into the window's caption.
void UpdateFrameRate(int fps);

/// 1 when the next waiting event asks to quit, else 0.
int CheckExitEvent();

/// Closes the window. Harmless when it was never opened.
void CloseSDL();

#endif
