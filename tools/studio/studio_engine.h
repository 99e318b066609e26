// The studio's running effect: the scene document and its history, the current run, playback,
// the viewport's view, saving and exporting. All of it lives on one thread (the engine's, once
// Start is called; the caller's before), because the device and the emitter's time and random
// numbers are per process; other threads reach it through Call and take pictures through
// WaitFrame.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>

#include "host/plugin_loader.h"
#include "platform/windows_types.h"
#include "tools/render/render_output.h"
#include "tools/scene/scene_loader.h"
#include "tools/studio/jpeg_encoder.h"
#include "tools/studio/message_log.h"
#include "tools/studio/scene_document.h"
#include "tools/studio/scene_folder.h"
#include "tools/studio/scene_run.h"

namespace apestudio {

struct StudioOptions {
  apescene::SceneSource Source;  // the scene opened first
  std::string Folder;            // the folder files are read from and written to
  std::string SaveName;          // the file Save writes when given no name
  std::string DeviceKind = "gl";
  // The plug-ins' loader, kept by the caller (e.g. one for a whole fuzzing process); null: the
  // engine makes its own.
  PluginLoader* Loader = nullptr;
};

// A frame as the stream sends it.
struct PublishedFrame {
  std::uint64_t Serial = 0;  // grows with every frame published
  std::string Jpeg;
  std::string Stats;  // one line of JSON: frame, counts, channel times
};

// The outcome of a request that changes something: on refusal, the message and the document
// path it concerns (for the page to show beside the field).
struct Outcome {
  bool Ok = true;
  std::string Message;
  static Outcome Refused(std::string message) { return {false, std::move(message)}; }
};

class StudioEngine {
 public:
  // The stream's JPEG quality.
  static constexpr int kJpegQuality = 85;

  explicit StudioEngine(StudioOptions options);
  ~StudioEngine();
  StudioEngine(const StudioEngine&) = delete;
  StudioEngine& operator=(const StudioEngine&) = delete;

  // Parses and runs the first scene and publishes its first frame. False with *error when the
  // scene or the device fails.
  bool Open(std::string* error);
  // From now on the engine runs on its own thread, playing in real time (the current frame is
  // made again there, where the run's device will live).
  void Start();
  void Stop();

  // Runs `work` on the engine's thread (at once when it has none) and waits for it.
  void Call(const std::function<void()>& work);
  // The first frame published after `after`, waiting at most `timeout`; false when none came.
  bool WaitFrame(std::uint64_t after, std::chrono::milliseconds timeout, PublishedFrame* frame);

  // --- On the engine's thread (inside Call, or before Start) ---
  apescene::Json State() const;
  apescene::Json Inspector() const;
  const apescene::Json& Document() const { return document_->Root(); }
  Outcome Edit(const apescene::Json& path, const apescene::Json& value);
  Outcome Undo();
  Outcome Redo();
  void SetPlaying(bool playing) { playing_ = playing; }
  Outcome Step();
  Outcome Restart();
  Outcome Seek(int frame);
  Outcome SetView(const D3DXVECTOR3& eye, const D3DXVECTOR3& target);
  Outcome ResetView();
  // Writes the document to `name` inside the folder (the save name when empty).
  Outcome Save(const std::string& name);
  // Opens another scene file of the folder (history starts afresh).
  Outcome OpenFile(const std::string& name);
  Outcome StartExport(const std::string& folder);
  apescene::Json ExportProgress() const;
  // One step of the engine's own work: the next frame when playing and due, or the next frame of
  // an export. The thread calls it; without one, tests do.
  void Tick();
  int Frame() const;
  bool Playing() const { return playing_; }
  bool Exporting() const { return export_run_ != nullptr; }

 private:
  Outcome CheckLoads(const apescene::Json& root, std::unique_ptr<SceneRun>* checked);
  // Shows the document (just changed from `before`) from the current frame: the running effect
  // takes the change at once when it is one inline link value and it is playing, else the scene
  // is built afresh and re-simulated to the current frame.
  Outcome Show(const apescene::Json& before, SceneRun& checked);
  apescene::SceneSource SourceOf(const apescene::Json& root) const;
  // A new run of the document, rendered up to `frame` (at least 1) and published.
  Outcome RunTo(int frame);
  void RenderAndPublish();
  void Publish(const aperender::FrameResult& result);
  void TickExport();

  StudioOptions options_;
  SceneFolder folder_;
  std::unique_ptr<PluginLoader> own_loader_;
  PluginLoader& loader_;
  TestClock clock_;
  std::unique_ptr<SceneDocument> document_;
  std::unique_ptr<SceneRun> run_;
  MessageLog messages_;
  MessageLog check_messages_;
  JpegEncoder jpeg_;
  bool playing_ = true;
  int revision_ = 0;  // counts the document's changes, so the page knows to show it afresh
  // The run took a change while running, so it is no longer the document's replay: scrubbing
  // builds it afresh rather than going on from it.
  bool changed_while_running_ = false;
  std::optional<std::pair<D3DXVECTOR3, D3DXVECTOR3>> view_;  // eye, target
  std::chrono::steady_clock::time_point next_frame_due_;
  std::string last_error_;

  // Export: a run of its own, from frame 1; the live run waits until it is done.
  std::unique_ptr<SceneRun> export_run_;
  std::unique_ptr<aperender::RenderOutput> export_output_;
  int export_frames_ = 0;
  int export_done_ = 0;
  int resume_frame_ = 1;
  std::string export_folder_;
  std::string export_error_;
  bool export_finished_ = false;

  // Between threads.
  std::thread thread_;
  std::mutex queue_mutex_;
  std::condition_variable queue_changed_;
  std::deque<std::function<void()>> queue_;
  bool stopping_ = false;
  std::mutex frame_mutex_;
  std::condition_variable frame_published_;
  PublishedFrame latest_;
};

}  // namespace apestudio
