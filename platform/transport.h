// Stream transports for beaming. The OBEX layer only ever sees these
// interfaces, so another way of reaching peers (TCP today, Bluetooth RFCOMM
// perhaps later) is one more implementation, not a change to the protocol
// code. Error numbers are errno values throughout.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace cx {

// One connected byte stream. A connection is used by one thread at a time.
class StreamConnection {
 public:
  virtual ~StreamConnection() = default;

  // Sends the bytes; returns how many went out (all of them unless the
  // stream failed part-way) or -1, with error() set.
  virtual long Send(const uint8_t* data, size_t size) = 0;

  // Waits at most `timeoutMs` for data and returns 1..size bytes, 0 when the
  // peer has closed its side, or -1 (error() is ETIMEDOUT after a time-out).
  virtual long Receive(uint8_t* data, size_t size, int timeoutMs) = 0;

  // Shuts both directions down and releases the stream. Idempotent.
  virtual void Close() = 0;

  // Bounds every later Send: one that cannot hand over all its bytes within
  // `timeoutMs` (a peer that stopped reading) fails with ETIMEDOUT. A
  // negative value waits without limit, as a new connection does.
  virtual void SetSendTimeout(int timeoutMs) { (void)timeoutMs; }

  // Wakes a Send or Receive blocked in another thread, which then fails;
  // the stream stays allocated until Close. Safe to call from any thread
  // while the connection exists.
  virtual void Interrupt() {}

  virtual int error() const = 0;
  // Who is at the other end, for messages ("127.0.0.1:650").
  virtual std::string peer() const = 0;
};

class StreamListener {
 public:
  virtual ~StreamListener() = default;

  // Waits at most `timeoutMs` for a peer. Nothing on time-out (error set to
  // ETIMEDOUT) or failure.
  virtual std::unique_ptr<StreamConnection> Accept(int timeoutMs, int& error) = 0;

  // The address actually listened on (a port 0 request shows the real port).
  virtual std::string address() const = 0;
};

class StreamTransport {
 public:
  virtual ~StreamTransport() = default;

  // Readies the transport for a device search; 0 or an error number.
  virtual int Open() = 0;

  // One look for peers in range. `devices` receives their ids (possibly
  // none); returns 0 or an error number when looking itself failed.
  virtual int FindDevices(std::vector<std::string>& devices) = 0;

  // Connects to a device found by FindDevices. Nothing on failure, with
  // `error` set (ECONNABORTED asks the caller to search again).
  virtual std::unique_ptr<StreamConnection> Connect(const std::string& device, int& error) = 0;

  // Starts accepting peers at `address` (its form belongs to the transport).
  virtual std::unique_ptr<StreamListener> Listen(const std::string& address, int& error) = 0;
};

}  // namespace cx
