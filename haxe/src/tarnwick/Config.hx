package tarnwick;

/**
	What `Eos.init` needs to start the platform and sign the player in.
	Write it as a structure literal:

	```haxe
	var config:tarnwick.Config = {
		productName: "My Game", productVersion: "1.0",
		productId: "...", sandboxId: "...", deploymentId: "...",
		clientId: "...", clientSecret: "...",
		loginType: AccountPortal,
	};
	```
**/
@:structInit
class Config {
	public var productName:String;
	public var productVersion:String;
	/** EOS product id; a friend counts as online when playing this product. **/
	public var productId:String;
	public var sandboxId:String;
	public var deploymentId:String;
	public var clientId:String;
	public var clientSecret:String;
	/** Auth login id; its meaning depends on `loginType`. **/
	public var loginId:Null<String> = null;
	/** Auth login token; its meaning depends on `loginType`. **/
	public var loginToken:Null<String> = null;
	public var loginType:LoginType = AccountPortal;
	/** Read only with `loginType` = `ExternalAuth`. **/
	public var externalType:ExternalType = Epic;
	/** Whether the EOS overlay is enabled. **/
	public var enableOverlay:Bool = true;
}
