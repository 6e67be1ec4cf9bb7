#include "platform/linux/stackshot/stack_reader.h"

#include <cxxabi.h>
#include <elfutils/libdwfl.h>
#include <fcntl.h>
#include <sys/stat.h>

#include <cstdlib>
#include <cstring>
#include <system_error>

#include "platform/linux/files/descriptor.h"

namespace zal::stackshot {
namespace {

/// The file as the process itself sees it, which may live in a container. Never one that could make us
/// wait for whoever is at its other end.
int openInside(StackReader::Module& module, const char* path) {
  Descriptor file(::open((*module.root + path).c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
  struct stat status {};
  if (!file.isOpen() || ::fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode)) return -1;
  module.place = {.device = status.st_dev, .file = status.st_ino};
  return file.release();
}

int findModule(Dwfl_Module* module, void** userData, const char* name, Dwarf_Addr base, char** fileName,
               Elf** elf) {
  if (name[0] == '/' && *userData != nullptr) {
    const int file = openInside(*static_cast<StackReader::Module*>(*userData), name);
    if (file >= 0) {
      *fileName = ::strdup(name);
      return file;
    }
  }
  return ::dwfl_linux_proc_find_elf(module, userData, name, base, fileName, elf);
}

const Dwfl_Callbacks kCallbacks = {.find_elf = findModule,
                                   .find_debuginfo = ::dwfl_standard_find_debuginfo,
                                   .section_address = nullptr,
                                   .debuginfo_path = nullptr};

int openModule(Dwfl_Module* module, void** userData, const char* /*name*/, Dwarf_Addr /*base*/,
               void* reader) {
  *userData = static_cast<StackReader*>(reader)->addModule();
  GElf_Addr bias = 0;
  ::dwfl_module_getelf(module, &bias);
  return DWARF_CB_OK;
}

std::string lastLibraryError() {
  const char* const text = ::dwfl_errmsg(-1);
  return text == nullptr ? "unknown error" : text;
}

std::string readable(const char* symbol) {
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> name(abi::__cxa_demangle(symbol, nullptr, nullptr, &status),
                                                    std::free);
  return status == 0 && name ? name.get() : symbol;
}

Symbol lookUp(Dwfl_Module* module, Dwarf_Addr address) {
  GElf_Off offset = 0;
  GElf_Sym symbol{};
  const char* const function =
      ::dwfl_module_addrinfo(module, address, &offset, &symbol, nullptr, nullptr, nullptr);
  if (function == nullptr) return {};
  return {readable(function), offset};
}

struct Walk {
  StackReader::Frames found;
  std::size_t most = 0;
  std::chrono::steady_clock::time_point end;
};

int takeFrame(Dwfl_Frame* state, void* argument) {
  Walk& walk = *static_cast<Walk*>(argument);
  Dwarf_Addr address = 0;
  bool isActivation = false;
  if (!::dwfl_frame_pc(state, &address, &isActivation)) {
    walk.found.trouble = lastLibraryError();
    return DWARF_CB_ABORT;
  }
  if (walk.found.frames.size() == walk.most) {
    walk.found.trouble = "more frames";
    return DWARF_CB_ABORT;
  }
  if (std::chrono::steady_clock::now() > walk.end) {
    walk.found.trouble = "time limit";
    return DWARF_CB_ABORT;
  }
  Frame frame;
  frame.address = address;
  frame.isCall = !isActivation;
  walk.found.frames.push_back(frame);
  return DWARF_CB_OK;
}

}  // namespace

StackReader::StackReader(pid_t process, pid_t thread, SymbolCache& symbols)
    : _symbols(symbols),
      _root("/proc/" + std::to_string(process) + "/root"),
      _dwfl(::dwfl_begin(&kCallbacks), ::dwfl_end) {
  if (!_dwfl) {
    _trouble = lastLibraryError();
    return;
  }
  // Of the thread: the first one may have ended, and its maps with it.
  int error = ::dwfl_linux_proc_report(_dwfl.get(), thread);
  if (error == 0) error = ::dwfl_report_end(_dwfl.get(), nullptr, nullptr);
  // "True": who is asked for is held by us, the library shall attach to nobody.
  if (error == 0) error = ::dwfl_linux_proc_attach(_dwfl.get(), thread, true);
  if (error != 0) {
    _trouble = error > 0 ? std::generic_category().message(error) : lastLibraryError();
    return;
  }
  ::dwfl_getmodules(_dwfl.get(), openModule, this, 0);
}

StackReader::~StackReader() = default;

StackReader::Module* StackReader::addModule() { return &_modules.emplace_back(Module{&_root, {}}); }

StackReader::Frames StackReader::frames(pid_t thread, std::size_t most,
                                        std::chrono::steady_clock::time_point end) {
  Walk walk{{}, most, end};
  const int result = ::dwfl_getthread_frames(_dwfl.get(), thread, takeFrame, &walk);
  // An outermost function without a mark of its end looks like an error too: only an empty stack is one.
  if (result < 0 && walk.found.frames.empty()) walk.found.trouble = lastLibraryError();
  return std::move(walk.found);
}

void StackReader::name(Frame& frame) {
  // A call that never returns may be the last instruction of its function.
  const Dwarf_Addr inside = frame.isCall && frame.address > 0 ? frame.address - 1 : frame.address;
  Dwfl_Module* const module = ::dwfl_addrmodule(_dwfl.get(), inside);
  if (module == nullptr) return;
  Dwarf_Addr begin = 0;
  void** userData = nullptr;
  const char* const moduleName =
      ::dwfl_module_info(module, &userData, &begin, nullptr, nullptr, nullptr, nullptr, nullptr);
  if (moduleName != nullptr) frame.module = moduleName;
  frame.offset = frame.address - begin;
  SymbolPlace place;
  if (*userData != nullptr) place = static_cast<const Module*>(*userData)->place;
  place.address = inside - begin;
  const auto known = place.file != 0 ? _symbols.find(place) : _symbols.end();
  const Symbol symbol = known != _symbols.end() ? known->second : lookUp(module, inside);
  if (place.file != 0 && known == _symbols.end()) _symbols.emplace(place, symbol);
  if (symbol.function.empty()) return;
  frame.function = symbol.function;
  frame.offset = symbol.offset + (frame.address - inside);
}

}  // namespace zal::stackshot
