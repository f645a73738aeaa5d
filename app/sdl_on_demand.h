/**
 * @file sdl_on_demand.h
 * SDL is loaded with the first preview, not with the program: it brings more than twenty libraries with it,
 * and whoever only records needs none of them.
 */
#ifndef APP_SDL_ON_DEMAND_H
#define APP_SDL_ON_DEMAND_H

/// Loads SDL unless it is there already. Null on success, else why it cannot be had, good until the calling
/// thread's next call. Without success no function of SDL may be called.
const char *load_sdl();

#endif
