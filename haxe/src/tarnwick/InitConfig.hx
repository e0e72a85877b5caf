package tarnwick;

/**
	The configuration object handed to `Natives.init`, exactly as the native
	library reads it: ten UTF-8 strings, two integers and a flag, in this order.

	The library reads fields by position, so the order and the types of the
	variables below are part of the binary interface (the object's signature is
	`OBBBBBBBBBBiib_`). Do not reorder, add or remove fields, and do not give the
	class a super class. `@:keep` stops dead-code elimination from dropping
	fields that Haxe code never reads.

	Game code normally fills a `tarnwick.Config` instead and lets `Eos.init`
	build this object.
**/
@:keep
class InitConfig {
	/** Product name, as registered with Epic. **/
	public var productName:hl.Bytes;
	/** Product version string. **/
	public var productVersion:hl.Bytes;
	/** EOS product id; the friend list compares friends' presence against it. **/
	public var eosProductId:hl.Bytes;
	/** Not read by the library. **/
	public var spare:hl.Bytes;
	/** Sandbox id. **/
	public var sandboxId:hl.Bytes;
	/** Deployment id. **/
	public var deploymentId:hl.Bytes;
	/** Client id of the game's client credentials. **/
	public var clientId:hl.Bytes;
	/** Client secret of the game's client credentials. **/
	public var clientSecret:hl.Bytes;
	/** Auth login id (its meaning depends on `loginType`; null when unused). **/
	public var loginId:hl.Bytes;
	/** Auth login token (its meaning depends on `loginType`; null when unused). **/
	public var loginToken:hl.Bytes;
	/** Auth credential type (`EOS_ELoginCredentialType`). **/
	public var loginType:Int;
	/** External credential type (`EOS_EExternalCredentialType`), read with `loginType` 7. **/
	public var externalType:Int;
	/** True: the overlay is enabled; false: the platform is created with the overlay disabled. **/
	public var enableOverlay:Bool;

	public function new() {}
}
