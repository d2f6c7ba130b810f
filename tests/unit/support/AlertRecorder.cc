#include "support/AlertRecorder.h"

#include <mutex>
#include <stdexcept>

#include "graph/GlobalLock.h"
#include "platform/NvkCtl.h"

namespace vantor::support {

namespace {

struct Recording {
    std::mutex mutex;
    AlertBehaviour behaviour = AlertBehaviour::Record;
    std::vector<std::string> texts;
    int attempts = 0;
    bool lockHeld = false;
};

Recording& TheRecording() {
    static Recording recording;
    return recording;
}

}  // namespace

AlertRecorder::AlertRecorder(AlertBehaviour behaviour) {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    recording.behaviour = behaviour;
    recording.texts.clear();
    recording.attempts = 0;
    recording.lockHeld = false;
}

AlertRecorder::~AlertRecorder() {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    recording.behaviour = AlertBehaviour::Record;
}

std::vector<std::string> AlertRecorder::Texts() const {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    return recording.texts;
}

int AlertRecorder::Attempts() const {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    return recording.attempts;
}

bool AlertRecorder::LockHeld() const {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    return recording.lockHeld;
}

}  // namespace vantor::support

namespace NvkCtl::System {

using vantor::support::AlertBehaviour;
using vantor::support::TheRecording;

SystemInfoImpl::SystemInfoImpl() {
    auto& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    if (recording.behaviour == AlertBehaviour::ThrowOnConstruction) {
        ++recording.attempts;
        throw std::runtime_error("no system information");
    }
}

SystemInfoImpl::~SystemInfoImpl() = default;

void SystemInfoImpl::SetSystemAlert(const std::string& text) {
    auto& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    ++recording.attempts;
    recording.lockHeld = vantor::GlobalLock::HeldByCurrentThread();
    switch (recording.behaviour) {
    case AlertBehaviour::ThrowStandard:
        throw std::runtime_error("alert refused");
    case AlertBehaviour::ThrowOther:
        throw 7;
    case AlertBehaviour::ThrowOnConstruction:
    case AlertBehaviour::Record:
        recording.texts.push_back(text);
    }
}

}  // namespace NvkCtl::System
