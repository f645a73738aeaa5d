#ifndef ZV_LIB_H
#define ZV_LIB_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

int zv_Open(HANDLE *handle);
int zv_Close(HANDLE handle);
int zv_RegisterCallBack(HANDLE, ZV_STREAM_CALLBACK mpeg4, ZV_STREAM_CALLBACK mjpeg, ZV_STREAM_CALLBACK audio);
int zv_Start(HANDLE);
int zv_Stop(HANDLE);
u32 zv_GetResolution(HANDLE);
int zv_SetResolution(HANDLE, u32);
u32 zv_GetVideoStandard(HANDLE);
int zv_SetVideoStandard(HANDLE, u32);
int zv_EnablePreviewChannels(HANDLE, u32 mask);
int zv_GetPreviewScreen(HANDLE, u8 **picture);
int zv_GetVideoEncodeConfig(HANDLE, u32 channel, ZV_VIDEO_CONFIG *);
int zv_SetVideoEncodeConfig(HANDLE, u32 channel, const ZV_VIDEO_CONFIG *);
int zv_CheckVideoEncodeConfig(HANDLE);
int zv_EnableVideoRecordChannels(HANDLE, u32 mask);
int zv_EnableAudioChannels(HANDLE, u32 mask);
int zv_GetAudioStream(HANDLE, u32 channel);
u32 zv_GetPreviewMode(HANDLE);
int zv_SetPreviewMode(HANDLE, u32);
u32 zv_GetFocusChannel(HANDLE);
int zv_SetFocusChannel(HANDLE, u32);
int zv_EnableVideoChannelNumber(HANDLE, u32);
int zv_DisableVideoChannelNumber(HANDLE, u32);
int zv_GetVideoProperty(HANDLE, u32, ZV_VIDEO_PROPERTY *);
int zv_SetVideoProperty(HANDLE, u32, ZV_VIDEO_PROPERTY *);
int zv_GetMotionSensitivity(HANDLE, u32, u32 *);
int zv_SetMotionSensitivity(HANDLE, u32, u32);
int zv_MarkMotionArea(HANDLE, u32, const ZV_RECT *, u32 mark);
int zv_StartMotionDetection(HANDLE);
int zv_StopMotionDetection(HANDLE);
u32 zv_GetMotionStatus(HANDLE);
int zv_SetShieldRect(HANDLE, u32, const ZV_RECT *);
int zv_GetShieldRect(HANDLE, u32, ZV_RECT *);
u32 zv_GetVideoStatus(HANDLE);
u32 zv_GetAudioStatus(HANDLE);
u32 zv_GetHardwareVersion(HANDLE);
int zv_EnableWatchDog(HANDLE);
int zv_DisableWatchDog(HANDLE);
int zv_GetTarnRegisterValue(HANDLE, u32 reg, u32 *);
int zv_SetTarnRegisterValue(HANDLE, u32 reg, const u32 *);
int zv_GetTW2815RegisterValue(HANDLE, u8 chip, u8 reg, u8 *);
int zv_SetTW2815RegisterValue(HANDLE, u8 chip, u8 reg, const u8 *);

#ifdef __cplusplus
}
#endif

#endif
