// SPDX-License-Identifier: MIT
#include <Varnel/Interface/SoundEngine.h>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel {

SoundEngine::SoundEngine() : SoundEngine(Platform::processPorts()) {}

SoundEngine::SoundEngine(const Platform::Ports& ports)
    : SoundEngine({.player = ports.soundPlayer, .path = [](Sound sound) { return sound.path(); }}) {
}

SoundEngine::SoundEngine(Ports ports)
    // Sounds share this reference, and do not keep the engine alive.
    : ports_(std::move(ports)), delegate_(std::make_shared<char>(), this) {}

SoundEngine::~SoundEngine() {
  stop();
}

void SoundEngine::play(Sound sound) {
  if (!soundsEnabled_) return;
  stop();
  const auto path = ports_.path(sound);
  if (!path) return;
  // A file that cannot be read counts as empty, and an empty file is no sound.
  const auto loaded = ports_.player.load(Platform::readFile(*path).valueOr(""));
  if (!loaded) return;
  loaded->setDelegate(delegate_);
  loaded->play();
  currentSound_ = loaded;
}

void SoundEngine::stop() {
  if (!currentSound_) return;
  if (currentSound_->isPlaying()) currentSound_->stop();
  currentSound_.reset();
}

void SoundEngine::sound(Platform::PlayableSound&, bool) {
  stop();
}

}  // namespace Varnel
