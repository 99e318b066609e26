#include "tools/studio/studio_engine.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <fstream>
#include <future>

#include "tools/scene/scene_builder.h"
#include "tools/scene/scene_writer.h"
#include "tools/studio/edit_rules.h"
#include "tools/studio/inspector.h"
#include "tools/studio/live_edit.h"

namespace apestudio {
namespace {

using apescene::Json;

// The loader's message without its "<name>:<line>:<column>: " start: an edited document is
// checked as one line of text, so its line says nothing.
std::string WithoutPlace(const std::string& message, const std::string& name) {
  if (message.compare(0, name.size() + 1, name + ":") != 0) return message;
  std::size_t at = name.size() + 1;
  while (at < message.size() &&
         (std::isdigit(static_cast<unsigned char>(message[at])) != 0 || message[at] == ':'))
    ++at;
  while (at < message.size() && message[at] == ' ') ++at;
  return message.substr(at);
}

Json VectorJson(const D3DXVECTOR3& v) {
  return Json::array({v.x, v.y, v.z});
}

bool HasJsonExtension(const std::string& name) {
  return name.size() > 5 && name.compare(name.size() - 5, 5, ".json") == 0;
}

}  // namespace

StudioEngine::StudioEngine(StudioOptions options)
    : options_(std::move(options)),
      folder_(options_.Folder),
      own_loader_(options_.Loader == nullptr ? std::make_unique<PluginLoader>() : nullptr),
      loader_(options_.Loader != nullptr ? *options_.Loader : *own_loader_) {}

StudioEngine::~StudioEngine() {
  Stop();
  export_run_.reset();
  run_.reset();  // every channel goes before the loader unloads their libraries
}

bool StudioEngine::Open(std::string* error) {
  Json root;
  try {
    root = Json::parse(options_.Source.Text, nullptr, true, /*ignore_comments=*/true);
  } catch (const std::exception&) {
    root = nullptr;
  }
  // The loader's own message (with the line) for a file that does not load.
  std::unique_ptr<SceneRun> checked =
      SceneRun::Create(options_.Source, "null", loader_, clock_, &check_messages_, error);
  if (checked == nullptr) return false;
  checked.reset();
  if (const std::string limits = CheckStudioLimits(root); !limits.empty()) {
    *error = options_.Source.DisplayName + ": " + limits;
    return false;
  }
  document_ = std::make_unique<SceneDocument>(std::move(root));
  const Outcome shown = RunTo(1);
  if (!shown.Ok) *error = shown.Message;
  return shown.Ok;
}

void StudioEngine::Start() {
  // An OpenGL context is current on one thread at a time, and the run's is current on this one:
  // the run is made again on the engine's thread, and the runs end there too.
  const int frame = Frame();
  run_.reset();
  resume_frame_ = frame;
  next_frame_due_ = std::chrono::steady_clock::now();
  thread_ = std::thread([this] {
    RunTo(resume_frame_);
    for (;;) {
      std::unique_lock<std::mutex> lock(queue_mutex_);
      const bool busy = playing_ || Exporting();
      auto ready = [this] { return stopping_ || !queue_.empty(); };
      if (busy) {
        queue_changed_.wait_until(lock, next_frame_due_, ready);
      } else {
        queue_changed_.wait(lock, ready);
      }
      // Work already queued still runs, so that no caller waits for ever.
      if (stopping_ && queue_.empty()) {
        lock.unlock();
        export_run_.reset();
        export_output_.reset();
        run_.reset();
        return;
      }
      if (!queue_.empty()) {
        std::function<void()> work = std::move(queue_.front());
        queue_.pop_front();
        lock.unlock();
        work();
        continue;
      }
      lock.unlock();
      const auto now = std::chrono::steady_clock::now();
      if (now < next_frame_due_) continue;
      Tick();
      // Real time at the scene's rate; a late frame does not make the next ones hurry.
      const double fps = run_ != nullptr ? run_->Settings().Fps : 1000.0;
      const auto period = std::chrono::duration_cast<std::chrono::steady_clock::duration>(
          std::chrono::duration<double>(Exporting() ? 0.0 : 1.0 / fps));
      next_frame_due_ = std::max(next_frame_due_ + period, now);
    }
  });
}

void StudioEngine::Stop() {
  {
    std::lock_guard<std::mutex> lock(queue_mutex_);
    stopping_ = true;
  }
  queue_changed_.notify_all();
  if (thread_.joinable()) thread_.join();
  frame_published_.notify_all();
}

void StudioEngine::Call(const std::function<void()>& work) {
  if (!thread_.joinable()) {
    work();
    return;
  }
  std::promise<void> done;
  std::future<void> finished = done.get_future();
  {
    std::lock_guard<std::mutex> lock(queue_mutex_);
    if (stopping_) throw std::runtime_error("the studio is closing");
    queue_.push_back([&work, &done] {
      try {
        work();
        done.set_value();
      } catch (...) {
        done.set_exception(std::current_exception());
      }
    });
  }
  queue_changed_.notify_all();
  finished.get();
}

bool StudioEngine::WaitFrame(std::uint64_t after, std::chrono::milliseconds timeout,
                             PublishedFrame* frame) {
  std::unique_lock<std::mutex> lock(frame_mutex_);
  if (!frame_published_.wait_for(lock, timeout, [&] { return latest_.Serial > after; }))
    return false;
  *frame = latest_;
  return true;
}

int StudioEngine::Frame() const {
  return run_ != nullptr ? run_->Frame() : resume_frame_;
}

apescene::SceneSource StudioEngine::SourceOf(const Json& root) const {
  return {root.dump(), options_.Source.DisplayName, folder_.Path().string()};
}

Outcome StudioEngine::CheckLoads(const Json& root, std::unique_ptr<SceneRun>* checked) {
  if (const std::string limits = CheckStudioLimits(root); !limits.empty())
    return Outcome::Refused(limits);
  std::string error;
  const apescene::SceneSource source = SourceOf(root);
  *checked = SceneRun::Create(source, "null", loader_, clock_, &check_messages_, &error);
  if (*checked == nullptr) return Outcome::Refused(WithoutPlace(error, source.DisplayName));
  return {};
}

Outcome StudioEngine::Edit(const Json& path, const Json& value) {
  if (Exporting()) return Outcome::Refused("an export is running; edits wait until it is done");
  if (const std::string problem = CheckEditValue(path, value); !problem.empty())
    return Outcome::Refused(problem);
  Json next;
  std::string error;
  if (!document_->WithEdit(path, value, &next, &error)) return Outcome::Refused(error);
  std::unique_ptr<SceneRun> checked;
  if (const Outcome loads = CheckLoads(next, &checked); !loads.Ok) return loads;
  const Json before = document_->Root();
  document_->Commit(std::move(next));
  return Show(before, *checked);
}

Outcome StudioEngine::Undo() {
  if (Exporting()) return Outcome::Refused("an export is running");
  const Json before = document_->Root();
  if (!document_->Undo()) return Outcome::Refused("nothing to undo");
  std::unique_ptr<SceneRun> checked;
  const Outcome loads = CheckLoads(document_->Root(), &checked);
  if (!loads.Ok) {
    document_->Redo();
    return loads;
  }
  return Show(before, *checked);
}

Outcome StudioEngine::Redo() {
  if (Exporting()) return Outcome::Refused("an export is running");
  const Json before = document_->Root();
  if (!document_->Redo()) return Outcome::Refused("nothing to redo");
  std::unique_ptr<SceneRun> checked;
  const Outcome loads = CheckLoads(document_->Root(), &checked);
  if (!loads.Ok) {
    document_->Undo();
    return loads;
  }
  return Show(before, *checked);
}

Outcome StudioEngine::Show(const Json& before, SceneRun& checked) {
  ++revision_;
  LinkPlace place;
  if (playing_ && run_ != nullptr && FindLiveEditableChange(before, document_->Root(), &place) &&
      CopyLinkValue(checked.GetScene(), run_->GetScene(), place)) {
    changed_while_running_ = true;
    return {};
  }
  return RunTo(Frame());
}

Outcome StudioEngine::RunTo(int frame) {
  run_.reset();
  std::string error;
  run_ = SceneRun::Create(SourceOf(document_->Root()), options_.DeviceKind, loader_, clock_,
                          &messages_, &error);
  if (run_ == nullptr) {
    last_error_ = error;
    return Outcome::Refused(error);
  }
  if (view_) run_->SetView(view_->first, view_->second);
  changed_while_running_ = false;
  run_->Prime();
  const int target = std::clamp(frame, 1, run_->Settings().FrameCount());
  while (run_->Frame() < target - 1) run_->RenderNext(false);
  RenderAndPublish();
  return {};
}

void StudioEngine::RenderAndPublish() {
  Publish(run_->RenderNext());
}

void StudioEngine::Publish(const aperender::FrameResult& result) {
  PublishedFrame frame;
  std::string error;
  if (result.HasPicture) {
    jpeg_.Encode(result.Picture, kJpegQuality, &frame.Jpeg, &error);
  } else {
    // The reference device draws nothing: a blank picture of the scene's size stands in.
    apescene::Image blank;
    blank.Width = run_->Settings().Width;
    blank.Height = run_->Settings().Height;
    blank.Argb.assign(static_cast<std::size_t>(blank.Width) * blank.Height,
                      run_->Settings().Background);
    jpeg_.Encode(blank, kJpegQuality, &frame.Jpeg, &error);
  }
  Json channel_ms = Json::array();
  for (const double ms : result.ChannelMsEach)
    channel_ms.push_back(std::round(ms * 1000.0) / 1000.0);
  const Json stats = {{"frame", result.Frame},
                      {"frames", run_->Settings().FrameCount()},
                      {"seconds", result.Seconds},
                      {"live", result.Particles.Live},
                      {"births", result.Particles.Births},
                      {"attached", result.Particles.Attached},
                      {"sliding", result.Particles.Sliding},
                      {"channelMs", channel_ms},
                      {"messages", messages_.Total()}};
  frame.Stats = stats.dump();
  {
    std::lock_guard<std::mutex> lock(frame_mutex_);
    frame.Serial = latest_.Serial + 1;
    latest_ = std::move(frame);
  }
  frame_published_.notify_all();
}

Outcome StudioEngine::Step() {
  if (Exporting() || run_ == nullptr) return Outcome::Refused("an export is running");
  playing_ = false;
  if (run_->Frame() >= run_->Settings().FrameCount()) return RunTo(1);
  RenderAndPublish();
  return {};
}

Outcome StudioEngine::Restart() {
  if (Exporting()) return Outcome::Refused("an export is running");
  return RunTo(1);
}

Outcome StudioEngine::Seek(int frame) {
  if (Exporting() || run_ == nullptr) return Outcome::Refused("an export is running");
  const int target = std::clamp(frame, 1, run_->Settings().FrameCount());
  if (target <= run_->Frame() || changed_while_running_) return RunTo(target);
  while (run_->Frame() < target - 1) run_->RenderNext(false);
  RenderAndPublish();
  return {};
}

Outcome StudioEngine::SetView(const D3DXVECTOR3& eye, const D3DXVECTOR3& target) {
  if (Exporting()) return Outcome::Refused("an export is running");
  view_ = std::make_pair(eye, target);
  if (playing_ && run_ != nullptr) {
    run_->SetView(eye, target);
    changed_while_running_ = true;
    return {};
  }
  return RunTo(Frame());
}

Outcome StudioEngine::ResetView() {
  if (Exporting()) return Outcome::Refused("an export is running");
  view_.reset();
  return RunTo(Frame());
}

Outcome StudioEngine::Save(const std::string& name) {
  const std::string file = name.empty() ? options_.SaveName : name;
  if (!HasJsonExtension(file)) return Outcome::Refused("a scene file's name ends in .json");
  std::string error;
  const std::filesystem::path path = folder_.Resolve(file, &error);
  if (path.empty()) return Outcome::Refused(error);
  std::string text;
  try {
    text = apescene::WriteSceneText(document_->Root());
  } catch (const std::exception& e) {
    return Outcome::Refused(std::string("the scene cannot be written: ") + e.what());
  }
  // Written beside and renamed over, so a failed write never leaves half a scene.
  const std::filesystem::path partial = path.string() + ".partial";
  {
    std::ofstream out(partial, std::ios::binary | std::ios::trunc);
    out << text;
    out.close();
    if (!out) {
      std::error_code ignored;
      std::filesystem::remove(partial, ignored);
      return Outcome::Refused("cannot write " + file);
    }
  }
  std::error_code ec;
  std::filesystem::rename(partial, path, ec);
  if (ec) {
    std::error_code ignored;
    std::filesystem::remove(partial, ignored);
    return Outcome::Refused("cannot write " + file + ": " + ec.message());
  }
  options_.SaveName = file;
  return {};
}

Outcome StudioEngine::OpenFile(const std::string& name) {
  if (Exporting()) return Outcome::Refused("an export is running");
  if (!HasJsonExtension(name)) return Outcome::Refused("a scene file's name ends in .json");
  std::string error;
  const std::filesystem::path path = folder_.Resolve(name, &error);
  if (path.empty()) return Outcome::Refused(error);
  apescene::SceneSource source;
  if (!apescene::ReadSceneFile(path.string(), &source, &error))
    return Outcome::Refused(name + ": cannot be read");
  source.DisplayName = name;
  std::unique_ptr<SceneRun> checked =
      SceneRun::Create(source, "null", loader_, clock_, &check_messages_, &error);
  if (checked == nullptr) return Outcome::Refused(error);
  checked.reset();
  Json root;
  try {
    root = Json::parse(source.Text, nullptr, true, /*ignore_comments=*/true);
  } catch (const std::exception& e) {
    return Outcome::Refused(e.what());
  }
  if (const std::string limits = CheckStudioLimits(root); !limits.empty())
    return Outcome::Refused(limits);
  document_ = std::make_unique<SceneDocument>(std::move(root));
  options_.Source.DisplayName = name;
  options_.SaveName = name;
  ++revision_;
  return RunTo(1);
}

Outcome StudioEngine::StartExport(const std::string& folder) {
  if (Exporting()) return Outcome::Refused("an export is running already");
  std::string error;
  const std::filesystem::path path = folder_.Resolve(folder, &error);
  if (path.empty()) return Outcome::Refused(error);
  std::error_code ec;
  if (std::filesystem::exists(path, ec) && !std::filesystem::is_directory(path, ec))
    return Outcome::Refused(folder + " exists and is not a folder");
  // The live run goes first: rand and the clock serve one run at a time.
  resume_frame_ = Frame();
  run_.reset();
  export_run_ = SceneRun::Create(SourceOf(document_->Root()), options_.DeviceKind, loader_, clock_,
                                 &messages_, &error);
  if (export_run_ == nullptr) {
    RunTo(resume_frame_);
    return Outcome::Refused(error);
  }
  export_output_ = std::make_unique<aperender::RenderOutput>();
  export_frames_ = export_run_->Settings().FrameCount();
  if (!export_output_->Open(path.string(), export_frames_, export_run_->Settings().Fps,
                            options_.DeviceKind == "gl", &error)) {
    export_run_.reset();
    export_output_.reset();
    RunTo(resume_frame_);
    return Outcome::Refused(error);
  }
  export_run_->Prime();
  export_done_ = 0;
  export_folder_ = folder;
  export_error_.clear();
  export_finished_ = false;
  return {};
}

void StudioEngine::TickExport() {
  std::string error;
  bool ok = export_output_->AddFrame(export_run_->RenderNext(), &error);
  if (ok) ++export_done_;
  if (ok && export_done_ < export_frames_) return;
  if (ok) ok = export_output_->Finish(&error);
  export_error_ = ok ? "" : error;
  export_finished_ = true;
  export_run_.reset();
  export_output_.reset();
  RunTo(resume_frame_);
}

Json StudioEngine::ExportProgress() const {
  return {{"running", Exporting()},  {"finished", export_finished_}, {"done", export_done_},
          {"total", export_frames_}, {"folder", export_folder_},     {"error", export_error_}};
}

void StudioEngine::Tick() {
  if (Exporting()) return TickExport();
  if (!playing_ || run_ == nullptr) return;
  if (run_->Frame() >= run_->Settings().FrameCount()) {
    RunTo(1);
    return;
  }
  RenderAndPublish();
}

Json StudioEngine::State() const {
  Json state = {{"scene", options_.Source.DisplayName},
                {"saveName", options_.SaveName},
                {"device", options_.DeviceKind},
                {"frame", Frame()},
                {"playing", playing_},
                {"revision", revision_},
                {"undo", document_->UndoDepth()},
                {"redo", document_->RedoDepth()},
                {"exporting", Exporting()},
                {"error", last_error_}};
  Json messages = Json::array();
  for (const MessageLog::Entry& entry : messages_.Entries())
    messages.push_back({{"text", entry.Text}, {"count", entry.Count}});
  state["messages"] = messages;
  state["messageTotal"] = messages_.Total();
  if (run_ != nullptr) {
    apescene::Scene& scene = run_->GetScene();
    const apescene::RenderSettings& settings = run_->Settings();
    state["frames"] = settings.FrameCount();
    state["fps"] = settings.Fps;
    state["width"] = settings.Width;
    state["height"] = settings.Height;
    Json names = Json::array();
    for (const auto& channel : scene.Channels) {
      std::string name;
      for (const apescene::Scene::NamedChannel& named : scene.Named)
        if (named.Channel == channel.get()) name = named.Name;
      names.push_back(name);
    }
    state["channelNames"] = names;
    Json warnings = Json::array();
    for (const apescene::SceneWarning& warning : scene.Warnings)
      warnings.push_back((warning.Path.IsRoot() ? "" : warning.Path.Text() + ": ") +
                         warning.Message);
    state["warnings"] = warnings;
    state["background"] = settings.Background & 0xFFFFFFu;
    state["view"] = {{"eye", VectorJson(scene.View.Eye.Sample(0.0))},
                     {"target", VectorJson(scene.View.Target.Sample(0.0))}};
  }
  return state;
}

Json StudioEngine::Inspector() const {
  if (run_ == nullptr) return {{"channels", Json::array()}};
  return DescribeChannels(run_->GetScene(), document_->Root());
}

}  // namespace apestudio
