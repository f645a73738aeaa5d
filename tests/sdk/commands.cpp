// The driver's commands in hand-written numbers. Tests compare commands by these names, so a mistyped number
// in the driver's header, which the virtual card shares with the SDK, makes the command unknown.

#include <map>

#include "sdk_test.h"

std::string command_name(u32 code) {
  // clang-format off
  static const std::map<u32, const char *> kCommands = {
    {0x40086500, "ENC_IOC_SET_SCALE"},          {0x400C6501, "ENC_IOC_SET_INTERVAL"},
    {0x40086502, "ENC_IOC_SET_GOP"},            {0x40086503, "ENC_IOC_SET_QP"},
    {0xC0086504, "ENC_IOC_GET_SCALE"},          {0xC00C6505, "ENC_IOC_GET_INTERVAL"},
    {0xC0086506, "ENC_IOC_GET_GOP"},            {0xC0086507, "ENC_IOC_GET_QP"},
    {0x00006509, "ENC_IOC_MPEG4_DONE"},         {0xC004650B, "ENC_IOC_CHANNEL_NUMBER_ON"},
    {0xC004650C, "ENC_IOC_CHANNEL_NUMBER_OFF"}, {0xC008650E, "encoder write"},
    {0x0000650F, "ENC_IOC_MPEG4_REQUEST"},      {0x00006510, "ENC_IOC_STOP"},
    {0xC0046511, "ENC_IOC_SET_STANDARD"},       {0x00006512, "ENC_IOC_START"},
    {0xC00C6513, "ENC_IOC_SET_CBR"},            {0xC0106514, "ENC_IOC_SET_QP_RANGE"},
    {0x00006400, "DISP_IOC_BEGIN_UPDATE"},      {0x00006401, "DISP_IOC_END_UPDATE"},
    {0x40206402, "DISP_IOC_SET_WINDOW"},        {0x400C6403, "DISP_IOC_SET_ZOOM"},
    {0x40046406, "DISP_IOC_SET_SOURCE_CFG"},    {0x40306407, "DISP_IOC_SET_GRID"},
    {0x401C6408, "DISP_IOC_SET_RECT"},          {0x00006409, "DISP_IOC_MOTION_TRACE_ON"},
    {0x0000640A, "DISP_IOC_MOTION_TRACE_OFF"},  {0x8004640B, "DISP_IOC_GET_WIDTH"},
    {0x8004640C, "DISP_IOC_GET_HEIGHT"},        {0xC004640D, "DISP_IOC_SET_STANDARD"},
    {0xC008640E, "read"},                       {0xC008640F, "write"},
    {0x00006410, "DISP_IOC_PREVIEW_ON"},        {0x00006411, "DISP_IOC_PREVIEW_OFF"},
    {0x80046412, "DISP_IOC_GET_MOTION"},        {0xC0046413, "DISP_IOC_SELECT_BUFFER"},
    {0x40147601, "VIN_IOC_SET_MASK"},           {0x40187602, "VIN_IOC_SET_MOTION_MAP"},
    {0xC0047604, "VIN_IOC_SET_STANDARD"},       {0xC0087605, "input read"},
    {0xC0087606, "input write"},                {0xC0037607, "decoder read"},
    {0xC0037608, "decoder write"},              {0xC0047609, "VIN_IOC_SET_WIDTH"},
    {0xC008760A, "board"},                      {0xC002760B, "VIN_IOC_GET_MOTION_LEVELS"}};
  // clang-format on
  const auto command = kCommands.find(code);
  return command != kCommands.end() ? command->second : "UNKNOWN COMMAND";
}
