#include "service/server.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>

#include <array>
#include <asio.hpp>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/log.h"
#include "service/listener.h"

namespace lumeris {

namespace {

using Socket = asio::local::stream_protocol::socket;
using Strand = asio::strand<asio::io_context::executor_type>;

// A connection whose replies the client does not read is dropped rather than buffered forever.
constexpr std::size_t kMaxPendingWriteBytes = 64 * 1024 * 1024;
constexpr std::size_t kReadChunkBytes = 64 * 1024;

class AsioConnection final : public ServiceConnection,
                             public std::enable_shared_from_this<AsioConnection> {
 public:
  AsioConnection(Socket socket, Strand strand)
      : socket_(std::move(socket)), strand_(std::move(strand)) {
    asio::error_code ignored;
    socket_.non_blocking(true, ignored);
  }

  void SetEventHandler(EventHandler handler) override { handler_ = std::move(handler); }

  void Resume() override {
    asio::dispatch(strand_, [self = shared_from_this()] { self->StartRead(); });
  }

  void SendMessage(const Frame& frame) override {
    std::string bytes = EncodeFrame(frame);
    if (bytes.size() > kMaxFrameBytes) {
      // No client may accept it; the connection ends instead of the reply arriving malformed.
      Log("closing a connection: its reply is " + std::to_string(bytes.size()) +
          " bytes, over the 16 MiB one message may hold");
      asio::dispatch(strand_, [self = shared_from_this()] { self->Close(); });
      return;
    }
    asio::dispatch(strand_, [self = shared_from_this(), bytes = std::move(bytes)]() mutable {
      self->QueueWrite(std::move(bytes));
    });
  }

  // Closes the socket and releases the handler without an event. REQUIRES: the pool is stopped.
  void Abandon() {
    closed_ = true;
    asio::error_code ignored;
    socket_.close(ignored);
    handler_ = nullptr;
  }

 private:
  // Everything below runs on strand_.

  void StartRead() {
    if (closed_) return;
    socket_.async_read_some(
        asio::buffer(read_buffer_),
        asio::bind_executor(strand_, [self = shared_from_this()](const asio::error_code& error,
                                                                 std::size_t size) {
          self->OnRead(error, size);
        }));
  }

  void OnRead(const asio::error_code& error, std::size_t size) {
    if (closed_) return;
    if (error) {
      if (error == asio::error::eof) {
        if (std::optional<FrameError> problem = decoder_.Finish()) LogMalformed(*problem);
      }
      Close();
      return;
    }
    decoder_.Feed(std::string_view(read_buffer_.data(), size));
    while (std::optional<Frame> frame = decoder_.Next()) {
      Deliver(std::move(*frame));
      if (closed_) return;
    }
    if (std::optional<FrameError> problem = decoder_.error()) {
      LogMalformed(*problem);
      Close();
      return;
    }
    StartRead();
  }

  void Deliver(ConnectionEvent event) {
    if (!handler_) return;
    try {
      handler_(event);
    } catch (const std::exception& failure) {
      Log(std::string("closing a connection after a failed request: ") + failure.what());
      Close();
    }
  }

  void LogMalformed(FrameError problem) {
    Log("closing a connection that sent a malformed frame (" + std::string(FrameErrorName(problem)) +
        ")");
  }

  void QueueWrite(std::string bytes) {
    if (closed_) return;
    if (!writing_) {
      // Most replies fit into the socket buffer at once: try without a round through the reactor.
      asio::error_code error;
      std::size_t written = socket_.write_some(asio::buffer(bytes), error);
      if (error && error != asio::error::would_block && error != asio::error::try_again) {
        Close();
        return;
      }
      if (written == bytes.size()) return;
      bytes.erase(0, written);
    }
    pending_ += bytes;
    if (pending_.size() > kMaxPendingWriteBytes) {
      Log("closing a connection that does not read its replies");
      Close();
      return;
    }
    if (!writing_) StartWrite();
  }

  void StartWrite() {
    writing_ = true;
    in_flight_.swap(pending_);
    pending_.clear();
    asio::async_write(
        socket_, asio::buffer(in_flight_),
        asio::bind_executor(strand_, [self = shared_from_this()](const asio::error_code& error,
                                                                 std::size_t) {
          self->in_flight_.clear();
          self->writing_ = false;
          if (error) {
            self->Close();
          } else if (!self->pending_.empty()) {
            self->StartWrite();
          }
        }));
  }

  // Closes the socket, then delivers ConnectionClosed and releases the handler from a task of its
  // own, so a handler is never destroyed while it runs.
  void Close() {
    if (closed_) return;
    closed_ = true;
    asio::error_code ignored;
    socket_.shutdown(Socket::shutdown_both, ignored);
    socket_.close(ignored);
    asio::post(strand_, [self = shared_from_this()] {
      EventHandler handler = std::move(self->handler_);
      self->handler_ = nullptr;
      if (handler) handler(ConnectionClosed{});
    });
  }

  Socket socket_;
  Strand strand_;
  EventHandler handler_;
  FrameDecoder decoder_;
  std::array<char, kReadChunkBytes> read_buffer_{};
  std::string pending_;    // bytes waiting for the write in progress
  std::string in_flight_;  // bytes of the write in progress
  bool writing_ = false;
  bool closed_ = false;
};

}  // namespace

class ServiceServer::Impl {
 public:
  Impl(int listening_fd, ConnectionHandler handler, std::size_t threads)
      : handler_(std::move(handler)),
        thread_count_(threads != 0 ? threads
                                   : std::max<std::size_t>(4, std::thread::hardware_concurrency())),
        acceptor_(io_) {
    fcntl(listening_fd, F_SETFD, FD_CLOEXEC);
    asio::error_code error;
    acceptor_.assign(asio::local::stream_protocol(), listening_fd, error);
    if (error) {
      Log("cannot use the listening socket: " + error.message());
      close(listening_fd);
    }
  }

  void Start() {
    if (!threads_.empty()) return;
    work_.emplace(io_.get_executor());
    Accept();
    for (std::size_t i = 0; i < thread_count_; ++i) threads_.emplace_back([this] { io_.run(); });
  }

  void Stop() {
    if (threads_.empty()) return;
    work_.reset();
    io_.stop();
    for (std::thread& thread : threads_) thread.join();
    threads_.clear();
    // No thread runs handlers now: close everything from here.
    asio::error_code ignored;
    acceptor_.close(ignored);
    std::vector<std::weak_ptr<AsioConnection>> connections;
    {
      std::lock_guard<std::mutex> hold(connections_mutex_);
      connections.swap(connections_);
    }
    for (const std::weak_ptr<AsioConnection>& weak : connections) {
      if (std::shared_ptr<AsioConnection> connection = weak.lock()) connection->Abandon();
    }
    // Run the aborted operations, which hold the last references to the connections. An accept
    // that completed meanwhile finds the acceptor closed and drops its socket.
    io_.restart();
    io_.poll();
  }

 private:
  void Accept() {
    acceptor_.async_accept([this](const asio::error_code& error, Socket socket) {
      if (error == asio::error::operation_aborted || !acceptor_.is_open()) return;
      if (!error) Admit(std::move(socket));
      Accept();
    });
  }

  // Checks the peer's uid before reading anything, then hands the connection to the handler.
  void Admit(Socket socket) {
    ucred peer{};
    socklen_t size = sizeof peer;
    if (getsockopt(socket.native_handle(), SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0 ||
        peer.uid != geteuid()) {
      Log("refused a connection from uid " + std::to_string(peer.uid));
      asio::error_code ignored;
      socket.close(ignored);
      return;
    }
    auto connection = std::make_shared<AsioConnection>(std::move(socket), asio::make_strand(io_));
    {
      std::lock_guard<std::mutex> hold(connections_mutex_);
      // Forget connections that have ended, so the list stays as long as the live ones.
      std::erase_if(connections_, [](const std::weak_ptr<AsioConnection>& weak) {
        return weak.expired();
      });
      connections_.push_back(connection);
    }
    handler_(connection);
  }

  const ConnectionHandler handler_;
  const std::size_t thread_count_;
  asio::io_context io_;
  asio::local::stream_protocol::acceptor acceptor_;
  std::optional<asio::executor_work_guard<asio::io_context::executor_type>> work_;
  std::vector<std::thread> threads_;

  std::mutex connections_mutex_;  // guards connections_
  std::vector<std::weak_ptr<AsioConnection>> connections_;
};

ServiceServer::ServiceServer(int listening_fd, ConnectionHandler handler, std::size_t threads)
    : impl_(std::make_unique<Impl>(listening_fd, std::move(handler), threads)) {}

ServiceServer::~ServiceServer() { impl_->Stop(); }

void ServiceServer::Start() { impl_->Start(); }

void ServiceServer::Stop() { impl_->Stop(); }

namespace {

// A program that starts the service and waits for it (the client library's on-demand start)
// passes the write end of a pipe as LUMERIS_START_REPORT_FD: the service writes why it cannot
// listen to it, or closes it once it listens. -1 when there is none.
int TakeStartReportFd() {
  const char* text = getenv("LUMERIS_START_REPORT_FD");
  int fd = -1;
  if (text != nullptr && *text >= '0' && *text <= '9') fd = atoi(text);
  unsetenv("LUMERIS_START_REPORT_FD");
  if (fd >= 0 && fcntl(fd, F_SETFD, FD_CLOEXEC) != 0) fd = -1;
  return fd;
}

}  // namespace

int ServiceMain(const ConnectionHandler& handler) {
  const int start_report = TakeStartReportFd();
  // Replies to a peer that has gone must not kill the process.
  signal(SIGPIPE, SIG_IGN);
  // The pool's threads inherit this mask, so the two signals reach only sigwait() below.
  sigset_t stop_signals;
  sigemptyset(&stop_signals);
  sigaddset(&stop_signals, SIGTERM);
  sigaddset(&stop_signals, SIGINT);
  pthread_sigmask(SIG_BLOCK, &stop_signals, nullptr);

  std::string why;
  std::optional<ServiceListener> listener = OpenServiceListener(&why);
  if (!listener) {
    Log("cannot listen: " + why);
    if (start_report >= 0) {
      const std::string reason = "cannot listen: " + why;
      ssize_t ignored = write(start_report, reason.data(), reason.size());
      (void)ignored;
      close(start_report);
    }
    return 1;
  }
  if (start_report >= 0) close(start_report);
  {
    ServiceServer server(listener->fd, handler);
    server.Start();
    int received = 0;
    while (sigwait(&stop_signals, &received) != 0) {
    }
    server.Stop();
  }
  if (listener->bound_path) unlink(listener->bound_path->c_str());
  return 0;
}

}  // namespace lumeris
