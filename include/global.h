/**
 * @file global.h
 * Enumerations shared by the sources of the demo application.
 */
#ifndef GLOBAL_H
#define GLOBAL_H

/** The activity that has just started or stopped; the argument of DemoDialog::UpdateUI(). */
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

/** The channel set that the sixteen channel check boxes show and edit. */
enum CHANNEL_SETTING_MODE {
  ENABLE_PREVIEW = 0, /**< the channels in the preview */
  ENABLE_AUDIO = 1,   /**< the audio inputs to record, boxes 1 to 4 */
  ENABLE_RECORD = 2,  /**< the channels to record */
  VIDEO_STATUS = 3,   /**< the last video-loss status, read only */
  MOTION_STATUS = 4,  /**< the last motion status, read only */
  INITIAL_CASE = 5    /**< no set; a click changes nothing */
};

#endif
