// SPDX-License-Identifier: MIT
// AnalyticsServer CERTIFICATE [secure] BEHAVIOUR…: a web server on a free port of the loopback
// interface, with https where it is "secure". It answers the n-th request with the n-th behaviour,
// and all further ones with the last:
//   a number (200, 503, …)   with this status
//   503/SECONDS              the same, asking for a pause
//   302>PLACE                the same, naming a place to go to
//   hang                     never
//   cut                      by closing the connection once it has all of the request
//   garbage                  with bytes that are no HTTP
//   endless                  200, and content without end
//   short                    200, and less content than it tells
//   stuck                    200, a beginning of content, and nothing more
//   tunnel                   as a proxy that leads every tunnel back to this server, with https
//   blind tunnel             as one that leads it nowhere
// It prints its port in one line, and for each request "BYTES BEHAVIOUR" in one line and the body.
#include <libsoup/soup.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

namespace {

constexpr std::string_view tunnelMade = "HTTP/1.1 200 OK\r\n\r\n";
constexpr std::string_view begunAnswer = "HTTP/1.1 200 OK\r\nContent-Length: 9\r\n\r\nabc";

struct Script {
  GTlsCertificate* certificate;
  std::vector<std::string> behaviours;
  std::size_t next = 0;

  const std::string& advance() {
    const std::string& behaviour = behaviours[next];
    if (next + 1 < behaviours.size()) ++next;
    return behaviour;
  }
};

// The connection, for whoever knows better than the library how to go on.
GIOStream* takeConnection(SoupServerMessage* message, std::string_view words) {
  GIOStream* stream = soup_server_message_steal_connection(message);
  GOutputStream* out = g_io_stream_get_output_stream(stream);
  g_output_stream_write_all(out, words.data(), words.size(), nullptr, nullptr, nullptr);
  return stream;
}

void endConnection(SoupServerMessage* message, std::string_view lastWords) {
  GIOStream* stream = takeConnection(message, lastWords);
  g_io_stream_close(stream, nullptr, nullptr);
  g_object_unref(stream);
}

void makeTunnel(SoupServer* server, SoupServerMessage* message, GTlsCertificate* certificate) {
  GSocketAddress* local = soup_server_message_get_local_address(message);
  GSocketAddress* remote = soup_server_message_get_remote_address(message);
  GIOStream* inside =
      g_tls_server_connection_new(takeConnection(message, tunnelMade), certificate, nullptr);
  soup_server_accept_iostream(server, inside, local, remote, nullptr);
}

void appendContent(SoupServerMessage* message, gpointer) {
  static const char content[16384] = {};
  soup_message_body_append(soup_server_message_get_response_body(message), SOUP_MEMORY_STATIC,
                           content, sizeof content);
}

void answer(SoupServer* server, SoupServerMessage* message, const char*, GHashTable*,
            gpointer script) {
  const std::string& behaviour = static_cast<Script*>(script)->advance();
  GBytes* body = soup_message_body_flatten(soup_server_message_get_request_body(message));
  gsize size = 0;
  const auto* bytes = static_cast<const char*>(g_bytes_get_data(body, &size));
  std::printf("%zu %s\n", static_cast<std::size_t>(size), behaviour.c_str());
  std::fwrite(bytes, 1, size, stdout);
  std::fflush(stdout);
  g_bytes_unref(body);

  if (behaviour == "hang") {
    soup_server_message_pause(message);
  } else if (behaviour == "cut") {
    endConnection(message, "");
  } else if (behaviour == "endless") {
    soup_server_message_set_status(message, SOUP_STATUS_OK, nullptr);
    soup_message_headers_set_encoding(soup_server_message_get_response_headers(message),
                                      SOUP_ENCODING_CHUNKED);
    appendContent(message, nullptr);
    g_signal_connect(message, "wrote-chunk", G_CALLBACK(appendContent), nullptr);
  } else if (behaviour == "short") {
    endConnection(message, begunAnswer);
  } else if (behaviour == "stuck") {
    takeConnection(message, begunAnswer);
  } else if (behaviour == "tunnel") {
    makeTunnel(server, message, static_cast<Script*>(script)->certificate);
  } else if (behaviour == "blind tunnel") {
    endConnection(message, tunnelMade);
  } else if (behaviour == "garbage") {
    endConnection(message, "\x01\xFF 200 nothing like HTTP\r\n\r\n\r\n");
  } else {
    const std::size_t mark = behaviour.find_first_of("/>");
    soup_server_message_set_status(message, static_cast<guint>(std::atoi(behaviour.c_str())),
                                   nullptr);
    if (mark != std::string::npos)
      soup_message_headers_append(soup_server_message_get_response_headers(message),
                                  behaviour[mark] == '/' ? "Retry-After" : "Location",
                                  behaviour.c_str() + mark + 1);
  }
}

}  // namespace

int main(int count, char** arguments) {
  if (count < 3) return EXIT_FAILURE;
  const bool isSecure = std::string_view(arguments[2]) == "secure";
  Script script{.certificate = g_tls_certificate_new_from_file(arguments[1], nullptr),
                .behaviours = {arguments + (isSecure ? 3 : 2), arguments + count}};
  if (!script.certificate || script.behaviours.empty()) return EXIT_FAILURE;
  SoupServer* server = soup_server_new("server-header", "test", nullptr);
  soup_server_add_handler(server, nullptr, answer, &script, nullptr);
  int options = SOUP_SERVER_LISTEN_IPV4_ONLY;
  if (isSecure) {
    soup_server_set_tls_certificate(server, script.certificate);
    options |= SOUP_SERVER_LISTEN_HTTPS;
  }
  if (!soup_server_listen_local(server, 0, static_cast<SoupServerListenOptions>(options), nullptr))
    return EXIT_FAILURE;
  GSList* uris = soup_server_get_uris(server);
  std::printf("%d\n", g_uri_get_port(static_cast<GUri*>(uris->data)));
  std::fflush(stdout);
  g_main_loop_run(g_main_loop_new(nullptr, FALSE));
}
