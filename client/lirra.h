/*
 * The logging agent's client library.
 *
 * One call per kind of request. By default a call only puts the request into a bounded queue and
 * returns: it never waits for the agent, which need not be running. A thread of the library writes
 * the queue in large pieces, connects when there is something to send, and connects again after the
 * agent was restarted. A request is sent whole or dropped; what was dropped for want of room is
 * counted, and the agent's log is told the number when there is room again.
 *
 * Threads: every function may be called from any thread, on one handle at the same time too, except
 * lirra_close, which must be the last call on its handle. Requests of one thread keep their order.
 *
 * Texts are UTF-8 and end with a zero byte; the library copies what it needs before it returns. NULL
 * leaves the key out, which the agent takes as "not given".
 *
 * fork: the child must open a handle of its own. On the parent's handle every request is dropped
 * there, lirra_flush says LIRRA_UNREACHABLE, and lirra_close frees nothing of the parent's.
 *
 * No function raises a signal, changes errno on purpose, or throws.
 */
#ifndef LIRRA_H
#define LIRRA_H

#include <stddef.h>
#include <stdint.h>

#if defined(__GNUC__)
#define LIRRA_API __attribute__((visibility("default")))
#else
#define LIRRA_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/** A sender's connection to the agent. */
typedef struct lirra_handle lirra_handle;
/** Keys with values: what an action takes along, and what its reply holds. */
typedef struct lirra_dictionary lirra_dictionary;

typedef enum lirra_result {
  LIRRA_OK = 0,
  LIRRA_DROPPED = 1,     /**< no room in the queue (or no memory); counted */
  LIRRA_TOO_LARGE = 2,   /**< larger than the agent takes or than the whole queue; counted */
  LIRRA_UNREACHABLE = 3, /**< nobody answers at the agent's socket */
  LIRRA_TIMEOUT = 4,     /**< not within the given time */
  LIRRA_LOST = 5,        /**< the connection broke before the agent confirmed what was written */
  LIRRA_INVALID = 6,     /**< a NULL handle, or arguments that make no sense */
  LIRRA_ABSENT = 7       /**< a dictionary holds no such key of this type */
} lirra_result;

/** A time that means "when the call is made". */
#define LIRRA_NOW (-1.0)

/** Bits of lirra_begin_session's `begin_flags`. */
#define LIRRA_BEGIN_PING 1
#define LIRRA_BEGIN_CAPTURE_SYSTEM_LOG 2
#define LIRRA_BEGIN_INITIATOR 4

typedef struct lirra_options {
  size_t size;             /**< of this struct; set by lirra_options_init */
  const char* socket_path; /**< NULL: $LIRRA_SOCKET, else $XDG_RUNTIME_DIR/com.vendel.lirra, else
                                /run/com.vendel.lirra for the superuser */
  const char* sender;      /**< names this client in every request; NULL: none */
  size_t queue_limit;      /**< bytes that may wait; 0: 4 MiB */
  int synchronous;         /**< not 0: no thread and no queue, each request is one write in the
                                calling thread, which may wait up to five seconds for the agent */
} lirra_options;

typedef struct lirra_statistics {
  size_t size; /**< of this struct; set by the caller before the call */
  int connected;
  int64_t agent_pid; /**< 0 when not connected */
  uint64_t queued_bytes;
  uint64_t sent; /**< requests wholly written */
  uint64_t sent_bytes;
  uint64_t dropped;
  uint64_t unconfirmed; /**< written to connections that broke before a flush covered them */
  uint64_t connections;
} lirra_statistics;

/* ---- The handle ---- */

/** "0.1.0". */
LIRRA_API const char* lirra_version(void);
/** A few words on a result, for people. Never NULL; static. */
LIRRA_API const char* lirra_result_text(lirra_result result);
/** Fills in the defaults. */
LIRRA_API void lirra_options_init(lirra_options* options);
/** A new handle, or NULL when memory, threads or a place to look for the agent are missing. `options`
    may be NULL. Connects only when there is something to send. End it with lirra_close. */
LIRRA_API lirra_handle* lirra_open(const lirra_options* options);
/** Waits up to `timeout_ms` until the agent has handled what is queued (0: does not wait), then
    frees the handle whatever the result, which is lirra_flush's. NULL: LIRRA_INVALID. */
LIRRA_API lirra_result lirra_close(lirra_handle* handle, int timeout_ms);
/** Waits until the agent has handled every request accepted before, its records being in their
    files. LIRRA_UNREACHABLE at once when no agent answers; LIRRA_LOST when something that was
    written since the flush before went down with a connection. */
LIRRA_API lirra_result lirra_flush(lirra_handle* handle, int timeout_ms);
/** Fills in as much of `statistics` as its `size` has room for. */
LIRRA_API lirra_result lirra_status(lirra_handle* handle, lirra_statistics* statistics);
/** Why the last connection failed or ended, as a text of at most `size` bytes with its zero. Returned:
    the length of the whole text; 0 when there is none. */
LIRRA_API size_t lirra_trouble(lirra_handle* handle, char* buffer, size_t size);

/* ---- Sessions. LIRRA_OK: accepted for sending; else LIRRA_DROPPED, LIRRA_TOO_LARGE, LIRRA_INVALID,
   and LIRRA_UNREACHABLE on a synchronous handle. A NULL session means the default one. ---- */

LIRRA_API lirra_result lirra_begin_session(lirra_handle* handle, const char* session, int64_t begin_flags,
                                           int64_t end_flags);
LIRRA_API lirra_result lirra_end_session(lirra_handle* handle, const char* session);
/** `time` in seconds since 1970, or LIRRA_NOW. */
LIRRA_API lirra_result lirra_checkpoint(lirra_handle* handle, const char* session, const char* checkpoint,
                                        double time);
/** `log` may have several lines. A `time` below 100 is replaced by the agent's clock. */
LIRRA_API lirra_result lirra_describe(lirra_handle* handle, const char* session, const char* description,
                                      const char* log, double time);
LIRRA_API lirra_result lirra_call_info(lirra_handle* handle, const char* session, const char* category,
                                       const char* info);
LIRRA_API lirra_result lirra_call_quality(lirra_handle* handle, const char* session, const char* description,
                                          const char* log);
/** One sample of a metric; the agent prints it as the kind of number that it is. */
LIRRA_API lirra_result lirra_call_metric(lirra_handle* handle, const char* session, const char* metric,
                                         double value);
LIRRA_API lirra_result lirra_call_metric_int64(lirra_handle* handle, const char* session, const char* metric,
                                               int64_t value);
LIRRA_API lirra_result lirra_call_metric_uint64(lirra_handle* handle, const char* session, const char* metric,
                                                uint64_t value);
/** Keeps a silent session from being ended as inactive. */
LIRRA_API lirra_result lirra_pulse(lirra_handle* handle, const char* session);
LIRRA_API lirra_result lirra_session_event(lirra_handle* handle, const char* session, int64_t event);
LIRRA_API lirra_result lirra_initiator(lirra_handle* handle, const char* session, const char* initiator);
LIRRA_API lirra_result lirra_receiver(lirra_handle* handle, const char* session, const char* receiver);
LIRRA_API lirra_result lirra_failure_reason(lirra_handle* handle, const char* session, const char* reason);
/** The agent takes the file at `path` when the session ends. */
LIRRA_API lirra_result lirra_add_log_file(lirra_handle* handle, const char* session, const char* category,
                                          const char* path);

/* ---- Records of the agent's log; results as above. `time` is kept as given, 0 for none. ---- */

LIRRA_API lirra_result lirra_log(lirra_handle* handle, const char* type, const char* category, int64_t level,
                                 uint64_t time, const char* text);
LIRRA_API lirra_result lirra_event(lirra_handle* handle, const char* type, const char* category,
                                   int64_t level, uint64_t time, const char* text);

/* ---- Actions ---- */

LIRRA_API lirra_result lirra_action(lirra_handle* handle, const char* session, int64_t action);
/** `info` is copied and may be NULL, which sends the request without it. */
LIRRA_API lirra_result lirra_action_with_info(lirra_handle* handle, const char* session, int64_t action,
                                              const lirra_dictionary* info);
/** The same for an action that the agent answers; `info` may be NULL. `*ticket` then names the
    reply. At most 64 may be unanswered; one more is dropped. */
LIRRA_API lirra_result lirra_action_ask(lirra_handle* handle, const char* session, int64_t action,
                                        const lirra_dictionary* info, uint64_t* ticket);
/** Waits for the reply. LIRRA_OK: `*reply` is the caller's, to be freed with lirra_dictionary_free.
    LIRRA_TIMEOUT: it may be awaited again. LIRRA_LOST: it will never come. */
LIRRA_API lirra_result lirra_action_wait(lirra_handle* handle, uint64_t ticket, int timeout_ms,
                                         lirra_dictionary** reply);

/* ---- Dictionaries. Not for several threads at once. Setting copies and replaces. ---- */

/** NULL when memory is missing. */
LIRRA_API lirra_dictionary* lirra_dictionary_create(void);
LIRRA_API void lirra_dictionary_free(lirra_dictionary* dictionary);
LIRRA_API size_t lirra_dictionary_count(const lirra_dictionary* dictionary);
/** The key at `index` in the order of the keys' bytes; NULL behind the last. Lives until the next
    change of the dictionary. */
LIRRA_API const char* lirra_dictionary_key(const lirra_dictionary* dictionary, size_t index);

LIRRA_API lirra_result lirra_dictionary_set_string(lirra_dictionary* dictionary, const char* key,
                                                   const char* value);
LIRRA_API lirra_result lirra_dictionary_set_int64(lirra_dictionary* dictionary, const char* key,
                                                  int64_t value);
LIRRA_API lirra_result lirra_dictionary_set_uint64(lirra_dictionary* dictionary, const char* key,
                                                   uint64_t value);
LIRRA_API lirra_result lirra_dictionary_set_double(lirra_dictionary* dictionary, const char* key,
                                                   double value);
LIRRA_API lirra_result lirra_dictionary_set_bool(lirra_dictionary* dictionary, const char* key, int value);

/* Reading: LIRRA_OK, or LIRRA_ABSENT with the result left alone when the key is missing or holds
   another type. Texts and inner dictionaries live until the next change of the outer one. */
LIRRA_API lirra_result lirra_dictionary_string(const lirra_dictionary* dictionary, const char* key,
                                               const char** value);
LIRRA_API lirra_result lirra_dictionary_int64(const lirra_dictionary* dictionary, const char* key,
                                              int64_t* value);
LIRRA_API lirra_result lirra_dictionary_uint64(const lirra_dictionary* dictionary, const char* key,
                                               uint64_t* value);
LIRRA_API lirra_result lirra_dictionary_double(const lirra_dictionary* dictionary, const char* key,
                                               double* value);
LIRRA_API lirra_result lirra_dictionary_bool(const lirra_dictionary* dictionary, const char* key, int* value);
LIRRA_API lirra_result lirra_dictionary_dictionary(const lirra_dictionary* dictionary, const char* key,
                                                   const lirra_dictionary** value);

#ifdef __cplusplus
}
#endif

#endif
