#include "module.h"

namespace Qel::Com {
namespace {

Module* g_current = nullptr;

}  // namespace

Module& Module::Current() {
  return *g_current;
}

void Module::MakeCurrent(Module* module) {
  g_current = module;
}

}  // namespace Qel::Com
