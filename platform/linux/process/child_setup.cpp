#include "platform/linux/process/child_setup.h"

#include <fcntl.h>
#include <signal.h>
#include <unistd.h>

namespace zal {

ChildSetup::ChildSetup() {
  ::posix_spawn_file_actions_init(&_actions);
  ::posix_spawn_file_actions_addopen(&_actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
  ::posix_spawnattr_init(&_attributes);
  sigset_t signals;
  ::sigemptyset(&signals);
  ::posix_spawnattr_setsigmask(&_attributes, &signals);
  ::sigfillset(&signals);
  ::posix_spawnattr_setsigdefault(&_attributes, &signals);
  ::posix_spawnattr_setflags(&_attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
}

ChildSetup::~ChildSetup() {
  ::posix_spawn_file_actions_destroy(&_actions);
  ::posix_spawnattr_destroy(&_attributes);
}

void ChildSetup::sendOutputTo(int descriptor) {
  ::posix_spawn_file_actions_adddup2(&_actions, descriptor, STDOUT_FILENO);
  ::posix_spawn_file_actions_adddup2(&_actions, descriptor, STDERR_FILENO);
}

void ChildSetup::sendErrorsTo(int descriptor) {
  ::posix_spawn_file_actions_adddup2(&_actions, descriptor, STDERR_FILENO);
}

void ChildSetup::putIntoOwnGroup() {
  short flags = 0;
  ::posix_spawnattr_getflags(&_attributes, &flags);
  ::posix_spawnattr_setflags(&_attributes, static_cast<short>(flags | POSIX_SPAWN_SETPGROUP));
}

int ChildSetup::start(pid_t& child, const std::string& file, std::vector<std::string> arguments,
                      char* const* environment) {
  ::posix_spawn_file_actions_addclosefrom_np(&_actions, STDERR_FILENO + 1);
  std::vector<char*> pointers;
  pointers.reserve(arguments.size() + 1);
  for (auto& argument : arguments) pointers.push_back(argument.data());
  pointers.push_back(nullptr);
  return ::posix_spawnp(&child, file.c_str(), &_actions, &_attributes, pointers.data(), environment);
}

}  // namespace zal
