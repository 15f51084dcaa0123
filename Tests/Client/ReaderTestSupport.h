#ifndef READERTESTSUPPORT_H
#define READERTESTSUPPORT_H

#include "Oracles/ReadText.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

/// The text of main around some statements, which begin on line 2.
inline std::string inMain(const std::string& Statements) {
    return "input uint8 in; output uint8 out; state uint8 s; state uint8 a[4]; param uint8 P = 3; "
           "type T = uint8 lsb 0.5; extern e; proc f(uint8 x) { } proc uint8 g() { return 1; } "
           "proc main() {\n" +
           Statements + "\n}\n";
}

/// What an accepted text prints as; else its messages.
inline std::string printed(const std::string& Text) {
    const ReadText Read(Text);
    return Read.isRead() ? Read.print() : Read.messages();
}

/// Every text that is printed reads back, and prints the same. False for a text that is refused.
inline bool printsAndReadsBack(const std::string& Text, std::string& Difference) {
    const ReadText First(Text);
    if (!First.isRead())
        return false;
    const std::string Once = First.print();
    const std::string Twice = printed(Once);
    if (Once != Twice)
        Difference += "printed:\n" + Once + "then:\n" + Twice;
    return true;
}

/// The texts of the example programs.
inline std::vector<std::string> exampleTexts() {
    std::vector<std::filesystem::path> Files;
    for (const auto& Entry : std::filesystem::directory_iterator(HPNSSA_SOURCE_DIR "/Examples"))
        if (Entry.path().extension() == ".hpn")
            Files.push_back(Entry.path());
    std::sort(Files.begin(), Files.end());
    std::vector<std::string> Texts;
    for (const std::filesystem::path& File : Files) {
        std::ostringstream Text;
        Text << std::ifstream(File, std::ios::binary).rdbuf();
        Texts.push_back(Text.str());
    }
    return Texts;
}

/// The program that every user meets first; it holds every declaration and most statements.
inline std::string sampleText() {
    return R"(// Cruise control: one pass of main is one step of the controller.
type Speed   = uint16 lsb 0.01 offset 0 range [0, 300] saturate;   // km/h
type Percent = uint8  lsb 0.5           range [0, 100] saturate;

input  Speed   vehicle_speed;              // changes outside at any time: volatile
input  bool    brake;
input  uint8   button;                     // 0 none, 1 set, 2 resume, 3 off
output Percent throttle   = 0;
state  Speed   target     = 0;
state  float64 integral   = 0.0;
state  bool    active     = false;
state  uint8   history[8];                 // an array: its elements are not tracked
param  bool    HAS_RESUME = false;         // option of this vehicle line; never assigned
param  float64 KP = 0.8;
param  float64 KI = 0.05;

extern log_event reads(target, active) writes(history);

proc main() {
  if (brake || button == 3)                { active = false; log_event(); }
  else if (button == 1)                    { target = vehicle_speed; active = true; }
  else if (HAS_RESUME && button == 2)      { active = true; }
  if (active) { regulate(target - vehicle_speed); }
  else        { throttle = 0; integral = 0.0; }
}

proc regulate(float64 error) {
  local uint8 i = 0;
  integral = integral + KI * error;
  while (i < 8) { history[i] = history[i] / 2; i = i + 1; }
  if (integral > 50.0) { integral = 50.0; } else if (integral < -50.0) { integral = -50.0; }
  throttle = max(0.0, KP * error + integral);
}
)";
}

#endif
