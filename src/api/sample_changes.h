// The reply that test_get_device_changes() reads: a feed of one updated and 16 deleted entries.
#pragma once

namespace quillmere {

// One entry to a line, whatever its length.
// clang-format off
inline constexpr char sample_changes[] =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<response><action>device/get_changes</action><updated><files>"
    "<file><quickkey>fk6a6h3kv3s46yb</quickkey><revision>2</revision><parent_folderkey>y3dyu25r85iji</parent_folderkey></file>"
    "</files></updated><deleted><files>"
    "<file><quickkey>mxg9edn581u33xt</quickkey><revision>3</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>plpft75v2seh60k</quickkey><revision>1</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>vj50ce9uvw53efr</quickkey><revision>4</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>4edt2sywb3wkh5d</quickkey><revision>1</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>nsipzz5fk2z9ri1</quickkey><revision>5</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>9r0wyojfljooa5l</quickkey><revision>9</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>qsaj08xui6d39zz</quickkey><revision>2</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>zzg4zdmen2khvdg</quickkey><revision>6</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>aj8gxbenyjqwx4h</quickkey><revision>5</revision><parent_folderkey>ujzde8gxd6ncf</parent_folderkey></file>"
    "<file><quickkey>h5344tfjgvq4k7b</quickkey><revision>3</revision><parent_folderkey>10epf91dhodzd</parent_folderkey></file>"
    "<file><quickkey>n7xj8b7tfq7xkwo</quickkey><revision>5</revision><parent_folderkey>10epf91dhodzd</parent_folderkey></file>"
    "<file><quickkey>886vompzom75wbb</quickkey><revision>8</revision><parent_folderkey>10epf91dhodzd</parent_folderkey></file>"
    "<file><quickkey>r4qmw2wxfogo4mv</quickkey><revision>9</revision><parent_folderkey>10epf91dhodzd</parent_folderkey></file>"
    "<file><quickkey>n4a4wfhym4l1vfz</quickkey><revision>7</revision><parent_folderkey>10epf91dhodzd</parent_folderkey></file>"
    "</files><folders>"
    "<folder><folderkey>oc9is0j8ht9lg</folderkey><revision>6</revision><parent_folderkey>oc9is0j8ht9lg</parent_folderkey></folder>"
    "<folder><folderkey>oc9is0j8ht9lg</folderkey><revision>8</revision><parent_folderkey>oc9is0j8ht9lg</parent_folderkey></folder>"
    "</folders></deleted><device_revision>59</device_revision>"
    "<changes_list_block>500</changes_list_block><result>Success</result>"
    "<current_api_version>2.13</current_api_version></response>";
// clang-format on

} // namespace quillmere
