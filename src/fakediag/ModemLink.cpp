// ModemLink: the bounded output queue and the trickle of a fake modem's link.
#include "fakediag/ModemLink.h"

#include <QTimer>

namespace vantorel {

ModemLink::ModemLink(QObject* parent) : QObject(parent) {
    trickleTimer_ = new QTimer(this);
    trickleTimer_->setSingleShot(true);
    connect(trickleTimer_, &QTimer::timeout, this, [this] { flush(); });
}

ModemLink::~ModemLink() = default;

bool ModemLink::write(ByteView bytes) {
    if (pending() + bytes.size() > kMaxPending) return false;
    pending_.insert(pending_.end(), bytes.begin(), bytes.end());
    flush();
    return true;
}

void ModemLink::flush() {
    bool blocked = false;
    while (!pending_.empty()) {
        const size_t taken = put(pending_.data(), trickle_ ? 1 : pending_.size());
        if (taken == 0) {
            blocked = true;
            break;
        }
        pending_.erase(pending_.begin(), pending_.begin() + static_cast<long>(taken));
        if (trickle_) break;
    }
    waitWritable(blocked);
    if (trickle_ && !pending_.empty() && !blocked) trickleTimer_->start(0);
    if (pending() == 0) emit drained();
}

}  // namespace vantorel
