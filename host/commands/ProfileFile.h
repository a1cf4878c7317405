// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <vector>

// One section of a profiles file: what a command line would say, under a name.
struct Profile {
  std::string name;
  std::string file;
  std::vector<std::pair<std::string, std::string>> values;  // keys as they are written there
};

// The files that are read, the one that counts first: loka/config.toml in $XDG_CONFIG_HOME (else
// ~/.config; XDG Base Directory Specification, a relative path is ignored as it asks), then
// /etc/loka/config.toml. Start of the program.
std::vector<std::string> ProfileFiles();

// Reads the sections of all files. A file that is not there has none; a section of an earlier file
// stands for the whole section of that name in a later one. Whether the keys mean something is not
// looked at. False, with file, section and key in `error`, for what is no profiles file. Any
// thread.
bool ReadProfiles(const std::vector<std::string>& files, std::vector<Profile>* profiles,
                  std::string* error);

// Null when there is none of that name.
const Profile* FindProfile(const std::vector<Profile>& profiles, const std::string& name);

// "gate, scale", or what to do when there are none.
std::string ProfileNames(const std::vector<Profile>& profiles);
