/**
 * @file global.h
 * Enumerations shared by the sources of the demo application.
 */
#ifndef GLOBAL_H
#define GLOBAL_H

/** What DemoDialog::UpdateUI() is told: the activity that has just started or stopped. */
enum UI_STATUS {
  PREVIEW_START = 0,
  PREVIEW_STOP = 1,
  RECORD_START = 2,
  RECORD_STOP = 3,
  PLAYBACK_START = 4,
  PLAYBACK_STOP = 5,
  MOTION_START = 6,
  MOTION_STOP = 7
};

/** What the sixteen channel check boxes show and edit. */
enum CHANNEL_SETTING_MODE {
  ENABLE_PREVIEW = 0, /**< the previewed channels */
  ENABLE_AUDIO = 1,   /**< the recorded audio inputs, boxes 1 to 4 */
  ENABLE_RECORD = 2,  /**< the recorded channels */
  VIDEO_STATUS = 3,   /**< the last video-loss status, read only */
  MOTION_STATUS = 4,  /**< the last motion status, read only */
  INITIAL_CASE = 5    /**< nothing; a click changes nothing */
};

#endif
