// The host object every channel reaches: the frame counter, the channel registry and the two
// debug-message functors.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "platform/windows_types.h"

class Qen_Channel;

// Shows one line of text. Prints to stderr unless a sink is installed.
class ShowDebugMessage {
 public:
  using Sink = std::function<void(const char* text)>;
  void operator()(const char* text) const;
  void SetSink(Sink sink) { sink_ = std::move(sink); }

 private:
  Sink sink_;
};

class Qen_HostContext {
 public:
  Qen_HostContext();
  ~Qen_HostContext();
  Qen_HostContext(const Qen_HostContext&) = delete;
  Qen_HostContext& operator=(const Qen_HostContext&) = delete;

  // The context new channels take. A process-wide default exists from the start; a test makes
  // its own current with ScopedCurrent.
  static Qen_HostContext* Current();
  static void SetCurrent(Qen_HostContext* context);
  class ScopedCurrent {
   public:
    explicit ScopedCurrent(Qen_HostContext* context);
    ~ScopedCurrent();
    ScopedCurrent(const ScopedCurrent&) = delete;
    ScopedCurrent& operator=(const ScopedCurrent&) = delete;

   private:
    Qen_HostContext* previous_;
  };

  std::uint32_t GetFrameCounter() const { return FrameCounter; }
  void AdvanceFrame() { ++FrameCounter; }

  // The option-th channel (from 0) of this type that the context knows, or null. Channels are
  // known from construction to destruction.
  Qen_Channel* GetChannelByType(GUID type, int option);
  void RegisterChannel(Qen_Channel* channel);
  // Forgets the channel and unlinks it from every channel that links it.
  void UnregisterChannel(Qen_Channel* channel);
  const std::vector<Qen_Channel*>& Channels() const { return channels_; }

  ShowDebugMessage OverloadMessages;
  ShowDebugMessage DebugMessages;

 private:
  std::uint32_t FrameCounter = 1;
  std::vector<Qen_Channel*> channels_;
};
