/**
 * @file demodialog.h
 * The operator's dialog.
 */
#ifndef DEMODIALOG_H
#define DEMODIALOG_H

#include <QDialog>
#include <cstdio>
#include <optional>

#include "form_fit.h"
#include "global.h"
#include "ui_demodialog.h"

/// The dialog. The form creates and connects the widgets; each panel's slots are in a source file of their
/// own. All functions run on the GUI thread.
class DemoDialog : public QDialog, public Ui::DemoDialog {
  Q_OBJECT

 public:
  explicit DemoDialog(QWidget *parent = nullptr, const char *name = nullptr, bool modal = false,
                      unsigned int flags = 0);
  ~DemoDialog() override;

 public slots:
  virtual void ExitDialog();
  virtual void StartPreview();
  virtual void StopPreview();
  virtual void CheckFormat();
  virtual void ChangeResolution();
  virtual void PreviewSplit1();
  virtual void PreviewSplit4();
  virtual void PreviewSplit6();
  virtual void PreviewSplit8();
  virtual void PreviewSplit9();
  virtual void PreviewSplit16();
  virtual void EnablePreview();
  virtual void EnableAudio();
  virtual void EnableRecord();
  virtual void ChSettingChange();
  virtual void SetCheckBox(unsigned int mask);
  virtual void GetVideoStatus();
  virtual void GetMotionStatus();
  virtual void StartMotion();
  virtual void StopMotion();
  virtual void GetSensitivity();
  virtual void SetSensitivity();
  virtual void SetProperty();
  virtual void GetProperty();
  virtual void UpdatePropertyEdt();
  virtual void UpdatePropertySlider();
  virtual void UpdateEncodeInfo();
  virtual void UpdateCodecInfo();
  virtual void UpdateFrameRate();
  virtual void SetShield();
  virtual void GetShield();
  virtual void SetFocus();
  virtual void GetFocus();
  virtual void StartRecord();
  virtual void StopRecord();
  virtual void Playback();
  virtual void TimerTick();
  virtual void UpdatePath();
  virtual void CheckFolder(char *root);
  virtual void UpdateDiskLimit();
  virtual void UpdateTimeInterval();
  virtual void SetMotionArea();
  virtual void SetTwoField();
  virtual void UpdateJpegQuality();
  virtual void SetQPMinMax();
  virtual void SetCBRbps();
  virtual void SetQP();
  virtual void SetGOP();

 protected:
  virtual void InitEncodeConfig();
  virtual unsigned int CheckCheckBox();
  virtual void WriteHeader(FILE *fp, int ch);
  virtual int CheckDiskSpace(char *path);
  virtual int CheckTime();
  virtual void OpenFile();
  virtual void CloseFile();
  virtual void UpdateUI(UI_STATUS status);
  virtual void WriteEnableCh();
  virtual int WriteVideoRecordConfig();

 protected slots:
  virtual void languageChange();

 protected:
  void changeEvent(QEvent *event) override;

 private:
  void init();
  void destroy();

  std::optional<FormFit> form_fit;  // empty until the widgets exist
};

#endif
