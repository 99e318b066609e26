// The channel types the host knows without loading a library.
#include "host/device_channel.h"
#include "host/link_channels.h"
#include "host/plugin_loader.h"

namespace {

template <typename Channel>
Qen_Channel* CreateBuiltIn() {
  return new Channel();
}

template <typename Channel>
BuiltInChannelType BuiltIn() {
  return {Channel::TypeRecord(), &CreateBuiltIn<Channel>};
}

}  // namespace

const std::vector<BuiltInChannelType>& BuiltInChannelTypes() {
  static const std::vector<BuiltInChannelType> types = {
      BuiltIn<Qen_ValueChannel>(),      BuiltIn<Qen_ValueVectorChannel>(),
      BuiltIn<Qen_MatrixChannel>(),     BuiltIn<Qen_TextureChannel>(),
      BuiltIn<Tev_DX8_DeviceChannel>(),
  };
  return types;
}
