/**
 * @file sdl.h
 * The preview window. Only the preview thread calls these functions, except set_overlay_environment().
 */
#ifndef APP_SDL_H
#define APP_SDL_H

/// Sets the two environment variables that make SDL use its fast overlay; InitialSDL() sets them again.
/// Call it before the program has a second thread: adding a variable may move the environment while another
/// thread reads it, replacing one does not.
void set_overlay_environment();

/// Opens the window and creates the overlay, both `width` x `height` pixels. Returns 0 on success; prints the
/// reason and returns -1 when the window or the overlay cannot be created. Call CloseSDL() in both cases.
int InitialSDL(int width, int height);

/// Shows a packed UYVY picture of `length` bytes in the window that InitialSDL() has opened. Ignores bytes
/// that do not fit into the overlay.
void UpDataYUVScreen(unsigned char *picture, int length);

/// Shows the frame rate in the window's title.
void UpdateFrameRate(int fps);

/// Returns 1 when the next event in the queue asks to quit, else 0.
int CheckExitEvent();

/// Closes the window. Does nothing when no window is open.
void CloseSDL();

#endif
